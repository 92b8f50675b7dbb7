#include "kernel/WatchedPlace.h"

#include <gtest/gtest.h>

namespace ZR::Live {
namespace {

TEST(WatchedPlaces, AShorterPrefixCoversALongerOne) {
    const WatchedPlace place{.directory = "/d", .namePrefix = "a"};
    EXPECT_TRUE(place.covers({.directory = "/d", .namePrefix = "ab"}));
    EXPECT_FALSE(place.covers({.directory = "/d", .namePrefix = ""}));
    EXPECT_FALSE(place.covers({.directory = "/e", .namePrefix = "a"}));
}

}  // namespace
}  // namespace ZR::Live
