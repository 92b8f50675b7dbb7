#include "clients/NetworkdBus.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/un.h>

#include <cstdlib>
#include <cstring>

#include "LinuxSupport.h"
#include "kit/ChildProcess.h"
#include "zrcommon/UniqueFd.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using Testing::inChild;
using testing::IsEmpty;

NetworkdDescription describe(const std::string& json) {
    const auto parsed = parseNetworkdDescription(json);
    const auto* const facts = std::get_if<NetworkdDescription>(&parsed);
    EXPECT_NE(facts, nullptr) << std::get<std::string_view>(parsed);
    return facts == nullptr ? NetworkdDescription{} : *facts;
}
std::vector<NetworkdAddress> parsedStatus(const std::string& json) {
    return describe(json).addresses;
}

NetworkdAddress address(const IpAddress& own, const std::string& source,
                        const std::optional<IpAddress>& provider = {}, std::uint32_t ifindex = 2,
                        std::optional<std::uint64_t> validUntil = {}) {
    return {.ifindex = ifindex,
            .address = own,
            .source = source,
            .provider = provider,
            .validUntil = validUntil};
}

constexpr std::int64_t second = 1'000'000;
// When the captured ones would have started, for the tests of their times.
constexpr std::int64_t systemStart = 1'795'213'000 * second;

TEST(NetworkdDescription, CapturedByVersion252) {
    EXPECT_THAT(
        parsedStatus(sample("networkd/networkctl-status-eth1.json")),
        ElementsAre(address("fe80::5054:ff:fe00:5"_ip, "foreign"),
                    address("198.51.100.110"_ip, "DHCPv4", "198.51.100.1"_ip, 2, 2'790'836'929),
                    address("2001:db8:99::1b2"_ip, "DHCPv6", "fe80::e0cb:10ff:feee:2799"_ip, 2,
                            2'791'576'175)));
    EXPECT_THAT(describe(sample("networkd/networkctl-status-eth1.json")).clients, IsEmpty());
}

TEST(NetworkdDescription, CapturedByVersion257) {
    EXPECT_THAT(
        parsedStatus(sample("networkd-257/networkctl-status-eth1.json")),
        ElementsAre(address("2001:db8:99::1d3"_ip, "DHCPv6", "fe80::e0cb:10ff:feee:2799"_ip, 2,
                            3'420'984'167),
                    address("fe80::5054:ff:fe00:6"_ip, "foreign"),
                    address("198.51.100.111"_ip, "DHCPv4", "198.51.100.1"_ip, 2, 3'420'508'813)));
    EXPECT_THAT(
        describe(sample("networkd-257/networkctl-status-eth1.json")).clients,
        ElementsAre(NetworkdClient{.ifindex = 2,
                                   .ipv6 = false,
                                   .obtained = 2'820'494'812,
                                   .renews = 3'120'494'812,
                                   .rebinds = 3'345'494'812,
                                   .identifier =
                                       "ff:92:5a:88:c4:00:02:00:00:ab:11:6c:5d:f1:5f:b1:ef:e9:f3"},
                    NetworkdClient{.ifindex = 2,
                                   .ipv6 = true,
                                   .obtained = 2'820'491'305,
                                   .renews = 3'120'491'305,
                                   .rebinds = 3'345'491'305,
                                   .identifier = "00:02:00:00:ab:11:6c:5d:f1:5f:b1:ef:e9:f3"}));
}

TEST(NetworkdDescription, CapturedStaticAndLinkLocal) {
    EXPECT_THAT(parsedStatus(sample("networkd/networkctl-static-linklocal.json")),
                ElementsAre(address("fe80::c452:2fff:fee3:97d"_ip, "foreign", {}, 3),
                            address("169.254.105.80"_ip, "IPv4LL", {}, 3),
                            address("198.51.100.30"_ip, "static", {}, 3)));
}

TEST(NetworkdDescription, OfAllLinksAtOnce) {
    EXPECT_THAT(
        parsedStatus(R"({"Interfaces":[
        {"Index":1,"Addresses":[{"Family":2,"Address":[127,0,0,1],"ConfigSource":"foreign"}]},
        {"Index":7},
        {"Index":2,"Addresses":[{"Family":2,"Address":[192,0,2,7],"ConfigSource":"static"}]}]})"),
        ElementsAre(address("127.0.0.1"_ip, "foreign", {}, 1), address("192.0.2.7"_ip, "static")));
}

TEST(NetworkdDescription, WhatIsNotAnAddressIsSkipped) {
    EXPECT_THAT(
        parsedStatus(R"({"Index":2,"Addresses":[7,{},{"Family":2},{"Family":2,"Address":"x"},
        {"Family":2,"Address":[1,2,3]},{"Family":2,"Address":[1,2,3,256]},
        {"Family":2,"Address":[1,2,3,-4]},{"Family":10,"Address":[1,2,3,4]},
        {"Family":300,"Address":[1,2,3,4]},{"Family":"2","Address":[1,2,3,4]},
        {"Family":2,"Address":[192,0,2,7],"ConfigSource":7,"ConfigProvider":[1]}]})"),
        ElementsAre(address("192.0.2.7"_ip, "")));
    EXPECT_THAT(parsedStatus("{}"), IsEmpty());
    EXPECT_THAT(parsedStatus(R"({"Index":-2,"Addresses":[]})"), IsEmpty());
    EXPECT_THAT(parsedStatus(R"({"Index":2,"Addresses":{}})"), IsEmpty());
}

TEST(NetworkdDescription, OtherTextsHaveAReason) {
    for (const char* text : {"", "[]", "7", "{", "\"x\"", "{\"Index\":2,\"Addresses\":["}) {
        EXPECT_TRUE(std::holds_alternative<std::string_view>(parseNetworkdDescription(text)))
            << text;
    }
}

TEST(AddNetworkdDescription, AddsLeasesThatTheFilesDoNotTell) {
    ClientFacts facts;
    facts.leases = {{.client = Client::Networkd,
                     .interfaceName = {},
                     .ifindex = 2,
                     .address = "198.51.100.110"_ip,
                     .server = "198.51.100.1"_ip,
                     .expires = {},
                     .origin = "the file"}};
    facts.managers = {{.client = Client::Networkd, .pid = 7}};
    Lease known = facts.leases[0];
    known.clientAlive = true;
    known.pid = 7;
    known.expires = 1'795'215'791;  // which the file does not tell
    const std::vector<Lease> expected{known,
                                      {.client = Client::Networkd,
                                       .interfaceName = {},
                                       .ifindex = 2,
                                       .address = "2001:db8:99::1b2"_ip,
                                       .server = "fe80::e0cb:10ff:feee:2799"_ip,
                                       .clientAlive = true,
                                       .expires = 1'795'215'792,
                                       .pid = 7,
                                       .origin = "D-Bus org.freedesktop.network1"}};
    addNetworkdDescription(describe(sample("networkd/networkctl-status-eth1.json")), systemStart,
                           facts);
    EXPECT_EQ(facts.leases, expected);
}

TEST(AddNetworkdDescription, AddsAddressesThatAreStaticOnce) {
    ClientFacts facts;
    facts.managements = {{.client = Client::Networkd,
                          .ifindex = 3,
                          .dhcp4 = false,
                          .dhcp6 = false,
                          .staticAddresses = {}}};
    const auto described = describe(sample("networkd/networkctl-static-linklocal.json"));
    addNetworkdDescription(described, systemStart, facts);
    addNetworkdDescription(described, systemStart, facts);
    EXPECT_THAT(facts.managements[0].staticAddresses, ElementsAre("198.51.100.30"_ip));
    EXPECT_THAT(facts.leases, IsEmpty());
}

TEST(AddNetworkdDescription, Version257TellsTheTimesOfItsClients) {
    ClientFacts facts;
    facts.managements = {{.client = Client::Networkd,
                          .ifindex = 2,
                          .dhcp4 = {},
                          .dhcp6 = {},
                          .staticAddresses = {}}};
    addNetworkdDescription(describe(sample("networkd-257/networkctl-status-eth1.json")),
                           systemStart, facts);
    ASSERT_EQ(facts.leases.size(), 2U);
    for (const Lease& lease : facts.leases) {
        EXPECT_THAT(lease.obtained, testing::AnyOf(1'795'215'820, 1'795'215'821));
        EXPECT_EQ(*lease.renews - *lease.obtained, 300);
        EXPECT_EQ(*lease.rebinds - *lease.obtained, 525);
        EXPECT_THAT(*lease.expires - *lease.obtained, testing::AnyOf(600, 601));
    }
    EXPECT_EQ(facts.leases[0].clientIdentifier, "00:02:00:00:ab:11:6c:5d:f1:5f:b1:ef:e9:f3");
    // Whatever its file says by now.
    EXPECT_EQ(facts.managements[0].dhcp4, true);
    EXPECT_EQ(facts.managements[0].dhcp6, true);
}

/// The response of a machine whose system bus is at an address; in a process of its own,
/// for the address is given by the environment.
std::string responseOf(const std::string& bus, std::chrono::milliseconds time) {
    const auto result = inChild([&] {
        ::setenv("DBUS_SYSTEM_BUS_ADDRESS", bus.c_str(), 1);
        const auto start = std::chrono::steady_clock::now();
        const BusResponse response = askNetworkd(start + time);
        const bool late = std::chrono::steady_clock::now() - start > std::chrono::seconds{5};
        return response.json + '|' + response.reason + (late ? " (late)" : "");
    });
    return result.output;
}

TEST(AskNetworkd, WithoutABusNetworkdIsNotAsked) {
    const TemporaryDirectory directory;
    EXPECT_EQ(responseOf("unix:path=" + directory.path("/none"), std::chrono::milliseconds{100}),
              "|");
}

TEST(AskNetworkd, ABusThatNeverRespondsHoldsNoCallerUp) {
    // Connections wait in the queue of a socket, and are never accepted.
    const TemporaryDirectory directory;
    const std::string path = directory.path("/bus");
    const UniqueFd listener{::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)};
    sockaddr_un name{};
    name.sun_family = AF_UNIX;
    ASSERT_LT(path.size(), sizeof name.sun_path);
    std::memcpy(&name.sun_path[0], path.c_str(), path.size());
    const auto* const generic = static_cast<const sockaddr*>(static_cast<const void*>(&name));
    ASSERT_EQ(::bind(listener.get(), generic, sizeof name), 0);
    ASSERT_EQ(::listen(listener.get(), 8), 0);
    EXPECT_EQ(responseOf("unix:path=" + path, std::chrono::milliseconds{50}),
              "|systemd-networkd cannot be asked: Connection timed out");
}

}  // namespace
}  // namespace ZR::Live
