#pragma once

namespace pells::detail {

/// Does nothing. A call makes a static link keep the object file with the factories of the
/// library's image loaders, which nothing else refers to.
void keepLoaderFactories();

}  // namespace pells::detail
