// A process file system laid out by hand: processes of other namespaces, ended
// ones and hidden ones cannot all be had at will. DhcpLifeTest.cpp uses the real one.

#include "clients/Processes.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include "LinuxSupport.h"
#include "kit/ChildProcess.h"
#include "kit/Diagnostics.h"

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
                                                            .interfaces = {"eth1"_name},
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
    EXPECT_THAT(ZR::Testing::textsOf(read().diagnostics), IsEmpty());
}

TEST_F(ProcessesTest, WithoutAnOwnNamespaceNoClientIsTrusted) {
    std::filesystem::remove_all(proc_.path("/thread-self"));
    add("17", "dhclient", commandLine_, nullptr);
    EXPECT_THAT(read().processes, IsEmpty());
}

TEST_F(ProcessesTest, AnEndedClientKeepsItsNameOnly) {
    add("17", "dhclient", "");
    EXPECT_THAT(read().processes, IsEmpty());
}

TEST_F(ProcessesTest, EachClientIsKnownByItsName) {
    const auto text = [](const char* characters, std::size_t size) {
        return std::string{characters, size};
    };
    add("11", "dhcpcd", "dhcpcd: eth1 [ip4] [ip6]");
    add("12", "udhcpc", text("udhcpc\0-i\0eth2\0", 15));
    add("13", "busybox", text("busybox\0udhcpc\0-i\0eth3\0", 23));
    add("14", "udhcpc6", text("udhcpc6\0-i\0eth4\0", 16));
    add("15", "dhcp6c", text("dhcp6c\0eth5\0", 12));
    add("16", "busybox", text("busybox\0sh\0", 11));
    std::vector<std::tuple<Client, InterfaceName, std::int32_t>> found;
    for (const ClientProcess& process : read().processes) {
        found.emplace_back(process.client, process.interfaces.at(0), process.pid);
    }
    EXPECT_THAT(found, testing::UnorderedElementsAre(std::tuple{Client::Dhcpcd, "eth1"_name, 11},
                                                     std::tuple{Client::Udhcpc, "eth2"_name, 12},
                                                     std::tuple{Client::Udhcpc, "eth3"_name, 13},
                                                     std::tuple{Client::Udhcpc, "eth4"_name, 14},
                                                     std::tuple{Client::Dhcp6c, "eth5"_name, 15}));
}

TEST_F(ProcessesTest, ManagersAreToldWithWhereTheyRun) {
    using Where = ManagerProcess::Where;
    add("11", "systemd-network", "/lib/systemd/systemd-networkd");
    add("12", "NetworkManager", "/usr/sbin/NetworkManager", "net:[2]");
    add("13", "wickedd-dhcp4", "", nullptr);
    add("14", "connmand", "/usr/sbin/connmand");
    EXPECT_THAT(
        read().managers,
        testing::UnorderedElementsAre(
            ManagerProcess{.client = Client::Networkd, .where = Where::Here, .pid = 11},
            ManagerProcess{.client = Client::NetworkManager, .where = Where::Elsewhere, .pid = 12},
            ManagerProcess{.client = Client::Wicked, .where = Where::Unknown, .pid = 13},
            ManagerProcess{.client = Client::Connman, .where = Where::Here, .pid = 14}));
}

TEST_F(ProcessesTest, AClientWhoseNamespaceIsForbiddenIsReported) {
    using std::filesystem::perms;
    constexpr uid_t nobody = 65534;
    add("17", "dhclient", commandLine_);
    std::filesystem::permissions(proc_.path("/17/ns"), perms::none);
    std::filesystem::permissions(
        proc_.path(),
        perms::group_read | perms::group_exec | perms::others_read | perms::others_exec,
        std::filesystem::perm_options::add);
    // Nothing is forbidden to root.
    const ZR::Testing::ChildResult other = ZR::Testing::inChild([this] {
        if (::geteuid() == 0 && ::setuid(nobody) != 0) {
            return std::string("cannot be another user");
        }
        const ClientFacts facts = read();
        std::string text = std::to_string(facts.processes.size()) + " processes";
        for (const Diagnostic& diagnostic : facts.diagnostics) {
            text += "; " + diagnostic.text;
        }
        return text;
    });
    std::filesystem::permissions(proc_.path("/17/ns"), perms::owner_all);
    EXPECT_EQ(other.output,
              "0 processes; cannot tell the links of process 17 (dhclient): Permission denied");
}

TEST_F(ProcessesTest, WhatIsNotAProcessIsNotLookedAt) {
    add("self", "dhclient", commandLine_);
    add("0", "dhclient", commandLine_);
    std::filesystem::create_directories(proc_.path("/21"));
    EXPECT_THAT(read().processes, IsEmpty());
}

// A client's name on a thread of the kernel shows whether it was looked at.
TEST_F(ProcessesTest, ThreadsOfTheKernelAreNotLookedAt) {
    proc_.write("/2/stat", "2 (k) thr ead) S 0 0 0 0 -1 2129984 0 0\n");
    proc_.write("/2/task/2/children", "17 4 ");
    add("4", "dhclient", commandLine_);
    add("17", "dhclient", commandLine_);
    add("174", "dhclient", commandLine_);
    const ClientFacts facts = read();
    ASSERT_EQ(facts.processes.size(), 1U);
    EXPECT_EQ(facts.processes[0].pid, 174);
}

TEST_F(ProcessesTest, ChildrenOfAProgramWithTheKernelsNumberAreLookedAt) {
    for (const char* status : {"2 (kthreadd) S 0 0 0 0 -1 4194560 0 0\n", "2 (kthreadd) S 0",
                               "2 kthreadd S 0 0 0 0 -1 2129984 0 0\n", ""}) {
        proc_.write("/2/stat", status);
        proc_.write("/2/task/2/children", "17 ");
        add("17", "dhclient", commandLine_);
        EXPECT_EQ(read().processes.size(), 1U) << status;
        std::filesystem::remove_all(proc_.path("/17"));
    }
}

TEST_F(ProcessesTest, AnyListOfThreadsOfTheKernelIsRead) {
    proc_.write("/2/stat", "2 (kthreadd) S 0 0 0 0 -1 2129984 0 0\n");
    add("17", "dhclient", commandLine_);
    EXPECT_EQ(read().processes.size(), 1U) << "the kernel need not tell";
    std::string many;
    for (int number = 100; number < 5'000; ++number) {
        many += std::to_string(number) + " ";
    }
    for (const std::string& children : {std::string{"x 17x  -3 99999999999 "}, many}) {
        proc_.write("/2/task/2/children", children);
        EXPECT_EQ(read().processes.size(), 1U);
        proc_.write("/2/task/2/children", children + "17 ");
        EXPECT_THAT(read().processes, IsEmpty());
    }
}

TEST_F(ProcessesTest, WithoutAProcessFileSystemThereIsAReason) {
    ClientFacts facts;
    readProcesses({.files = "", .proc = proc_.path("/none")}, facts);
    EXPECT_THAT(ZR::Testing::textsOf(facts.diagnostics),
                ElementsAre("cannot read " + proc_.path("/none") + ": No such file or directory"));
}

}  // namespace
}  // namespace ZR::Live
