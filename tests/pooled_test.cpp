#include "pells/serial/pooled.h"

#include <gtest/gtest.h>

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
    for (unsigned round = 0; round < 200000; ++round) {
        const bool grow = round % 20000 < 10000;
        if (blocks.empty() || random() % 8 < (grow ? 7u : 1u)) {
            const std::size_t size = 1 + random() % 300;
            const Block made = {static_cast<unsigned char*>(allocatePooled(size)), size,
                                static_cast<unsigned char>(round)};
            std::memset(made.bytes, made.filling, size);
            blocks.push_back(made);
            continue;
        }
        std::swap(blocks[random() % blocks.size()], blocks.back());
        const Block gone = blocks.back();
        blocks.pop_back();
        for (std::size_t at = 0; at < gone.size; ++at)
            ASSERT_EQ(gone.bytes[at], gone.filling) << gone.size << " bytes, at " << at;
        freePooled(gone.bytes, gone.size);
    }
    for (const Block& block : blocks)
        freePooled(block.bytes, block.size);
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
