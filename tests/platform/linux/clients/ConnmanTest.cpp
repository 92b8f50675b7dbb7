#include "clients/Connman.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/socket.h>

#include "LinuxSupport.h"
#include "kit/Diagnostics.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

TEST(ConnmanSettings, AddressOfAServiceThatUsesDhcp) {
    EXPECT_EQ(parseConnmanSettings("[wifi_525400abcdef_6f6666696365_managed_psk]\n"
                                   "Name=office\n"
                                   "IPv4.method=dhcp\n"
                                   "IPv4.DHCP.LastAddress=198.51.100.7\n"
                                   "IPv6.method=auto\n"),
              (ConnmanSettings{.dhcp4 = true, .lastAddress = "198.51.100.7"_ip}));
}

TEST(ConnmanSettings, AnyTextGivesSettings) {
    EXPECT_EQ(parseConnmanSettings("[x]\nIPv4.method=manual\nIPv4.DHCP.LastAddress=198.51.100\n"),
              ConnmanSettings{});
    EXPECT_EQ(parseConnmanSettings("IPv4.method\n=dhcp\n[\n"), ConnmanSettings{});
    EXPECT_EQ(parseConnmanSettings(""), ConnmanSettings{});
}

class ConnmanTest : public testing::Test {
  protected:
    void write(const std::string& service, const std::string& settings) const {
        root_.write("/var/lib/connman/" + service + "/settings", settings);
    }

    TemporaryDirectory root_;
};

TEST_F(ConnmanTest, WhileItRunsItsAddressesAreClaims) {
    write("ethernet_1_cable", "IPv4.method=dhcp\nIPv4.DHCP.LastAddress=198.51.100.7\n");
    write("ethernet_2_cable", "IPv4.method=dhcp\n");
    write("ethernet_3_cable", "IPv4.method=off\nIPv4.DHCP.LastAddress=198.51.100.8\n");
    root_.write("/var/lib/connman/settings", "[global]\nIPv4.method=dhcp\n");
    const ClientFacts facts = readWith(readConnman, root_, running(Client::Connman));
    const std::string directory = root_.path("/var/lib/connman/ethernet_1_cable");
    EXPECT_THAT(facts.leases, ElementsAre(Lease{.client = Client::Connman,
                                                .interfaceName = {},
                                                .address = "198.51.100.7"_ip,
                                                .server = {},
                                                .clientAlive = true,
                                                .expires = std::nullopt,
                                                .origin = directory + "/settings"}));
    EXPECT_THAT(facts.places, testing::Contains(WatchedPlace{directory, "settings"}));
    EXPECT_THAT(ZR::Testing::textsOf(facts.diagnostics), IsEmpty());
}

TEST_F(ConnmanTest, WhatItLeftWhenItEndedProvesNothing) {
    write("ethernet_1_cable", "IPv4.method=dhcp\nIPv4.DHCP.LastAddress=198.51.100.7\n");
    EXPECT_EQ(readWith(readConnman, root_), ClientFacts{});
}

}  // namespace
}  // namespace ZR::Live
