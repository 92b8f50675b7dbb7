// A process file system laid out by hand: processes of other namespaces, ended
// ones and hidden ones cannot all be had at will. DhcpLifeTest.cpp uses the real one.

#include "Processes.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include "Support.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class ProcessesTest : public testing::Test {
  protected:
    ProcessesTest() { linkNamespace("thread-self", "net:[1]"); }

    void linkNamespace(const std::string& process, const char* name) const {
        std::filesystem::create_directories(proc_.path("/" + process + "/ns"));
        std::filesystem::create_symlink(name, proc_.path("/" + process + "/ns/net"));
    }
    void add(const std::string& process, const std::string& name, const std::string& commandLine,
             const char* networkNamespace = "net:[1]") const {
        proc_.write("/" + process + "/comm", name + "\n");
        proc_.write("/" + process + "/cmdline", commandLine);
        if (networkNamespace != nullptr) {
            linkNamespace(process, networkNamespace);
        }
    }
    ClientFacts read() const {
        ClientFacts facts;
        readProcesses({.files = "", .proc = proc_.path()}, facts);
        return facts;
    }

    TemporaryDirectory proc_;
    const std::string commandLine_{"dhclient\0-lf\0/l\0eth1\0", 22};
};

TEST_F(ProcessesTest, AClientIsFoundByItsName) {
    add("17", "dhclient", commandLine_);
    add("18", "dhclientx", commandLine_);
    add("19", "sh", commandLine_);
    EXPECT_THAT(read().processes, ElementsAre(ClientProcess{.client = Client::Dhclient,
                                                            .interfaces = {"eth1"},
                                                            .leaseFile = "/l",
                                                            .ipv6 = false,
                                                            .pid = 17}));
}

TEST_F(ProcessesTest, ClientsOfOtherNamespacesConcernOtherLinks) {
    add("17", "dhclient", commandLine_, "net:[2]");
    EXPECT_THAT(read().processes, IsEmpty());
}

TEST_F(ProcessesTest, AClientOfAnUnknownNamespaceIsNotTrusted) {
    add("17", "dhclient", commandLine_, nullptr);
    EXPECT_THAT(read().processes, IsEmpty());
    EXPECT_THAT(read().complaints, IsEmpty());
}

TEST_F(ProcessesTest, WithoutAnOwnNamespaceNobodyIsTrusted) {
    std::filesystem::remove_all(proc_.path("/thread-self"));
    add("17", "dhclient", commandLine_, nullptr);
    EXPECT_THAT(read().processes, IsEmpty());
}

TEST_F(ProcessesTest, AnEndedClientKeepsItsNameOnly) {
    add("17", "dhclient", "");
    EXPECT_THAT(read().processes, IsEmpty());
}

TEST_F(ProcessesTest, WhatIsNoProcessIsNotLookedAt) {
    add("self", "dhclient", commandLine_);
    add("0", "dhclient", commandLine_);
    std::filesystem::create_directories(proc_.path("/21"));
    EXPECT_THAT(read().processes, IsEmpty());
}

TEST_F(ProcessesTest, WithoutAProcessFileSystemThereIsAReason) {
    ClientFacts facts;
    readProcesses({.files = "", .proc = proc_.path("/none")}, facts);
    EXPECT_THAT(facts.complaints,
                ElementsAre("cannot read " + proc_.path("/none") + ": No such file or directory"));
}

}  // namespace
}  // namespace ZR::Live
