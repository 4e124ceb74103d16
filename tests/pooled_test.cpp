#include "pells/serial/detail/pooled.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <cstring>
#include <random>
#include <string>
#include <utility>
#include <vector>

namespace {

using pells::detail::allocatePooled;
using pells::detail::freePooled;

/// Blocks of all sizes come and go, more of them than are kept, and none overlaps another.
TEST(PooledMemory, IsNeverGivenTwice) {
    std::mt19937 random(7);
    std::vector<std::pair<void*, std::string>> blocks;
    for (unsigned round = 0; round < 200000 || !blocks.empty(); ++round) {
        const unsigned chance = round >= 200000 ? 0 : round % 20000 < 10000 ? 7 : 1;
        if (random() % 8 < chance) {
            const std::string filling(1 + random() % 300, static_cast<char>(round));
            blocks.emplace_back(allocatePooled(filling.size()), filling);
            std::memcpy(blocks.back().first, filling.data(), filling.size());
        } else if (!blocks.empty()) {
            std::swap(blocks[random() % blocks.size()], blocks.back());
            const std::string& filling = blocks.back().second;
            EXPECT_EQ(std::memcmp(blocks.back().first, filling.data(), filling.size()), 0);
            freePooled(blocks.back().first, filling.size());
            blocks.pop_back();
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
