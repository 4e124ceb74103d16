#pragma once

#include <boost/smart_ptr/intrusive_ptr.hpp>
#include <string_view>

#include "pells/core/export.h"
#include "pells/serial/class_desc.h"
#include "pells/serial/field.h"

namespace pells {

/// A field whose value is an object: an element with one child element a field.
class PELLS_API CompositeField : public Field {
public:
    /// \param fieldName of the object's element.
    /// \param classDesc the fields of its class.
    CompositeField(std::string_view fieldName, ClassDesc&& classDesc);
    CompositeField(std::string_view fieldName, const ClassDesc& classDesc);
    ~CompositeField() override;

    /// Writes the fields in the order of their declaration; an empty element when there is none.
    void save(const Serializable* obj, OutTag& tag) override;

    /// Reads the element's children, in any order, into the fields of their names.
    void load(Serializable* obj, InTag& tag) override;

private:
    ClassDesc desc;
};

/// A field that writes nothing and reads an element only to throw it away.
class PELLS_API IgnoreField : public Field {
public:
    IgnoreField();
    ~IgnoreField() override;

    void save(const Serializable* obj, OutTag& tag) override;

    /// Reads the element's whole content; what it holds is reported as unrecognised.
    void load(Serializable* obj, InTag& tag) override;

    /// The description without fields that all of them read with. Lives as long as the process.
    static const ClassDesc& emptyDesc();
};

/// What Serializable::getField() returns for a class: a field over the description, or null when
/// that is empty.
PELLS_API boost::intrusive_ptr<Field> makeComposite(std::string_view fieldName, ClassDesc desc);

}  // namespace pells
