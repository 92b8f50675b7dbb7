#include "commands/HiddenClients.h"

#include <gtest/gtest.h>

#include "kit/FileContent.h"
#include "kit/TemporaryDirectory.h"

namespace cimdhcp {

TEST(HiddenClients, NothingIsHiddenWhereNoClientRuns) {
    const ZR::Testing::TemporaryDirectory proc;
    std::filesystem::create_directories(proc / "1");
    ZR::Testing::writeFile(proc / "1/comm", "init\n");
    std::filesystem::create_directories(proc / "17");
    ZR::Testing::writeFile(proc / "17/comm", "sleep\n");
    std::filesystem::create_directories(proc / "net");
    EXPECT_EQ(findHiddenClients(proc.path()), HiddenClients());
    EXPECT_EQ(findHiddenClients(proc.path() / "nowhere"), HiddenClients());
}

TEST(HiddenClients, AClientWhoseNamespaceCanBeToldIsNot) {
    const ZR::Testing::TemporaryDirectory proc;
    std::filesystem::create_directories(proc / "1");
    ZR::Testing::writeFile(proc / "1/comm", "init\n");
    std::filesystem::create_directories(proc / "17/ns");
    ZR::Testing::writeFile(proc / "17/comm", "dhclient\n");
    std::filesystem::create_symlink("net:[4026531840]", proc / "17/ns/net");
    EXPECT_EQ(findHiddenClients(proc.path()), HiddenClients());
    // Nor is one that ends while it is looked at.
    std::filesystem::remove(proc / "17/ns/net");
    EXPECT_EQ(findHiddenClients(proc.path()), HiddenClients());
}

}  // namespace cimdhcp
