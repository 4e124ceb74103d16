#pragma once

#include <boost/smart_ptr/intrusive_ptr.hpp>
#include <cstdint>
#include <string>
#include <string_view>

#include "pells/core/export.h"
#include "pells/core/smart_base.h"
#include "pells/serial/detail/pooled.h"

namespace pells {

class InTag;
class OutTag;
class Serializable;

/// One named persistent member of a class.
///
/// Fields are made anew for each time an object is saved or loaded, and may keep state of that one
/// run.
class PELLS_API Field : public smart_base, public detail::Pooled {
public:
    /// \param fieldName the element name; "" stands for the text content of the object's element.
    explicit Field(std::string_view fieldName);
    ~Field() override;

    /// The name of the field's element.
    const std::string& getName() const { return name; }

    /// The index of declaration in the description that the field was last added to; 0 before.
    std::int32_t getOrder() const { return order; }

    /// Writes this field of an object as an element, whose name the caller has chosen. This version
    /// writes nothing.
    virtual void save(const Serializable* obj, OutTag& tag);

    /// Reads an element into this field of an object.
    ///
    /// \throws Serializable::LoadFail
    virtual void load(Serializable* obj, InTag& tag) = 0;

private:
    friend class ClassDescBase;

    const std::string name;
    std::int32_t order = 0;
};

}  // namespace pells
