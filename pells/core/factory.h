#pragma once

#include <boost/function.hpp>
#include <string>
#include <typeinfo>

#include "pells/core/named_object.h"

namespace pells {

class FactoryByName;
class FactoryByTypeID;
template <class T>
class AbstractFactory;
extern template class PELLS_API NamedObject<FactoryByName, FactoryByName*>;
extern template class PELLS_API NamedObject<FactoryByTypeID, FactoryByTypeID*>;

/// The side of a factory that is found by the name of the class it makes.
class PELLS_API FactoryByName : public NamedObject<FactoryByName, FactoryByName*> {
public:
    /// \param className under which the class that is made is looked up.
    explicit FactoryByName(const std::string& className);
    ~FactoryByName() override;

private:
    template <class T>
    friend class AbstractFactory;

    /// The T of the AbstractFactory that this is the side of, while that lives.
    const std::type_info* productBase = nullptr;
};

/// The side of a factory that is found by typeid(T).name() of the class it makes.
class PELLS_API FactoryByTypeID : public NamedObject<FactoryByTypeID, FactoryByTypeID*> {
public:
    /// \param typeName typeid(T).name() of the class that is made.
    explicit FactoryByTypeID(const std::string& typeName);
    ~FactoryByTypeID() override;

private:
    template <class T>
    friend class AbstractFactory;

    const std::type_info* productBase = nullptr;  // as in FactoryByName
};

/// Makes objects of some class derived from T.
///
/// Where two factories claim one class name, the first one registered answers, and destroying
/// either one removes the entry.
template <class T>
class PELLS_TEMPLATE_API AbstractFactory : public FactoryByName, public FactoryByTypeID {
public:
    /// Makes one new object, which the caller owns; may be empty.
    typedef boost::function<T*()> Creator;

    /// \param className the name that look-ups, and the "class" attribute of saved objects, use.
    /// \param typeName  typeid(...).name() of the class that is made.
    AbstractFactory(const std::string& className, const std::string& typeName)
        : FactoryByName(className), FactoryByTypeID(typeName) {
        FactoryByName::productBase = FactoryByTypeID::productBase = &typeid(T);
    }
    ~AbstractFactory() override {
        FactoryByName::productBase = FactoryByTypeID::productBase = nullptr;
    }

    /// What makes the objects of this factory.
    virtual Creator getCreator() const = 0;

    /// The creator registered under a class name; empty when there is none, or when that factory
    /// makes objects of another base.
    static Creator findCreator(const std::string& className) {
        const AbstractFactory* const factory = _factoryOf(FactoryByName::findp(className));
        return factory ? factory->getCreator() : Creator();
    }

    /// A new object of the named class, owned by the caller; null where findCreator() is empty.
    static T* createByName(const std::string& className) {
        const Creator creator = findCreator(className);
        return creator ? creator() : nullptr;
    }

    /// The class name registered for a type.
    ///
    /// \param typeName typeid(object).name() of the object's dynamic type.
    /// \return for a type without a factory of T, a text that says so: saving an undeclared class
    ///         writes that text, and loading it fails.
    static std::string classNameOf(const std::string& typeName) {
        const AbstractFactory* const factory = _factoryOf(FactoryByTypeID::findp(typeName));
        if (factory)
            return factory->FactoryByName::getName();
        return std::string("** No declared Factory<") + typeid(T).name() + ", " + typeName +
               ">! **";
    }

private:
    /// The factory that something registered is a side of; null when it makes other objects.
    template <class Side>
    static const AbstractFactory* _factoryOf(const Side* side) {
        // A dynamic cast gives the same, and takes as long as reading a short element.
        if (side && side->productBase && *side->productBase == typeid(T))
            return static_cast<const AbstractFactory*>(side);
        return dynamic_cast<const AbstractFactory*>(side);
    }
};

/// Makes default-constructed objects of one class; define one static object for the class.
///
///     const pells::Factory<pells::Prefs, MyPrefs> prefsFactory("Prefs");
///
/// \tparam Base     the base as which the objects are handed out.
/// \tparam Concrete the class that is made.
template <class Base, class Concrete>
class PELLS_TEMPLATE_API Factory : public AbstractFactory<Base> {
public:
    /// \param className under which createByName() makes a Concrete.
    explicit Factory(const std::string& className)
        : AbstractFactory<Base>(className, typeid(Concrete).name()),
          creator([]() -> Base* { return new Concrete; }) {}

    typename AbstractFactory<Base>::Creator getCreator() const override { return creator; }

private:
    typename AbstractFactory<Base>::Creator creator;
};

class Serializable;

/// Makes a persistent class known to loading and saving under a class name.
template <class T>
class PELLS_TEMPLATE_API SerializableFactory : public Factory<Serializable, T> {
public:
    /// \param className what documents call the class in attributes "class".
    explicit SerializableFactory(const std::string& className)
        : Factory<Serializable, T>(className) {}
};

extern template class PELLS_API AbstractFactory<Serializable>;

}  // namespace pells
