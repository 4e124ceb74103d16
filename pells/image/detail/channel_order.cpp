#include "pells/image/detail/channel_order.h"

#include <cstring>

#if defined(__GNUC__) && (defined(__x86_64__) || defined(__i386__))
#include <tmmintrin.h>
#define PELLS_HAS_BYTE_SHUFFLE 1
#endif

namespace pells::detail {

namespace {

/// Swaps pixel by pixel.
void swapPixels(const unsigned char* from, unsigned char* to, std::size_t bytes,
                std::size_t components) {
    for (std::size_t at = 0; at < bytes; at += components) {
        to[at] = from[at + 2];
        to[at + 1] = from[at + 1];
        to[at + 2] = from[at];
        if (components == 4)
            to[at + 3] = from[at + 3];
    }
}

#ifdef PELLS_HAS_BYTE_SHUFFLE

/// Swaps as many pixels as whole blocks of 16 bytes hold.
///
/// A block has five pixels of three bytes and one byte that the next block overwrites, or four
/// pixels of four bytes.
/// \return the bytes that are done, a multiple of components.
__attribute__((target("ssse3"))) std::size_t swapBlocks(const unsigned char* from,
                                                        unsigned char* to, std::size_t bytes,
                                                        std::size_t components) {
    const __m128i threes = _mm_setr_epi8(2, 1, 0, 5, 4, 3, 8, 7, 6, 11, 10, 9, 14, 13, 12, 15);
    const __m128i fours = _mm_setr_epi8(2, 1, 0, 3, 6, 5, 4, 7, 10, 9, 8, 11, 14, 13, 12, 15);
    const __m128i order = components == 3 ? threes : fours;
    const std::size_t blockBytes = 16;
    const std::size_t step = blockBytes / components * components;
    std::size_t done = 0;
    for (; bytes - done >= blockBytes; done += step) {
        const __m128i block = _mm_loadu_si128(reinterpret_cast<const __m128i*>(from + done));
        _mm_storeu_si128(reinterpret_cast<__m128i*>(to + done), _mm_shuffle_epi8(block, order));
    }
    return done;
}

/// Widens as many pixels as it can read in blocks of 16 bytes, of which it uses 12.
///
/// \return the pixels that are done.
__attribute__((target("ssse3"))) std::size_t widenBlocks(const unsigned char* from,
                                                         unsigned char* to, std::size_t pixels) {
    const __m128i order = _mm_setr_epi8(0, 1, 2, -1, 3, 4, 5, -1, 6, 7, 8, -1, 9, 10, 11, -1);
    const __m128i opaque = _mm_set1_epi32(static_cast<int>(0xFF000000));
    std::size_t done = 0;
    for (; 3 * (pixels - done) >= 16; done += 4) {
        const __m128i block = _mm_loadu_si128(reinterpret_cast<const __m128i*>(from + 3 * done));
        _mm_storeu_si128(reinterpret_cast<__m128i*>(to + 4 * done),
                         _mm_or_si128(_mm_shuffle_epi8(block, order), opaque));
    }
    return done;
}

bool canShuffle() {
    static const bool can = __builtin_cpu_supports("ssse3") != 0;
    return can;
}

std::size_t swapFast(const unsigned char* from, unsigned char* to, std::size_t bytes,
                     std::size_t components) {
    return canShuffle() ? swapBlocks(from, to, bytes, components) : 0;
}

std::size_t widenFast(const unsigned char* from, unsigned char* to, std::size_t pixels) {
    return canShuffle() ? widenBlocks(from, to, pixels) : 0;
}

#else

std::size_t swapFast(const unsigned char* /*from*/, unsigned char* /*to*/, std::size_t /*bytes*/,
                     std::size_t /*components*/) {
    return 0;
}

std::size_t widenFast(const unsigned char* /*from*/, unsigned char* /*to*/,
                      std::size_t /*pixels*/) {
    return 0;
}

#endif

}  // namespace

void bgrToRgb(const unsigned char* from, unsigned char* to, std::size_t bytes, int components) {
    if (components < 3) {
        std::memcpy(to, from, bytes);
        return;
    }
    const std::size_t pixelBytes = static_cast<std::size_t>(components);
    const std::size_t done = swapFast(from, to, bytes, pixelBytes);
    swapPixels(from + done, to + done, bytes - done, pixelBytes);
}

void rgbToRgba(const unsigned char* from, unsigned char* to, std::size_t pixels) {
    for (std::size_t i = widenFast(from, to, pixels); i < pixels; ++i) {
        std::memcpy(to + 4 * i, from + 3 * i, 3);
        to[4 * i + 3] = 255;
    }
}

}  // namespace pells::detail
