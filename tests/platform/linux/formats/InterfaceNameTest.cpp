#include "formats/InterfaceName.h"

#include <gtest/gtest.h>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

TEST(InterfaceName, IsWhatTheKernelTakes) {
    for (const std::string_view text : {"e", "eth0", "fifteen-letters", "...", "a.b", "\xc3\xa9"}) {
        const auto name = InterfaceName::from(text);
        ASSERT_TRUE(name) << text;
        EXPECT_EQ(name->view(), text);
    }
}

TEST(InterfaceName, IsNothingElse) {
    for (const std::string_view text :
         {std::string_view{""}, std::string_view{"."}, std::string_view{".."},
          std::string_view{"a/b"}, std::string_view{"sixteen--letters"},
          std::string_view{"two words"}, std::string_view{"tab\t"}, std::string_view{"line\n"},
          std::string_view{"a\0b", 3}}) {
        EXPECT_EQ(InterfaceName::from(text), std::nullopt) << text;
    }
}

TEST(InterfaceName, IsOrderedByItsBytes) {
    EXPECT_EQ("eth1"_name, "eth1"_name);
    EXPECT_NE("eth1"_name, "eth10"_name);
    EXPECT_LT("eth1"_name, "eth10"_name);
    EXPECT_LT("eth10"_name, "eth2"_name);
    EXPECT_LT("eth2"_name, "eth\xff"_name);
}

}  // namespace
}  // namespace ZR::Live
