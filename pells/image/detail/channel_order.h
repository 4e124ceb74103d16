#pragma once

#include <cstddef>

namespace pells::detail {

/// Copies pixels from blue-green-red order to red-green-blue; a fourth byte keeps its place.
///
/// \param components bytes per pixel: 1, 3 or 4. Single bytes are copied as they are.
/// \param bytes      a multiple of components. The ranges must not overlap.
void bgrToRgb(const unsigned char* from, unsigned char* to, std::size_t bytes, int components);

/// Copies opaque pixels of three bytes to four bytes each, the fourth 255. The ranges must not
/// overlap.
void rgbToRgba(const unsigned char* from, unsigned char* to, std::size_t pixels);

}  // namespace pells::detail
