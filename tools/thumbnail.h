#pragma once

#include <cstdint>
#include <vector>

namespace pells {
class Image_base;
}

namespace pells_tool {

/// A picture made to fit a box, as cairo wants it.
struct Thumbnail {
    int width = 0;
    int height = 0;
    std::vector<std::uint32_t> pixels;  ///< ARGB, colours multiplied by alpha, top row first
};

/// Fits a picture into a box: smaller by averaging, larger only by whole factors, so that the
/// pixels of a small picture stay squares. Without pixels for a picture that has none.
Thumbnail makeThumbnail(const pells::Image_base& image, int boxWidth, int boxHeight);

}  // namespace pells_tool
