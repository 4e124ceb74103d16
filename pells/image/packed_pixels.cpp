// Pixels in packed form. All the forms are made of 32-bit words in the order A8B8G8R8, by shifts
// and masks alone, so that the compiler can do several pixels at once.

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <type_traits>

#include "pells/image/detail/channel_order.h"
#include "pells/image/image_base.h"

namespace pells {

namespace {

constexpr auto toABGR = [](std::uint32_t word) { return word; };

constexpr auto toARGB = [](std::uint32_t word) {
    return (word & 0xFF00FF00) | (word >> 16 & 0xFF) | (word & 0xFF) << 16;
};

constexpr auto toA1R5G5B5 = [](std::uint32_t word) {
    return (word >> 16 & 0x8000) | (word & 0xF8) << 7 | (word >> 6 & 0x3E0) | (word >> 19 & 0x1F);
};

constexpr auto toA4R4G4B4 = [](std::uint32_t word) {
    return (word >> 16 & 0xF000) | (word & 0xF0) << 4 | (word >> 8 & 0xF0) | (word >> 20 & 0xF);
};

constexpr auto toA8R3G3B2 = [](std::uint32_t word) {
    return (word >> 16 & 0xFF00) | (word & 0xE0) | (word >> 11 & 0x1C) | (word >> 22 & 3);
};

constexpr auto toA2B10G10R10 = [](std::uint32_t word) {
    return (word & 0xC0000000) | (word << 6 & 0x3FC00000) | (word << 4 & 0xFF000) |
           (word << 2 & 0x3FC);
};

std::uint32_t wordOf(const unsigned char* pixel, unsigned alpha) {
    return pixel[0] | std::uint32_t{pixel[1]} << 8 | std::uint32_t{pixel[2]} << 16 |
           std::uint32_t{alpha} << 24;
}

template <class Packed, class Pack>
void packAll(const unsigned char* pixels, std::size_t count, Packed* row, Pack pack) {
    for (std::size_t i = 0; i < count; ++i) {
        const unsigned char* const pixel = pixels + 4 * i;
        row[i] = static_cast<Packed>(pack(wordOf(pixel, pixel[3])));
    }
}

/// Packs pixels without alpha, a block that stays in the cache at a time.
template <class Packed, class Pack>
void packOpaque(const unsigned char* pixels, std::size_t count, Packed* row, Pack pack) {
    const std::size_t blockPixels = 256;
    unsigned char block[4 * blockPixels];
    for (std::size_t done = 0; done < count; done += blockPixels) {
        const std::size_t now = std::min(blockPixels, count - done);
        detail::rgbToRgba(pixels + 3 * done, block, now);
        packAll(block, now, row + done, pack);
    }
}

}  // namespace

template <class Packed, class Pack>
inline Packed Image_base::packPixel(int x, int y, Pack pack) const {
    const unsigned char* const pixel = &data[offsetOf(x, y)];
    if (format == FMT_RGB)
        return static_cast<Packed>(pack(wordOf(pixel, 0xFF)));
    // Layouts that only a derived class knows have no 32-bit forms.
    if (format != FMT_RGBA && std::is_same_v<Packed, std::uint32_t>)
        return 0;
    return static_cast<Packed>(pack(wordOf(pixel, pixel[3])));
}

template <class Packed, class Pack>
inline void Image_base::packRow(int y, Packed* row, Pack pack) const {
    const std::size_t pixels = static_cast<std::size_t>(width);
    if (format == FMT_RGB && numComponents == 3) {
        packOpaque(&data[offsetOf(0, y)], pixels, row, pack);
    } else if (format == FMT_RGBA && numComponents == 4) {
        packAll(&data[offsetOf(0, y)], pixels, row, pack);
    } else {
        for (int x = 0; x < width; ++x)
            row[x] = packPixel<Packed>(x, y, pack);
    }
}

std::uint32_t Image_base::getColorAsABGR(int x, int y) const {
    return packPixel<std::uint32_t>(x, y, toABGR);
}

std::uint32_t Image_base::getColorAsARGB(int x, int y) const {
    return packPixel<std::uint32_t>(x, y, toARGB);
}

std::uint16_t Image_base::getColorAsA1R5G5B5(int x, int y) const {
    return packPixel<std::uint16_t>(x, y, toA1R5G5B5);
}

std::uint16_t Image_base::getColorAsA4R4G4B4(int x, int y) const {
    return packPixel<std::uint16_t>(x, y, toA4R4G4B4);
}

std::uint16_t Image_base::getColorAsA8R3G3B2(int x, int y) const {
    return packPixel<std::uint16_t>(x, y, toA8R3G3B2);
}

std::uint32_t Image_base::getColorAsA2B10G10R10(int x, int y) const {
    return packPixel<std::uint32_t>(x, y, toA2B10G10R10);
}

std::uint32_t Image_base::getColorAsABGR(double u, double v) const {
    return getColorAsABGR(static_cast<int>(width * u), static_cast<int>(height * v));
}

std::uint32_t Image_base::getColorAsARGB(double u, double v) const {
    return getColorAsARGB(static_cast<int>(width * u), static_cast<int>(height * v));
}

void Image_base::getRowAsABGR(int y, std::uint32_t* row) const {
    packRow(y, row, toABGR);
}

void Image_base::getRowAsARGB(int y, std::uint32_t* row) const {
    packRow(y, row, toARGB);
}

void Image_base::getRowAsA1R5G5B5(int y, std::uint16_t* row) const {
    packRow(y, row, toA1R5G5B5);
}

void Image_base::getRowAsA4R4G4B4(int y, std::uint16_t* row) const {
    packRow(y, row, toA4R4G4B4);
}

void Image_base::getRowAsA8R3G3B2(int y, std::uint16_t* row) const {
    packRow(y, row, toA8R3G3B2);
}

void Image_base::getRowAsA2B10G10R10(int y, std::uint32_t* row) const {
    packRow(y, row, toA2B10G10R10);
}

}  // namespace pells
