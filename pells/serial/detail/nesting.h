#pragma once

#include "pells/core/export.h"

namespace pells {

class OutTag;

namespace detail {

/// To be called before an element with content is written: checks that it could be read again. It
/// also ends the saving of an object that holds itself, before the stack does.
///
/// \throws Serializable::SaveFail with the path of the element, when it is nested deeper than
///         InTag::maximumDepth().
PELLS_API void checkNesting(const OutTag& tag);

}  // namespace detail
}  // namespace pells
