#pragma once

#include <boost/smart_ptr/intrusive_ptr.hpp>
#include <memory>
#include <string>
#include <type_traits>
#include <typeinfo>

#include "pells/core/export.h"
#include "pells/serial/detail/object_factories.h"
#include "pells/serial/serializable.h"
#include "pells/serial/type_handler.h"
#include "pells/xml/tag.h"

namespace pells {

/// Handles persistent objects that are held by value: the object itself saves and loads.
template <class T>
class PELLS_TEMPLATE_API ObjectTypeHandler : public TypeHandler<T> {
public:
    void save(const T& value, OutTag& tag) override {
        // Saving does not change an object; Serializable::save() only does not say so.
        const_cast<T&>(value).save(tag);
    }
    void load(T& value, InTag& tag) override { value.load(tag, nullptr); }
};

/// Handles pointers to persistent objects of any class derived from B.
///
/// The element's attribute "class" is the name under which the object's class is registered with a
/// SerializableFactory. A null pointer writes nothing. Loading always makes a new object; a raw
/// pointer's previous object is not deleted.
///
/// \tparam P the pointer type: B* or boost::intrusive_ptr<B>.
template <class P, class B>
class PELLS_TEMPLATE_API PolymorphicTypeHandler : public TypeHandler<P> {
    static_assert(std::is_base_of_v<Serializable, B>,
                  "only pointers to classes derived from pells::Serializable are persistent");

public:
    /// An object without a factory is written, too, but cannot be loaded.
    void save(const P& value, OutTag& tag) override;

    /// \throws Serializable::LoadFail "Bad class='" ... when no factory makes a B of that name; the
    ///         pointer is null then.
    void load(P& value, InTag& tag) override;
};

template <class P, class B>
void PolymorphicTypeHandler<P, B>::save(const P& value, OutTag& tag) {
    if (!value)
        return;
    tag.setAttr("class", detail::registeredName(typeid(*value)));
    value->save(tag);
}

template <class P, class B>
void PolymorphicTypeHandler<P, B>::load(P& value, InTag& tag) {
    const std::string& className = tag.getAttr("class");
    std::unique_ptr<Serializable> made = detail::makeObject(className);
    value = P(dynamic_cast<B*>(made.get()));
    if (!value) {
        throw Serializable::LoadFail("Bad class='" + className + "' in element <" + tag.getName() +
                                     ">");
    }
    made.release();  // NOLINT(bugprone-unused-return-value): the pointer has it
    value->load(tag, nullptr);
}

}  // namespace pells
