#pragma once

#include <list>

#include "pells/core/export.h"

namespace pells {

/// What the singleton list knows of a singleton: how to destroy it.
class PELLS_API SingletonBase {
public:
    SingletonBase(const SingletonBase&) = delete;
    SingletonBase& operator=(const SingletonBase&) = delete;
    virtual ~SingletonBase();

    /// Deletes the whole object.
    virtual void deleteSelf() = 0;

protected:
    SingletonBase() = default;
};

/// Creation policy that constructs a T; T declares it a friend when its constructor is private.
template <class T>
class SingletonFactory {
public:
    /// A new T, which belongs to the caller.
    static T* create() { return new T; }
};

/// An object that exists once in the process: made by the first instance(), gone when deleted by
/// whatever means, made anew by the next instance(). It is not tracked by the SingletonList.
///
/// \tparam T the singleton's class, derived from this one.
/// \tparam F the creation policy; F::create() returns a new T.
///
/// One thread only. What F::create() throws leaves instance(), and the next call tries again.
///
/// When several shared objects use one singleton class, its instance must be exported from one of
/// them: `extern template class RogueSingleton<T, F>` in the header before the class, and
/// `template class RogueSingleton<T, F>` in one source file.
template <class T, class F = SingletonFactory<T>>
class PELLS_TEMPLATE_API RogueSingleton : public SingletonBase {
public:
    /// The one object, created if there is none.
    static T& instance();

    /// Deletes the object, whatever it is derived from beside this class.
    void deleteSelf() override;

    /// The one object, or null.
    static T* singleton;

protected:
    RogueSingleton();
    ~RogueSingleton() override;
};

class SingletonList;
extern template class PELLS_API RogueSingleton<SingletonList, SingletonFactory<SingletonList>>;

/// The tracked singletons that are alive, oldest first.
///
/// Each static operation creates the list when there is none.
class PELLS_API SingletonList
    : public RogueSingleton<SingletonList, SingletonFactory<SingletonList>> {
public:
    ~SingletonList() override;

    /// Appends a singleton; the list does not own it.
    static void addSingleton(SingletonBase* singletonObject);

    /// Removes every entry of a singleton; one that is not listed is no error.
    static void delSingleton(SingletonBase* singletonObject);

    /// Destroys every tracked singleton, newest first, those that are created on the way included,
    /// and then the list itself.
    static void freeSingletons();

private:
    friend class SingletonFactory<SingletonList>;
    SingletonList();

    void _addSingleton(SingletonBase* singletonObject);
    void _delSingleton(SingletonBase* singletonObject);
    void _freeSingletons();

    std::list<SingletonBase*> singletons;
};

/// A RogueSingleton that the SingletonList tracks from its construction to its destruction.
template <class T, class F = SingletonFactory<T>>
class PELLS_TEMPLATE_API Singleton : public RogueSingleton<T, F> {
protected:
    Singleton();
    ~Singleton() override;
};

template <class T, class F>
T* RogueSingleton<T, F>::singleton = nullptr;

template <class T, class F>
RogueSingleton<T, F>::RogueSingleton() = default;

template <class T, class F>
RogueSingleton<T, F>::~RogueSingleton() {
    singleton = nullptr;
}

template <class T, class F>
T& RogueSingleton<T, F>::instance() {
    if (!singleton)
        singleton = F::create();
    return *singleton;
}

template <class T, class F>
void RogueSingleton<T, F>::deleteSelf() {
    // The most derived object is deleted, so that a singleton with several bases is freed safely.
    delete dynamic_cast<T*>(this);
}

template <class T, class F>
Singleton<T, F>::Singleton() {
    SingletonList::addSingleton(this);
}

template <class T, class F>
Singleton<T, F>::~Singleton() {
    try {
        SingletonList::delSingleton(this);
    } catch (...) {
        // There was no list, and no memory for one: nothing to be removed from.
    }
}

}  // namespace pells
