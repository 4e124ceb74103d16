// Rows of pixels in packed form. All the forms are made of 32-bit words in the order A8B8G8R8, by
// shifts and masks alone, so that the compiler can do several pixels at once.

#include <algorithm>
#include <cstddef>
#include <cstdint>

#include "pells/image/detail/channel_order.h"
#include "pells/image/image_base.h"

namespace pells {

namespace {

std::uint32_t wordOf(const unsigned char* pixel) {
    return pixel[0] | std::uint32_t{pixel[1]} << 8 | std::uint32_t{pixel[2]} << 16 |
           std::uint32_t{pixel[3]} << 24;
}

template <class Packed, class Pack>
void packAll(const unsigned char* pixels, std::size_t count, Packed* row, Pack pack) {
    for (std::size_t i = 0; i < count; ++i)
        row[i] = static_cast<Packed>(pack(wordOf(pixels + 4 * i)));
}

/// Packs pixels without alpha, a block that stays in the cache at a time.
template <class Packed, class Pack>
void packOpaque(const unsigned char* pixels, std::size_t count, Packed* row, Pack pack) {
    const std::size_t blockPixels = 256;
    unsigned char block[4 * blockPixels];
    for (std::size_t done = 0; done < count; done += blockPixels) {
        const std::size_t now = std::min(blockPixels, count - done);
        detail::copyOpaque(pixels + 3 * done, block, now);
        packAll(block, now, row + done, pack);
    }
}

}  // namespace

/// \param getter gives the pixels of layouts that only a derived class has.
template <class Packed, class Pack>
void Image_base::packRow(int y, Packed* row, Packed (Image_base::*getter)(int, int) const,
                         Pack pack) const {
    const std::size_t pixels = static_cast<std::size_t>(width);
    if (format == FMT_RGB && numComponents == 3) {
        packOpaque(&data[offsetOf(0, y)], pixels, row, pack);
    } else if (format == FMT_RGBA && numComponents == 4) {
        packAll(&data[offsetOf(0, y)], pixels, row, pack);
    } else {
        for (int x = 0; x < width; ++x)
            row[x] = (this->*getter)(x, y);
    }
}

void Image_base::getRowAsABGR(int y, std::uint32_t* row) const {
    packRow(y, row, &Image_base::getColorAsABGR, [](std::uint32_t word) { return word; });
}

void Image_base::getRowAsARGB(int y, std::uint32_t* row) const {
    packRow(y, row, &Image_base::getColorAsARGB, [](std::uint32_t word) {
        return (word & 0xFF00FF00) | (word >> 16 & 0xFF) | (word & 0xFF) << 16;
    });
}

void Image_base::getRowAsA1R5G5B5(int y, std::uint16_t* row) const {
    packRow(y, row, &Image_base::getColorAsA1R5G5B5, [](std::uint32_t word) {
        return (word >> 16 & 0x8000) | (word & 0xF8) << 7 | (word >> 6 & 0x3E0) |
               (word >> 19 & 0x1F);
    });
}

void Image_base::getRowAsA4R4G4B4(int y, std::uint16_t* row) const {
    packRow(y, row, &Image_base::getColorAsA4R4G4B4, [](std::uint32_t word) {
        return (word >> 16 & 0xF000) | (word & 0xF0) << 4 | (word >> 8 & 0xF0) | (word >> 20 & 0xF);
    });
}

void Image_base::getRowAsA8R3G3B2(int y, std::uint16_t* row) const {
    packRow(y, row, &Image_base::getColorAsA8R3G3B2, [](std::uint32_t word) {
        return (word >> 16 & 0xFF00) | (word & 0xE0) | (word >> 11 & 0x1C) | (word >> 22 & 3);
    });
}

void Image_base::getRowAsA2B10G10R10(int y, std::uint32_t* row) const {
    packRow(y, row, &Image_base::getColorAsA2B10G10R10, [](std::uint32_t word) {
        return (word & 0xC0000000) | (word << 6 & 0x3FC00000) | (word << 4 & 0xFF000) |
               (word << 2 & 0x3FC);
    });
}

}  // namespace pells
