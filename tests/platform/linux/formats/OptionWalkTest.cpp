#include "formats/OptionWalk.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <array>
#include <string>
#include <vector>

namespace ZR::Live {
namespace {

using testing::ElementsAre;

std::vector<std::string> walk(const std::vector<std::string_view>& arguments) {
    constexpr std::array<std::string_view, 1> longWithValue{"interface"};
    OptionWalk walk{arguments, "iv", longWithValue};
    std::vector<std::string> found;
    for (CommandOption option; walk.next(option);) {
        const std::string name =
            option.letter != '\0' ? std::string(1, option.letter) : std::string{option.longName};
        found.push_back((option.isOperand() ? "operand" : name) + ':' + std::string{option.value});
    }
    return found;
}

TEST(OptionWalk, LettersMayStandTogether) {
    EXPECT_THAT(walk({"-bf", "-nieth1", "-i", "eth2"}),
                ElementsAre("b:", "f:", "n:", "i:eth1", "i:eth2"));
}

TEST(OptionWalk, LongNamesTakeTheirValueEitherWay) {
    EXPECT_THAT(walk({"--interface", "eth1", "--interface=eth2", "--quiet", "--other=x"}),
                ElementsAre("interface:eth1", "interface:eth2", "quiet:", "other:x"));
}

TEST(OptionWalk, WhatIsNotAnOptionIsAnOperand) {
    EXPECT_THAT(walk({"eth1", "-", "", "--", "-b", "--x"}),
                ElementsAre("operand:eth1", "operand:-", "operand:", "operand:-b", "operand:--x"));
}

TEST(OptionWalk, AMissingValueIsEmpty) {
    EXPECT_THAT(walk({"-i"}), ElementsAre("i:"));
    EXPECT_THAT(walk({"--interface"}), ElementsAre("interface:"));
    EXPECT_THAT(walk({"--=x"}), ElementsAre("-:x"));
    EXPECT_THAT(walk({}), ElementsAre());
    EXPECT_THAT(walk({"--"}), ElementsAre());
}

}  // namespace
}  // namespace ZR::Live
