#pragma once

#include "pells/core/export.h"
#include "pells/core/smart_base.h"

namespace pells {

class InTag;
class OutTag;

/// Writes values of one type as elements and reads them back. Handlers have no state of a run and
/// may be shared.
template <class T>
class PELLS_TEMPLATE_API TypeHandler : public smart_base {
public:
    /// Writes the whole element, whose name the caller has chosen, or nothing.
    virtual void save(const T& value, OutTag& tag) = 0;

    /// Reads the whole element through its end tag.
    ///
    /// \throws Serializable::LoadFail
    virtual void load(T& value, InTag& tag) = 0;
};

}  // namespace pells
