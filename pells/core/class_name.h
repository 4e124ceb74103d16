#pragma once

#include <string>
#include <typeinfo>

#include "pells/core/export.h"

namespace pells {

/// The name of a class as diagnostics print it: demangled, without the library's own "pells::".
///
/// className(typeid(*this)) names the object's run-time class. A name that cannot be demangled is
/// returned as the compiler spells it. Names in registries are the raw typeid(T).name() instead.
PELLS_API std::string className(const std::type_info& type);

}  // namespace pells
