#include "pells/core/singleton.h"

namespace pells {

template class RogueSingleton<SingletonList, SingletonFactory<SingletonList>>;

SingletonBase::~SingletonBase() = default;

SingletonList::SingletonList() = default;
SingletonList::~SingletonList() = default;

void SingletonList::addSingleton(SingletonBase* singletonObject) {
    instance()._addSingleton(singletonObject);
}

void SingletonList::delSingleton(SingletonBase* singletonObject) {
    instance()._delSingleton(singletonObject);
}

void SingletonList::freeSingletons() {
    instance()._freeSingletons();
}

void SingletonList::_addSingleton(SingletonBase* singletonObject) {
    singletons.push_back(singletonObject);
}

void SingletonList::_delSingleton(SingletonBase* singletonObject) {
    singletons.remove(singletonObject);
}

void SingletonList::_freeSingletons() {
    while (!singletons.empty()) {
        SingletonBase* const newest = singletons.back();
        // Taken out first: what its destructor does not remove, or was added twice, must not be met
        // again.
        _delSingleton(newest);
        newest->deleteSelf();
    }
    deleteSelf();
}

}  // namespace pells
