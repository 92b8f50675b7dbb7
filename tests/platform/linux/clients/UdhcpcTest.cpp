#include "clients/Udhcpc.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/socket.h>

#include <sstream>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

std::optional<ClientProcess> parse(std::vector<std::string_view> arguments) {
    return parseUdhcpcArguments(arguments);
}
ClientProcess process(const std::string& interface, bool ipv6 = false) {
    return {.client = Client::Udhcpc,
            .interfaces = {interfaceName(interface)},
            .leaseFile = "",
            .ipv6 = ipv6};
}

TEST(UdhcpcArguments, Captured) {
    const std::string line = sample("udhcpc/proc-cmdline.txt");
    std::istringstream words{line};
    std::vector<std::string> texts;
    for (std::string word; words >> word;) {
        texts.push_back(word);
    }
    EXPECT_EQ(parse({texts.begin(), texts.end()}), process("eth1"));
}

TEST(UdhcpcArguments, WithoutAnInterfaceItIsEth0) {
    EXPECT_EQ(parse({"udhcpc"}), process("eth0"));
    EXPECT_EQ(parse({"udhcpc", "-i"}), process("eth0"));
    EXPECT_EQ(parse({"udhcpc", "-i", "a/b"}), process("eth0"));
}

TEST(UdhcpcArguments, TheInterfaceMayBeNamedInManyWays) {
    EXPECT_EQ(parse({"/sbin/udhcpc", "-bieth1"}), process("eth1"));
    EXPECT_EQ(parse({"udhcpc", "--interface=eth1"}), process("eth1"));
    EXPECT_EQ(parse({"udhcpc", "-s", "-i", "--interface", "eth1", "-x", "hostname:i"}),
              process("eth1"));
    EXPECT_EQ(parse({"udhcpc6", "-i", "eth1"}), process("eth1", true));
}

TEST(UdhcpcArguments, BusyboxIsMuchElseToo) {
    EXPECT_EQ(parse({"busybox", "udhcpc", "-i", "eth1"}), process("eth1"));
    EXPECT_EQ(parse({"/bin/busybox", "udhcpc6", "-i", "eth1"}), process("eth1", true));
    for (const std::vector<std::string_view>& arguments :
         {std::vector<std::string_view>{"busybox", "sh"}, {"busybox"}, {"sh"}, {}}) {
        EXPECT_EQ(parse(arguments), std::nullopt);
    }
}

class UdhcpcTest : public testing::Test {
  protected:
    [[nodiscard]] ClientFacts read(std::vector<ClientProcess> processes = {}) const {
        ClientFacts facts;
        facts.processes = std::move(processes);
        return readWith(readUdhcpc, root_, std::move(facts));
    }
    void write(const std::string& content) const {
        root_.write("/run/udhcpc.eth1.state", content);
        root_.age("/run/udhcpc.eth1.state", 1'000'000);
    }

    TemporaryDirectory root_;
};

TEST_F(UdhcpcTest, WithoutAHelpingScriptThereIsNothing) {
    EXPECT_EQ(read(), ClientFacts{});
}

TEST_F(UdhcpcTest, WhatAScriptIsGivenTellsTheLease) {
    // The script's environment as it was captured, from the second event on.
    const std::string events = sample("udhcpc/hook-script-environment.txt");
    write(events.substr(events.find("== bound")));
    EXPECT_THAT(read({process("eth1")}).leases,
                ElementsAre(Lease{.client = Client::Udhcpc,
                                  .interfaceName = "eth1"_name,
                                  .address = "198.51.100.108"_ip,
                                  .server = "198.51.100.1"_ip,
                                  .clientAlive = true,
                                  .expires = 1'000'600,
                                  .origin = root_.path("/run/udhcpc.eth1.state")}));
    EXPECT_FALSE(read({process("eth2")}).leases.at(0).clientAlive);
    EXPECT_FALSE(read({process("eth1", true)}).leases.at(0).clientAlive);
}

TEST_F(UdhcpcTest, AnInfiniteLeaseNeverEnds) {
    write("ip=192.0.2.7\nlease=4294967295\n");
    EXPECT_EQ(read().leases.at(0).expires, Lease::never);
    EXPECT_EQ(read().leases.at(0).server, std::nullopt);
}

TEST_F(UdhcpcTest, AnIncompleteFileIsNotALease) {
    for (const char* content :
         {"", "ip=192.0.2.7\n", "lease=600\n", "ip=x\nlease=600\n", "ip=192.0.2.7\nlease=-1\n"}) {
        write(content);
        EXPECT_THAT(read().leases, IsEmpty()) << content;
    }
}

TEST_F(UdhcpcTest, OtherFilesAreNotLookedAt) {
    for (const char* name : {"/run/udhcpc.eth1.pid", "/run/udhcpc.state", "/run/udhcpc..state",
                             "/run/other.eth1.state", "/run/udhcpc.a b.state"}) {
        root_.write(name, "ip=192.0.2.7\nlease=600\n");
    }
    EXPECT_EQ(read(), ClientFacts{});
}

}  // namespace
}  // namespace ZR::Live
