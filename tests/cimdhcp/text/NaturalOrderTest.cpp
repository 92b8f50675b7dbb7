#include "text/NaturalOrder.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>

namespace cimdhcp {
namespace {

TEST(NaturalOrder, NumbersCountByTheirValue) {
    std::vector<std::string> texts{"eth10", "eth2",       "eth",       "Eth3", "eth02", "eth2.5",
                                   "10",    "192.0.2.17", "192.0.2.9", "9",    "",      "eth2"};
    std::sort(texts.begin(), texts.end(), comesBefore);
    EXPECT_THAT(texts, testing::ElementsAre("", "9", "10", "192.0.2.9", "192.0.2.17", "Eth3", "eth",
                                            "eth02", "eth2", "eth2", "eth2.5", "eth10"));
}

TEST(NaturalOrder, IsOneForAnyTexts) {
    const std::vector<std::string> texts{"a",  "a0",  "a00", "0a",   "00a",
                                         "a1", "a01", "a1b", "\xFF", "99999999999999999999999"};
    for (const std::string& a : texts) {
        EXPECT_FALSE(comesBefore(a, a));
        for (const std::string& b : texts) {
            if (a != b) {
                EXPECT_NE(comesBefore(a, b), comesBefore(b, a)) << a << ' ' << b;
            }
            for (const std::string& c : texts) {
                EXPECT_FALSE(comesBefore(a, b) && comesBefore(b, c) && !comesBefore(a, c))
                    << a << ' ' << b << ' ' << c;
            }
        }
    }
}

}  // namespace
}  // namespace cimdhcp
