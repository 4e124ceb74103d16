// The library's own classes that documents name.

#include "pells/image/detail/loader_factories.h"
#include "pells/serial/detail/object_factories.h"

void pells::detail::keepLibraryClasses() {
    keepLoaderFactories();
}
