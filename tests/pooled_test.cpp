#include "pells/serial/pooled.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <random>
#include <utility>
#include <vector>

namespace {

using pells::detail::allocatePooled;
using pells::detail::freePooled;

/// Blocks of all sizes come and go, more of them than are kept, and none overlaps another.
TEST(PooledMemory, IsNeverGivenTwice) {
    struct Block {
        unsigned char* bytes;
        std::size_t size;
        unsigned char filling;
    };
    std::mt19937 random(7);
    std::vector<Block> blocks;
    for (unsigned round = 0; round < 200000 || !blocks.empty(); ++round) {
        const unsigned chance = round >= 200000 ? 0 : round % 20000 < 10000 ? 7 : 1;
        if (random() % 8 < chance) {
            const std::size_t size = 1 + random() % 300;
            blocks.push_back({static_cast<unsigned char*>(allocatePooled(size)), size,
                              static_cast<unsigned char>(round)});
            std::memset(blocks.back().bytes, blocks.back().filling, size);
        } else if (!blocks.empty()) {
            std::swap(blocks[random() % blocks.size()], blocks.back());
            const Block gone = blocks.back();
            blocks.pop_back();
            EXPECT_EQ(std::count(gone.bytes, gone.bytes + gone.size, gone.filling),
                      static_cast<std::ptrdiff_t>(gone.size));
            freePooled(gone.bytes, gone.size);
        }
    }
}

struct alignas(64) Wide : pells::detail::Pooled {
    virtual ~Wide() = default;
    char bytes[64] = {};
};

TEST(PooledObjects, KeepTheirAlignment) {
    const Wide* const wide = new Wide;
    EXPECT_EQ(reinterpret_cast<std::uintptr_t>(wide) % 64, 0u);
    delete wide;
}

}  // namespace
