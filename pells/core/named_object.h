#pragma once

#include <boost/iterator/transform_iterator.hpp>
#include <exception>
#include <map>
#include <new>
#include <string>
#include <vector>

#include "pells/core/export.h"

namespace pells {

/// Gives every object of a class family a name and enters it in the family's registry.
///
/// There is one registry an instantiation. It is made on first use and lives until the process
/// ends, so objects may register from static constructors in any order. Names are compared byte
/// for byte. One thread only.
///
/// \tparam T the family's class, derived from this one.
/// \tparam P the pointer to T that look-ups give; it is made from a T*. The registry itself holds
///           no reference, so a counted pointer only fits objects that somebody else keeps.
///
/// When several shared objects use one family, its instance must be exported from one of them, as
/// for RogueSingleton.
template <class T, class P = T*>
class PELLS_TEMPLATE_API NamedObject {
public:
    /// Thrown by find() for a name that has no object.
    class NotFound : public std::exception {
    public:
        const char* what() const noexcept override {
            return "no object is registered under the name";
        }
    };

    NamedObject(const NamedObject&) = delete;
    NamedObject& operator=(const NamedObject&) = delete;

    /// Removes the entry under the object's name, whatever object it holds, unless the object was
    /// forgotten.
    virtual ~NamedObject();

    /// The name that the object was made with, whether or not it is the registered one.
    const std::string& getName() const;

    /// The object of a name. \throws NotFound when there is none.
    static T& find(const std::string& name);

    /// The object of a name, or null.
    static P findp(const std::string& name);

    /// Removes the entry of a name, and keeps its object from removing anything when it dies.
    static void forget(const std::string& name);

    /// Every registered object, in name order.
    static std::vector<P> getAll();

private:
    // The registry holds bases and casts on look-up: while the naming constructor runs, the derived
    // object does not live yet, and a pointer to it may not be formed.
    typedef std::map<std::string, NamedObject*> Registry;

    static P _toPointer(NamedObject* object);

    struct ToPointer {
        P operator()(const typename Registry::value_type& entry) const {
            return _toPointer(entry.second);
        }
    };

public:
    /// Yields pointers, of type P.
    typedef boost::transform_iterator<ToPointer, typename Registry::const_iterator> const_iterator;

    /// Iterates over the registered objects in name order; yields P.
    static const_iterator begin();
    static const_iterator end();

protected:
    /// Registers the object, unless the name is taken: then the earlier object stays in the
    /// registry. Either way the destructor will remove the entry under this name.
    explicit NamedObject(const std::string& objectName);

private:
    static Registry& _registry();
    static void _register(const std::string& name, NamedObject* object);
    static P _unregister(const std::string& name);

    static Registry* _reg;
    // Here rather than on the heap, where it would stay behind when the library is unloaded.
    alignas(Registry) static unsigned char _storage[sizeof(Registry)];

    bool registered = false;
    std::string name;
};

/// A named object whose look-up creates the missing object, with `new T(name)`. The library never
/// deletes objects made this way.
template <class T, class P = T*>
class PELLS_TEMPLATE_API DemandNamedObject : public NamedObject<T, P> {
public:
    /// The object of a name, created if there is none; never null.
    static P findp(const std::string& name);

    /// The same as a reference; never throws NotFound.
    static T& find(const std::string& name);

protected:
    /// Registers the object, as NamedObject's constructor does.
    explicit DemandNamedObject(const std::string& objectName);
};

template <class T, class P>
typename NamedObject<T, P>::Registry* NamedObject<T, P>::_reg = nullptr;

template <class T, class P>
alignas(typename NamedObject<T, P>::Registry) unsigned char NamedObject<T, P>::_storage[sizeof(
    typename NamedObject<T, P>::Registry)];

template <class T, class P>
NamedObject<T, P>::NamedObject(const std::string& objectName) : name(objectName) {
    _register(name, this);
    registered = true;
}

template <class T, class P>
NamedObject<T, P>::~NamedObject() {
    if (registered)
        _registry().erase(name);
}

template <class T, class P>
const std::string& NamedObject<T, P>::getName() const {
    return name;
}

template <class T, class P>
T& NamedObject<T, P>::find(const std::string& name) {
    const P object = findp(name);
    if (!object)
        throw NotFound();
    return *object;
}

template <class T, class P>
P NamedObject<T, P>::findp(const std::string& name) {
    const Registry& registry = _registry();
    const typename Registry::const_iterator entry = registry.find(name);
    return entry == registry.end() ? P() : _toPointer(entry->second);
}

template <class T, class P>
void NamedObject<T, P>::forget(const std::string& name) {
    const P object = _unregister(name);
    if (object) {
        NamedObject& forgotten = *object;
        forgotten.registered = false;
    }
}

template <class T, class P>
std::vector<P> NamedObject<T, P>::getAll() {
    return std::vector<P>(begin(), end());
}

template <class T, class P>
P NamedObject<T, P>::_toPointer(NamedObject* object) {
    return object ? P(static_cast<T*>(object)) : P();
}

template <class T, class P>
typename NamedObject<T, P>::const_iterator NamedObject<T, P>::begin() {
    return const_iterator(_registry().begin());
}

template <class T, class P>
typename NamedObject<T, P>::const_iterator NamedObject<T, P>::end() {
    return const_iterator(_registry().end());
}

template <class T, class P>
typename NamedObject<T, P>::Registry& NamedObject<T, P>::_registry() {
    if (!_reg)
        _reg = ::new (static_cast<void*>(_storage)) Registry;
    return *_reg;
}

template <class T, class P>
void NamedObject<T, P>::_register(const std::string& name, NamedObject* object) {
    _registry().insert(typename Registry::value_type(name, object));
}

template <class T, class P>
P NamedObject<T, P>::_unregister(const std::string& name) {
    Registry& registry = _registry();
    const typename Registry::iterator entry = registry.find(name);
    if (entry == registry.end())
        return P();
    const P object = _toPointer(entry->second);
    registry.erase(entry);
    return object;
}

template <class T, class P>
DemandNamedObject<T, P>::DemandNamedObject(const std::string& objectName)
    : NamedObject<T, P>(objectName) {}

template <class T, class P>
P DemandNamedObject<T, P>::findp(const std::string& name) {
    const P object = NamedObject<T, P>::findp(name);
    return object ? object : P(new T(name));
}

template <class T, class P>
T& DemandNamedObject<T, P>::find(const std::string& name) {
    return *findp(name);
}

}  // namespace pells
