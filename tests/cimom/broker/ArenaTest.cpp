#include "Arena.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <cstring>

using cimom::broker::Arena;

TEST(Arena, BlocksAreAlignedAndDistinct) {
    Arena arena;
    char* last = nullptr;
    for (std::size_t size = 1; size < 300; ++size) {
        char* const block = static_cast<char*>(arena.allocate(size));
        EXPECT_EQ(reinterpret_cast<std::uintptr_t>(block) % alignof(std::max_align_t), 0U);
        EXPECT_NE(block, last);
        std::memset(block, 1, size);
        last = block;
    }
}

TEST(Arena, TakesNoMemoryBeforeTheFirstBlock) {
    EXPECT_EQ(Arena().reserved(), 0U);
}

TEST(Arena, GrowsGeometrically) {
    Arena arena;
    std::size_t changes = 0;
    std::size_t reserved = 0;
    for (int count = 0; count < 100'000; ++count) {
        arena.allocate(16);
        changes += reserved != arena.reserved() ? 1U : 0U;
        reserved = arena.reserved();
    }
    EXPECT_LT(changes, 10U);
}

TEST(Arena, HoldsABlockLargerThanAnyChunk) {
    Arena arena;
    constexpr std::size_t size = 10 * 1024 * 1024;
    std::memset(arena.allocate(size), 7, size);
    EXPECT_GE(arena.reserved(), size);
}

TEST(Arena, ThrowsForWhatNoMachineHas) {
    Arena arena;
    EXPECT_THROW(arena.allocate(static_cast<std::size_t>(-1) / 2), std::bad_alloc);
    EXPECT_THROW(arena.makeMany<std::uint64_t>(static_cast<std::size_t>(-1) / 2), std::bad_alloc);
}

TEST(Arena, CopiesTextWithItsEnd) {
    Arena arena;
    EXPECT_STREQ(arena.copyText("text"), "text");
    EXPECT_STREQ(arena.copyText({}), "");
}
