#include "zrcommon/InterfaceFile.h"

#include <gtest/gtest.h>

namespace ZR {
namespace {

TEST(InterfaceFile, IsNamedAfterItsInterface) {
    EXPECT_EQ(InterfaceFile::path("/data/", "eth0"), "/data/ifcfg-eth0");
    EXPECT_EQ(InterfaceFile::path("/data/", "eth0.7"), "/data/ifcfg-eth0.7");
    for (const char* name : {"", ".", "..", "a/b", "a\nb", "a\x7F"}) {
        EXPECT_EQ(InterfaceFile::path("/data/", name), std::nullopt) << name;
    }
}

}  // namespace
}  // namespace ZR
