#include "kernel/Attributes.h"

#include <gtest/gtest.h>

#include <array>
#include <vector>

namespace ZR::Live {
namespace {

std::vector<std::byte> bytesOf(std::initializer_list<unsigned> values) {
    std::vector<std::byte> bytes;
    for (const unsigned value : values) {
        bytes.push_back(static_cast<std::byte>(value));
    }
    return bytes;
}

std::vector<std::uint16_t> typesIn(const std::vector<std::byte>& bytes, bool& malformed) {
    std::vector<std::uint16_t> types;
    AttributeWalk walk{bytes};
    for (Attribute attribute; walk.next(attribute);) {
        types.push_back(attribute.type);
    }
    malformed = walk.malformed();
    return types;
}

TEST(Attributes, WalksOverPaddingAndEmptyPayloads) {
    bool malformed = true;
    const auto types =
        typesIn(bytesOf({5, 0, 1, 0, 0xff, 0, 0, 0, 4, 0, 2, 0, 5, 0, 3, 0, 0xff}), malformed);
    EXPECT_EQ(types, (std::vector<std::uint16_t>{1, 2, 3}));
    EXPECT_FALSE(malformed);
}

TEST(Attributes, FlagBitsAreNotPartOfTheType) {
    bool malformed = true;
    EXPECT_EQ(typesIn(bytesOf({4, 0, 18, 0x80}), malformed), (std::vector<std::uint16_t>{18}));
}

TEST(Attributes, LengthZeroEndsTheWalk) {
    bool malformed = false;
    EXPECT_TRUE(typesIn(bytesOf({0, 0, 1, 0, 4, 0, 2, 0}), malformed).empty());
    EXPECT_TRUE(malformed);
}

TEST(Attributes, LengthBeyondTheEndEndsTheWalk) {
    bool malformed = false;
    EXPECT_EQ(typesIn(bytesOf({4, 0, 1, 0, 9, 0, 2, 0, 1, 1, 1, 1}), malformed),
              (std::vector<std::uint16_t>{1}));
    EXPECT_TRUE(malformed);
}

TEST(Attributes, AnyLengthAtAnyAlignmentIsWalked) {
    // Each cut of a valid row of attributes, at each alignment: nothing is read
    // outside the bytes (the sanitizers watch), and the walk ends.
    const auto whole = bytesOf({5, 0, 1, 0, 7, 0, 0, 0, 8, 0, 2, 0, 1, 2, 3, 4, 4, 0, 3, 0});
    for (std::size_t shift = 0; shift < 4; ++shift) {
        for (std::size_t length = 0; length <= whole.size(); ++length) {
            std::vector<std::byte> shifted(shift);
            shifted.insert(shifted.end(), whole.begin(),
                           whole.begin() + static_cast<std::ptrdiff_t>(length));
            shifted.shrink_to_fit();
            AttributeWalk walk{std::span{shifted}.subspan(shift)};
            int count = 0;
            for (Attribute attribute; walk.next(attribute);) {
                ++count;
            }
            EXPECT_LE(count, 3);
        }
    }
}

TEST(Attributes, NumbersOfTooFewBytesAreNone) {
    EXPECT_EQ(valueAt<std::uint32_t>(bytesOf({1, 0, 0})), std::nullopt);
    EXPECT_EQ(valueAt<std::uint32_t>(bytesOf({1, 1, 0, 0})), 257U);
}

TEST(Attributes, TextEndsAtItsNulOrAtTheEnd) {
    EXPECT_EQ(textOf(bytesOf({'l', 'o', 0, 'x'})), "lo");
    EXPECT_EQ(textOf(bytesOf({'l', 'o'})), "lo");
    EXPECT_EQ(textOf({}), "");
}

}  // namespace
}  // namespace ZR::Live
