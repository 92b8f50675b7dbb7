#include "clients/Udhcpc.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/stat.h>

#include <ctime>
#include <sstream>

#include "LinuxSupport.h"
#include "kit/Namespaces.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

std::optional<ClientProcess> parsedUdhcpc(std::vector<std::string_view> arguments) {
    return parseUdhcpcArguments(arguments);
}
ClientProcess udhcpcProcess(const std::string& interface, bool ipv6 = false) {
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
    EXPECT_EQ(parsedUdhcpc({texts.begin(), texts.end()}), udhcpcProcess("eth1"));
}

TEST(UdhcpcArguments, WithoutAnInterfaceItIsEth0) {
    EXPECT_EQ(parsedUdhcpc({"udhcpc"}), udhcpcProcess("eth0"));
    EXPECT_EQ(parsedUdhcpc({"udhcpc", "-i"}), udhcpcProcess("eth0"));
    EXPECT_EQ(parsedUdhcpc({"udhcpc", "-i", "a/b"}), udhcpcProcess("eth0"));
}

TEST(UdhcpcArguments, TheInterfaceMayBeNamedInManyWays) {
    EXPECT_EQ(parsedUdhcpc({"/sbin/udhcpc", "-bieth1"}), udhcpcProcess("eth1"));
    EXPECT_EQ(parsedUdhcpc({"udhcpc", "--interface=eth1"}), udhcpcProcess("eth1"));
    EXPECT_EQ(parsedUdhcpc({"udhcpc", "-s", "-i", "--interface", "eth1", "-x", "hostname:i"}),
              udhcpcProcess("eth1"));
    EXPECT_EQ(parsedUdhcpc({"udhcpc6", "-i", "eth1"}), udhcpcProcess("eth1", true));
}

TEST(UdhcpcArguments, BusyboxIsMuchElseToo) {
    EXPECT_EQ(parsedUdhcpc({"busybox", "udhcpc", "-i", "eth1"}), udhcpcProcess("eth1"));
    EXPECT_EQ(parsedUdhcpc({"/bin/busybox", "udhcpc6", "-i", "eth1"}), udhcpcProcess("eth1", true));
    for (const std::vector<std::string_view>& arguments :
         {std::vector<std::string_view>{"busybox", "sh"}, {"busybox"}, {"sh"}, {}}) {
        EXPECT_EQ(parsedUdhcpc(arguments), std::nullopt);
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
    EXPECT_THAT(read({udhcpcProcess("eth1")}).leases,
                ElementsAre(Lease{.client = Client::Udhcpc,
                                  .interfaceName = "eth1"_name,
                                  .address = "198.51.100.108"_ip,
                                  .server = "198.51.100.1"_ip,
                                  .clientAlive = true,
                                  .expires = 1'000'600,
                                  .obtained = 1'000'000,
                                  .origin = root_.path("/run/udhcpc.eth1.state")}));
    EXPECT_FALSE(read({udhcpcProcess("eth2")}).leases.at(0).clientAlive);
    EXPECT_FALSE(read({udhcpcProcess("eth1", true)}).leases.at(0).clientAlive);
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
        const ClientFacts facts = read();
        EXPECT_THAT(facts.leases, IsEmpty()) << content;
        if (*content == '\0') {
            EXPECT_THAT(facts.diagnostics, IsEmpty()) << "it is about to be written";
            continue;
        }
        ASSERT_EQ(facts.diagnostics.size(), 1U) << content;
        EXPECT_EQ(facts.diagnostics[0].kind, Diagnostic::Kind::Damaged) << content;
        EXPECT_TRUE(facts.diagnostics[0].text.starts_with(root_.path("/run/udhcpc.eth1.state: ")))
            << facts.diagnostics[0].text;
    }
}

TEST_F(UdhcpcTest, TheFileTellsWhenTheLeaseCameAndItsOptions) {
    write(
        "ip=192.0.2.7\nlease=600\nobtained=2000000\n"
        "options='PATH broadcast dns interface lease opt53 opt58 opt256 optx router subnet dns "
        "'\n");
    ClientProcess client = udhcpcProcess("eth1");
    client.pid = 17;
    const Lease lease = read({client}).leases.at(0);
    EXPECT_EQ(lease.obtained, 2'000'000);
    EXPECT_EQ(lease.expires, 2'000'600);
    EXPECT_THAT(lease.options, ElementsAre(28, 6, 51, 53, 58, 3, 1));
    EXPECT_EQ(lease.pid, 17);
    write("ip=192.0.2.7\nlease=600\nobtained=\n");
    EXPECT_EQ(read().leases.at(0).obtained, 1'000'000);
    EXPECT_EQ(read().leases.at(0).pid, 0);
    write("ip=192.0.2.7\nlease=600\nobtained=9223372036854775807\n");
    EXPECT_EQ(read().leases.at(0).expires, Lease::never);
}

TEST_F(UdhcpcTest, AFileThatOthersMayWriteIsNotBelieved) {
    write("ip=192.0.2.7\nlease=600\n");
    ASSERT_EQ(::chmod(root_.path("").c_str(), 0755), 0);
    ASSERT_EQ(::chmod(root_.path("/run/udhcpc.eth1.state").c_str(), 0666), 0);
    const ClientFacts facts = read({udhcpcProcess("eth1")});
    EXPECT_THAT(facts.leases, IsEmpty());
    ASSERT_EQ(facts.diagnostics.size(), 1U);
    EXPECT_EQ(facts.diagnostics[0].kind, Diagnostic::Kind::Untrusted);
}

TEST_F(UdhcpcTest, TheScriptOfTheDocumentsWritesIt) {
    const std::string page = File::read(ZR_SOURCE_DIR "/docs/sources.md").value();
    const std::size_t start = page.find("case $1 in\n", page.find("## Helping udhcpc"));
    ASSERT_NE(start, std::string::npos);
    std::string script = page.substr(start, page.find("esac\n", start) + 5 - start);
    for (std::size_t at = 0; (at = script.find("\"/run/", at)) != std::string::npos; ++at) {
        script.insert(at + 1, root_.path(""));
    }
    root_.write("/script", script);
    std::filesystem::create_directories(root_.path("/run"));
    const auto call = [&](const std::string& event) {
        run("env -i PATH=\"$PATH\" interface=eth1 ip=192.0.2.7 serverid=192.0.2.1 lease=600 "
            "subnet=255.255.255.0 'domain=it'\\''s; $(here)' opt53=05 sh " +
            root_.path("/script ") + event);
    };
    for (const char* event : {"bound", "renew"}) {
        call(event);
        const std::int64_t now = std::time(nullptr);
        const ClientFacts facts = read();
        EXPECT_THAT(facts.diagnostics, IsEmpty());
        ASSERT_EQ(facts.leases.size(), 1U) << event;
        const Lease& lease = facts.leases[0];
        EXPECT_EQ(lease.address, "192.0.2.7"_ip);
        EXPECT_EQ(lease.server, "192.0.2.1"_ip);
        EXPECT_LE(now - lease.obtained.value(), 5);
        EXPECT_EQ(lease.expires, *lease.obtained + 600);
        EXPECT_THAT(lease.options, testing::UnorderedElementsAre(1, 15, 51, 53, 54));
        call("deconfig");
        EXPECT_EQ(read(), ClientFacts{});
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
