#pragma once

#include <memory>
#include <string>
#include <typeinfo>

#include "pells/core/export.h"

namespace pells {

class Serializable;

namespace detail {

/// The class name that a SerializableFactory has registered for a type, or a text that there is
/// none, see AbstractFactory::classNameOf().
PELLS_API std::string registeredName(const std::type_info& type);

/// A new object of the class of that name; null when no SerializableFactory makes one.
PELLS_API std::unique_ptr<Serializable> makeObject(const std::string& className);

/// Does nothing. What makes objects by class name calls it, so that a static link keeps the
/// factories of the library's own classes, which nothing else refers to. Defined where all of those
/// classes are known, above their subsystems.
void keepLibraryClasses();

}  // namespace detail
}  // namespace pells
