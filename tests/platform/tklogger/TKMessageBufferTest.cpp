#include "tklogger/TKMessageBuffer.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <limits>
#include <sstream>
#include <string>
#include <string_view>

#include "AllocationCount.h"

namespace TKLog {

namespace {

template <typename... Pieces>
std::string text(const Pieces&... pieces) {
    TKMessageBuffer buffer;
    (buffer << ... << pieces);
    return std::string(buffer.str());
}

TEST(TKMessageBuffer, IsEmptyAtFirst) {
    const TKMessageBuffer buffer;
    EXPECT_EQ(buffer.str(), "");
}

TEST(TKMessageBuffer, JoinsTextsOfEveryKind) {
    EXPECT_EQ(text("a", std::string("b"), std::string_view("c"), ""), "abc");
}

TEST(TKMessageBuffer, NullTextIsWrittenAsNothing) {
    const char* const null = nullptr;
    EXPECT_EQ(text("a", null, "b"), "ab");
    EXPECT_EQ(text(std::string_view()), "");
}

TEST(TKMessageBuffer, ZeroBytesBelongToTheText) {
    EXPECT_EQ(text(std::string_view("a\0b", 3)), std::string("a\0b", 3));
}

TEST(TKMessageBuffer, WritesNumbersOfEveryWidth) {
    EXPECT_EQ(text(0, " ", -1, " ", 4294967295U), "0 -1 4294967295");
    EXPECT_EQ(text(std::numeric_limits<std::int64_t>::min()), "-9223372036854775808");
    EXPECT_EQ(text(std::numeric_limits<std::uint64_t>::max()), "18446744073709551615");
    EXPECT_EQ(text(std::numeric_limits<short>::min()), "-32768");
    EXPECT_EQ(text(static_cast<unsigned short>(65535)), "65535");
}

TEST(TKMessageBuffer, WritesAddressesAsStreamsDo) {
    const int value = 0;
    const auto streamed = [](const void* pointer) {
        std::ostringstream stream;
        stream << pointer;
        return stream.str();
    };
    EXPECT_EQ(text(&value), streamed(&value));
    EXPECT_EQ(text(static_cast<const void*>(&value)), streamed(&value));
    // Of a text, too, when it is a pointer to it that is handed over.
    const std::string name = "eth0";
    EXPECT_EQ(text(" value=", &name), " value=" + streamed(&name));
    const char* list[] = {"Name", nullptr};
    EXPECT_EQ(text(&list[0]), streamed(&list[0]));
    // NOLINTNEXTLINE(performance-no-int-to-ptr): an address with all digits
    EXPECT_EQ(text(reinterpret_cast<int*>(std::numeric_limits<std::uintptr_t>::max())),
              "0xffffffffffffffff");
}

TEST(TKMessageBuffer, NullAddressIsZero) {
    const int* const null = nullptr;
    EXPECT_EQ(text("a=", null), "a=0");
}

TEST(TKMessageBuffer, HoldsAnyLength) {
    for (const std::size_t length : {511U, 512U, 513U, 1024U, 100000U}) {
        const std::string whole(length, 'x');
        EXPECT_EQ(text(whole), whole) << length;
        EXPECT_EQ(text(whole, "y"), whole + "y") << length;
    }
}

TEST(TKMessageBuffer, PiecesGoOnWhereTheInnerBufferEnds) {
    TKMessageBuffer buffer;
    std::string expected;
    for (int i = 0; i < 300; ++i) {
        buffer << "piece " << i << ' ' + std::string(1, 'x');
        expected += "piece " + std::to_string(i) + " x";
        ASSERT_EQ(buffer.str(), expected);
    }
}

TEST(TKMessageBuffer, CanBeWrittenIntoItself) {
    TKMessageBuffer buffer;
    buffer << "ab";
    std::string expected = "ab";
    for (int i = 0; i < 10; ++i) {
        buffer << buffer.str();
        expected += expected;
        ASSERT_EQ(buffer.str(), expected);
    }
}

class TKMessageBufferHeap : public testing::Test {
  protected:
    void SetUp() override {
        if (!Testing::countsAllocations) {
            GTEST_SKIP() << "this build does not count allocations";
        }
    }
};

TEST_F(TKMessageBufferHeap, UsesNoHeapUpTo512Bytes) {
    for (const std::size_t length : {0U, 511U, 512U}) {
        const std::string whole(length, 'x');
        const std::size_t before = Testing::allocationsOfThisThread();
        {
            TKMessageBuffer buffer;
            buffer << std::string_view(whole).substr(0, length / 2)
                   << std::string_view(whole).substr(length / 2) << "";
        }
        EXPECT_EQ(Testing::allocationsOfThisThread() - before, 0U) << length;
    }
}

TEST_F(TKMessageBufferHeap, UsesTheHeapBeyond512Bytes) {
    const std::string whole(513, 'x');
    const std::size_t before = Testing::allocationsOfThisThread();
    {
        TKMessageBuffer buffer;
        buffer << whole;
    }
    EXPECT_GT(Testing::allocationsOfThisThread() - before, 0U);
}

TEST_F(TKMessageBufferHeap, NumbersAndAddressesUseNoHeap) {
    const int value = 0;
    const std::size_t before = Testing::allocationsOfThisThread();
    {
        TKMessageBuffer buffer;
        buffer << " line=" << 17U << " value=" << &value;
    }
    EXPECT_EQ(Testing::allocationsOfThisThread() - before, 0U);
}

}  // namespace

}  // namespace TKLog
