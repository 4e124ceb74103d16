#include "pells/serial/detail/object_factories.h"

#include "pells/core/factory.h"
#include "pells/serial/serializable.h"

namespace pells {

template class AbstractFactory<Serializable>;

namespace detail {

// Whoever instantiates the template elsewhere reaches this object file, too.
[[maybe_unused]] static const bool libraryClassesAreKept = (keepLibraryClasses(), true);

std::string registeredName(const std::type_info& type) {
    return AbstractFactory<Serializable>::classNameOf(type.name());
}

std::unique_ptr<Serializable> makeObject(const std::string& className) {
    return std::unique_ptr<Serializable>(AbstractFactory<Serializable>::createByName(className));
}

}  // namespace detail
}  // namespace pells
