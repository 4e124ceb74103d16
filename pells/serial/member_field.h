#pragma once

/// \file
/// What a class needs to describe its persistent members.

#include <boost/smart_ptr/intrusive_ptr.hpp>
#include <string_view>

#include "pells/core/export.h"
#include "pells/serial/accessor.h"
#include "pells/serial/class_desc.h"
#include "pells/serial/composite_field.h"
#include "pells/serial/sequence_handler.h"
#include "pells/serial/serializable.h"
#include "pells/serial/simple_field.h"
#include "pells/serial/simple_type_handler.h"

namespace pells {

/// The field of a data member: a vector is handled by SequenceTypeHandler, every other type by
/// SimpleTypeHandler.
///
/// \tparam Owner the class that declares the member.
template <class Owner, class T>
class PELLS_TEMPLATE_API MemberField : public SimpleField<T> {
public:
    /// \param fieldName of the member's element.
    /// \param member    pointer to the data member.
    MemberField(std::string_view fieldName, T Owner::*member)
        : SimpleField<T>(fieldName, new MemberAccessor<Owner, T>(member),
                         detail::handlerFor<T>(fieldName)) {}
};

/// A new MemberField of a member, as in makeField("weight", &Part::weight).
template <class Owner, class T>
boost::intrusive_ptr<Field> makeField(std::string_view name, T Owner::*member) {
    return new MemberField<Owner, T>(name, member);
}

}  // namespace pells
