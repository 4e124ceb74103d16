#include "tools/thumbnail.h"

#include <algorithm>
#include <cstddef>

#include "pells/image/image_base.h"

namespace pells_tool {

namespace {

/// The mean of some pixels, each weighted by its alpha.
class Mean {
public:
    void add(const unsigned char* pixel, int components) {
        const std::uint64_t alpha = components == 4 ? pixel[3] : 255;
        red += pixel[0] * alpha;
        green += pixel[1] * alpha;
        blue += pixel[2] * alpha;
        opacity += alpha;
        ++count;
    }
    std::uint32_t premultiplied() const {
        const auto share = [this](std::uint64_t sum, std::uint64_t scale) {
            const std::uint64_t divisor = std::max<std::uint64_t>(1, count) * scale;
            return static_cast<std::uint32_t>((sum + divisor / 2) / divisor);
        };
        return share(opacity, 1) << 24 | share(red, 255) << 16 | share(green, 255) << 8 |
               share(blue, 255);
    }

private:
    std::uint64_t red = 0;
    std::uint64_t green = 0;
    std::uint64_t blue = 0;
    std::uint64_t opacity = 0;
    std::uint64_t count = 0;
};

/// The source pixels that one pixel of the thumbnail stands for: at least one.
struct Span {
    Span(int at, int target, int source)
        : begin(static_cast<int>(std::int64_t{at} * source / target)),
          end(std::max(begin + 1, static_cast<int>((std::int64_t{at} + 1) * source / target))) {}
    int begin;
    int end;
};

std::uint32_t average(const pells::Image_base& image, const Span& columns, const Span& rows) {
    const int components = image.getNumComponents();
    Mean mean;
    for (int y = rows.begin; y < rows.end; ++y) {
        const std::size_t first =
            static_cast<std::size_t>(y) * static_cast<std::size_t>(image.getWidth()) +
            static_cast<std::size_t>(columns.begin);
        const unsigned char* pixel = image.getData() + first * static_cast<std::size_t>(components);
        for (int x = columns.begin; x < columns.end; ++x, pixel += components)
            mean.add(pixel, components);
    }
    return mean.premultiplied();
}

void fitInto(Thumbnail& thumbnail, const pells::Image_base& image, int boxWidth, int boxHeight) {
    const std::int64_t width = image.getWidth();
    const std::int64_t height = image.getHeight();
    if (width <= boxWidth && height <= boxHeight) {
        const std::int64_t factor = std::min(boxWidth / width, boxHeight / height);
        thumbnail.width = static_cast<int>(width * factor);
        thumbnail.height = static_cast<int>(height * factor);
        return;
    }
    const bool wide = width * boxHeight >= height * boxWidth;
    const std::int64_t fitWidth = wide ? boxWidth : width * boxHeight / height;
    const std::int64_t fitHeight = wide ? height * boxWidth / width : boxHeight;
    thumbnail.width = static_cast<int>(std::max<std::int64_t>(1, fitWidth));
    thumbnail.height = static_cast<int>(std::max<std::int64_t>(1, fitHeight));
}

}  // namespace

Thumbnail makeThumbnail(const pells::Image_base& image, int boxWidth, int boxHeight) {
    Thumbnail thumbnail;
    if (!image.isValid() || image.getWidth() == 0 || image.getHeight() == 0)
        return thumbnail;
    fitInto(thumbnail, image, boxWidth, boxHeight);
    thumbnail.pixels.reserve(static_cast<std::size_t>(thumbnail.width) *
                             static_cast<std::size_t>(thumbnail.height));
    for (int y = 0; y < thumbnail.height; ++y) {
        const Span rows(y, thumbnail.height, image.getHeight());
        for (int x = 0; x < thumbnail.width; ++x)
            thumbnail.pixels.push_back(
                average(image, Span(x, thumbnail.width, image.getWidth()), rows));
    }
    return thumbnail;
}

}  // namespace pells_tool
