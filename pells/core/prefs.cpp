#include "pells/core/prefs.h"

#include "pells/core/factory.h"

namespace pells {

template class RogueSingleton<Prefs, PrefsFactory>;
template class Singleton<Prefs, PrefsFactory>;

Prefs* PrefsFactory::create() {
    Prefs* const prefs = AbstractFactory<Prefs>::createByName("Prefs");
    if (!prefs)
        throw Prefs::NoImplementation();
    return prefs;
}

Prefs::Prefs() = default;
Prefs::~Prefs() = default;

}  // namespace pells
