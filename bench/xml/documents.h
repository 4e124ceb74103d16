#pragma once

#include <cstdint>
#include <string>

namespace bench {

/// A document of at least that many bytes in the style of an image table: indented elements with
/// short texts, some of which hold references.
std::string imageTable(std::int64_t bytes);

/// The same of colours: mostly empty elements with four numbers as attributes.
std::string colourTable(std::int64_t bytes);

}  // namespace bench
