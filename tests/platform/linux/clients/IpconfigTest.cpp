#include "clients/Ipconfig.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/stat.h>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

using Protocol = IpconfigResult::Protocol;
using testing::ElementsAre;
using testing::IsEmpty;

TEST(IpconfigResult, CapturedDhcp) {
    EXPECT_EQ(parseIpconfig(sample("klibc-ipconfig/run-net-eth1.conf.dhcp")),
              (IpconfigResult{.interfaceName = "eth1"_name,
                              .protocol = Protocol::Dhcp,
                              .address = "203.0.113.140"_ip,
                              .server = "203.0.113.1"_ip,
                              .leaseTime = 1200,
                              .uptime = 3357}));
}

TEST(IpconfigResult, CapturedBootp) {
    EXPECT_EQ(parseIpconfig(sample("klibc-ipconfig/run-net-eth1.conf.bootp")),
              (IpconfigResult{.interfaceName = "eth1"_name,
                              .protocol = Protocol::Bootp,
                              .address = "203.0.113.140"_ip,
                              .server = "203.0.113.1"_ip,
                              .leaseTime = 0,
                              .uptime = 3357}));
}

TEST(IpconfigResult, NewerVersionsCallTheProtocolOtherwise) {
    EXPECT_EQ(parseIpconfig("IPV4PROTO='dhcp'\n").protocol, Protocol::Dhcp);
    EXPECT_EQ(parseIpconfig("IPV4PROTO='none'\n").protocol, Protocol::Other);
}

TEST(IpconfigResult, AllZerosAreNotAnAddress) {
    const IpconfigResult result = parseIpconfig("IPV4ADDR='0.0.0.0'\nROOTSERVER='0.0.0.0'\n");
    EXPECT_EQ(result.address, std::nullopt);
    EXPECT_EQ(result.server, std::nullopt);
}

class IpconfigTest : public testing::Test {
  protected:
    [[nodiscard]] ClientFacts read() const { return readWith(readIpconfig, root_); }
    void write(const std::string& content) const {
        root_.write("/run/net-eth1.conf", content);
        root_.age("/run/net-eth1.conf", 1'000'000);
    }
    [[nodiscard]] Lease lease(bool bootp, std::int64_t obtained, std::int64_t expires) const {
        return {.client = Client::Ipconfig,
                .interfaceName = "eth1"_name,
                .address = "203.0.113.140"_ip,
                .server = "203.0.113.1"_ip,
                .bootp = bootp,
                .expires = expires,
                .obtained = obtained,
                .outlivesEnd = true,
                .origin = root_.path("/run/net-eth1.conf")};
    }

    TemporaryDirectory root_;
};

TEST_F(IpconfigTest, OnAMachineThatDidNotBootSoThereIsNothing) {
    EXPECT_EQ(read(), ClientFacts{});
}

TEST_F(IpconfigTest, ALeaseOutlivesItsEndAndOneOfBootpHasNone) {
    write(sample("klibc-ipconfig/run-net-eth1.conf.dhcp"));
    EXPECT_THAT(read().leases, ElementsAre(lease(false, 1'000'000, 1'001'200)));
    write(sample("klibc-ipconfig/run-net-eth1.conf.bootp"));
    EXPECT_THAT(read().leases, ElementsAre(lease(true, 1'000'000, Lease::never)));
}

TEST_F(IpconfigTest, ALeaseCountsFromTheStartOfTheSystem) {
    write(sample("klibc-ipconfig/run-net-eth1.conf.dhcp"));
    root_.write("/proc/stat", "cpu  1 2 3\nintr 5 btime 6\nctxt 4\nbtime 1000\nprocesses 9\n");
    EXPECT_THAT(read().leases, ElementsAre(lease(false, 4357, 5557)));
    for (const char* text : {"", "btime 7", "cpu 1\nbtime x\n", "cpu 1\nbtime"}) {
        root_.write("/proc/stat", text);
        EXPECT_THAT(read().leases, ElementsAre(lease(false, 1'000'000, 1'001'200))) << text;
    }
    EXPECT_THAT(read().diagnostics, IsEmpty());
}

TEST_F(IpconfigTest, AFileThatNamesNoInterfaceIsDamaged) {
    write("DEVICE='a b'\nPROTO='dhcp'\nIPV4ADDR='192.0.2.7'\n");
    EXPECT_THAT(read().diagnostics,
                ElementsAre(Diagnostic{root_.path("/run/net-eth1.conf") +
                                           ": \"DEVICE\" is not the name of an interface",
                                       Diagnostic::Kind::Damaged}));
}

TEST_F(IpconfigTest, AFileThatOthersMayWriteIsNotBelieved) {
    write(sample("klibc-ipconfig/run-net-eth1.conf.dhcp"));
    ASSERT_EQ(::chmod(root_.path("").c_str(), 0755), 0);
    ASSERT_EQ(::chmod(root_.path("/run/net-eth1.conf").c_str(), 0666), 0);
    const ClientFacts facts = read();
    EXPECT_THAT(facts.leases, IsEmpty());
    ASSERT_EQ(facts.diagnostics.size(), 1U);
    EXPECT_EQ(facts.diagnostics[0].kind, Diagnostic::Kind::Untrusted);
}

TEST_F(IpconfigTest, AnAddressThatWasGivenByHandIsNotALease) {
    write("DEVICE=eth1\nPROTO='none'\nIPV4ADDR='192.0.2.7'\n");
    EXPECT_THAT(read().leases, IsEmpty());
    write("DEVICE='a b'\nPROTO='dhcp'\nIPV4ADDR='192.0.2.7'\n");
    EXPECT_THAT(read().leases, IsEmpty());
    write("DEVICE=eth1\nPROTO='dhcp'\n");
    EXPECT_THAT(read().leases, IsEmpty());
}

}  // namespace
}  // namespace ZR::Live
