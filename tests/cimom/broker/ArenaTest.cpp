// Where the objects of a request are, and until when.
#include <gtest/gtest.h>
#include <malloc.h>
#include <sys/resource.h>
#include <unistd.h>

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <fstream>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include "broker/Arena.h"
#include "broker/RequestScope.h"
#include "broker/objects/BrokerString.h"
#include "kit/Sanitizers.h"

using cimom::broker::Arena;
using cimom::broker::RequestScope;

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

namespace {

/// Bytes of this process that are in memory.
std::size_t resident() {
    std::size_t pages = 0;
    std::ifstream statistics("/proc/self/statm");
    statistics >> pages >> pages;
    return pages * static_cast<std::size_t>(::sysconf(_SC_PAGESIZE));
}

}  // namespace

TEST(Arena, KeepsAllAndLittleOfItInMemory) {
    constexpr std::size_t blocks = 100'000;
    constexpr std::size_t size = 1000;
    std::vector<unsigned char*> all;
    all.reserve(blocks);
    const std::size_t before = resident();
    Arena arena;
    for (std::size_t index = 0; index < blocks; ++index) {
        all.push_back(static_cast<unsigned char*>(arena.allocate(size)));
        std::memset(all.back(), static_cast<int>(index % 251), size);
    }
    EXPECT_GT(arena.reserved(), blocks * size);
    // A sanitizer's shadow of the memory is resident, too.
    if (!ZR::Testing::sanitized) {
        EXPECT_LT(resident() - std::min(before, resident()), blocks * size / 5);
    }
    for (std::size_t index = 0; index < blocks; index += 99) {
        ASSERT_EQ(all[index][0], index % 251);
        ASSERT_EQ(all[index][size - 1], index % 251);
    }
}

namespace {

/// As the server sets it: blocks of this size or more go back to the system at once.
constexpr int longBlock = 131072;
constexpr std::size_t mebibyte = std::size_t{1024} * 1024;

void fill(Arena& arena, std::size_t size) {
    constexpr std::size_t block = 1024;
    for (std::size_t done = 0; done < size; done += block) {
        std::memset(arena.allocate(block), 1, block);
    }
}

/// How often this thread has met a page that it did not have.
long pageFaults() {
    rusage usage{};
    ::getrusage(RUSAGE_THREAD, &usage);
    return usage.ru_minflt;
}

/// Bytes in blocks that the allocator would give back at once.
std::size_t inLongBlocks() {
    return ::mallinfo2().hblkhd;
}

}  // namespace

TEST(Arena, MemoryOfAnEndedOneIsUsedAgain) {
    if (ZR::Testing::sanitized) {
        GTEST_SKIP() << "they are to see what is used after its request";
    }
    ASSERT_EQ(::mallopt(M_MMAP_THRESHOLD, longBlock), 1);
    const auto request = [] {
        Arena arena;
        fill(arena, 3 * mebibyte);
    };
    request();
    const long before = pageFaults();
    request();
    const auto page = static_cast<std::size_t>(::sysconf(_SC_PAGESIZE));
    EXPECT_LT(static_cast<std::size_t>(pageFaults() - before), 3 * mebibyte / page / 10);
}

TEST(Arena, LittleOfTheMemoryOfEndedOnesIsKept) {
    if (ZR::Testing::sanitized) {
        GTEST_SKIP() << "their allocators do not tell";
    }
    ASSERT_EQ(::mallopt(M_MMAP_THRESHOLD, longBlock), 1);
    const std::size_t before = inLongBlocks();
    {
        std::vector<Arena> arenas(5);
        for (Arena& arena : arenas) {
            fill(arena, 3 * mebibyte);
        }
        EXPECT_GT(inLongBlocks() + 6 * mebibyte, before + 15 * mebibyte);
    }
    EXPECT_LT(inLongBlocks(), before + 6 * mebibyte + mebibyte / 2);
}

TEST(Arena, ObjectsShareTheNamesThatTheyHaveInCommon) {
    Arena arena;
    const auto nameIn = [&arena](std::string_view text) {
        return cimom::broker::nameIn(arena, cimom::NameKey(text));
    };
    const auto* const name = nameIn("ElementName");
    EXPECT_EQ(nameIn("ElementName"), name);
    // A client sees a name as it was written.
    EXPECT_EQ(nameIn("elementname")->view(), "elementname");
    EXPECT_EQ(name->view(), "ElementName");
    // More than there is room for.
    for (int count = 0; count < 1000; ++count) {
        const std::string text = "Name" + std::to_string(count);
        ASSERT_EQ(nameIn(text)->view(), text);
    }
    EXPECT_EQ(nameIn("ElementName")->view(), "ElementName");
}

TEST(Arena, HasAnEnd) {
    Arena arena;
    EXPECT_THROW(arena.allocate(Arena::largest + 1), std::bad_alloc);
    arena.allocate(100);
    EXPECT_THROW(arena.allocate(Arena::largest - 50), std::bad_alloc);
}

TEST(RequestScope, InnermostScopeIsTheCurrentOne) {
    const RequestScope outer;
    EXPECT_EQ(&RequestScope::current(), &outer);
    EXPECT_EQ(RequestScope::depthOfThread(), 1U);
    {
        const RequestScope inner;
        EXPECT_EQ(&RequestScope::current(), &inner);
        EXPECT_EQ(RequestScope::depthOfThread(), 2U);
    }
    EXPECT_EQ(&RequestScope::current(), &outer);
}

TEST(RequestScope, LevelsNestAndEndTogether) {
    RequestScope scope;
    Arena* const base = &scope.arena();
    const void* const first = scope.mark();
    EXPECT_NE(&scope.arena(), base);
    const void* const second = scope.mark();
    EXPECT_TRUE(scope.release(first));
    EXPECT_EQ(&scope.arena(), base);
    EXPECT_FALSE(scope.release(second));
    EXPECT_FALSE(scope.release(nullptr));
}

TEST(RequestScope, ThreadWithoutRequestHasOneThatEndsWithTheThread) {
    std::thread([] {
        EXPECT_EQ(RequestScope::depthOfThread(), 0U);
        RequestScope& own = RequestScope::current();
        own.arena().allocate(100);
        EXPECT_EQ(&RequestScope::current(), &own);
    }).join();
}

TEST(RequestScope, AttachedThreadHasTheDepthOfItsRequest) {
    std::thread([] {
        EXPECT_FALSE(RequestScope::detachThread());
        EXPECT_TRUE(RequestScope::attachThread(5));
        EXPECT_FALSE(RequestScope::attachThread(5));
        EXPECT_EQ(RequestScope::depthOfThread(), 5U);
        {
            const RequestScope request;
            EXPECT_EQ(RequestScope::depthOfThread(), 6U);
            EXPECT_FALSE(RequestScope::attachThread(1));
            EXPECT_FALSE(RequestScope::detachThread());
        }
        EXPECT_TRUE(RequestScope::detachThread());
        EXPECT_EQ(RequestScope::depthOfThread(), 0U);
    }).join();
}
