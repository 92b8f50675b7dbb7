#include "Growth.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <fcntl.h>

#include "zrcommon/UniqueFd.h"

namespace test {
namespace {

using ::testing::HasSubstr;

std::vector<Sample> samples(std::uint64_t (*resident)(std::uint64_t),
                            std::uint64_t (*descriptors)(std::uint64_t)) {
    std::vector<Sample> all;
    for (std::uint64_t i = 0; i < 200; ++i) {
        all.push_back({i * 100, resident(i), descriptors(i)});
    }
    return all;
}
std::uint64_t flat(std::uint64_t /*i*/) {
    return 20000;
}

TEST(Growth, WhatStaysIsNone) {
    EXPECT_EQ(growth(samples(&flat, &flat), {}), "");
}

TEST(Growth, WhatIsKeptFromTheFirstHalfIsNone) {
    const auto early = [](std::uint64_t i) { return i < 90 ? 10000 + i * 100 : 19000; };
    EXPECT_EQ(growth(samples(early, &flat), {}), "");
}

TEST(Growth, LittleMemoryInTheSecondHalfIsNone) {
    const auto little = [](std::uint64_t i) { return 20000 + i * 5; };
    EXPECT_EQ(growth(samples(little, &flat), {}), "");
}

TEST(Growth, MemoryThatGrowsInTheSecondHalfIsNamed) {
    const auto leak = [](std::uint64_t i) { return 20000 + i * 20; };
    EXPECT_THAT(growth(samples(leak, &flat), {}),
                HasSubstr("resident memory in KiB grew from 22380 to 23980"));
}

TEST(Growth, OneDescriptorIsNamed) {
    const auto leak = [](std::uint64_t i) { return i < 150 ? std::uint64_t{9} : 10; };
    EXPECT_EQ(growth(samples(&flat, leak), {}), "open descriptors grew from 9 to 10\n");
}

TEST(Growth, ASampleTellsOfThisProcess) {
    const Sample before = takeSample(7);
    const ZR::UniqueFd one{::open("/dev/null", O_RDONLY | O_CLOEXEC)};
    const Sample after = takeSample(8);
    EXPECT_EQ(before.requests, 7U);
    EXPECT_EQ(after.descriptors, before.descriptors + 1);
    EXPECT_GT(before.residentKiB, 100U);
}

TEST(Growth, IsWrittenAsJson) {
    EXPECT_EQ(toJson({{1, 2, 3}, {4, 5, 6}}),
              "[\n  {\"requests\": 1, \"residentKiB\": 2, \"descriptors\": 3},\n"
              "  {\"requests\": 4, \"residentKiB\": 5, \"descriptors\": 6}\n]\n");
}

}  // namespace
}  // namespace test
