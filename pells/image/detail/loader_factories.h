#pragma once

namespace pells::detail {

/// Does nothing. Whoever calls it makes a static link keep the object file with the factories of
/// the library's image loaders, which nobody else names.
void keepLoaderFactories();

}  // namespace pells::detail
