#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/socket.h>

#include <algorithm>
#include <string>

#include "LinuxSupport.h"
#include "clients/Connman.h"
#include "clients/ManagerBuses.h"
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
    EXPECT_TRUE(parseConnmanSettings("AutoConnect=true\n").autoConnect);
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

TEST_F(ConnmanTest, ALinkWithoutACableIsNamedByItsHardwareAddress) {
    write("ethernet_5293d4ee0eca_cable", "AutoConnect=true\nIPv4.method=dhcp\n");
    write("ethernet_5293d4ee0ecb_cable", "AutoConnect=false\nIPv4.method=dhcp\n");
    write("ethernet_5293d4ee0ecc_cable", "AutoConnect=true\nIPv4.method=manual\n");
    write("wifi_5293d4ee0ecd_6f_psk", "AutoConnect=true\nIPv4.method=dhcp\n");
    const std::string file = root_.path("/var/lib/connman/ethernet_5293d4ee0eca_cable/settings");
    const NamePatterns usual{.taken = {},
                             .left = {"vmnet*", "vboxnet*", "virbr*", "ifb*", "ve-*", "vb-*"}};
    const auto read = [&] { return readWith(readConnman, root_, running(Client::Connman)); };
    EXPECT_THAT(read().managements, ElementsAre(LinkConfiguration{.client = Client::Connman,
                                                                  .hardwareAddress = "5293d4ee0eca",
                                                                  .names = usual,
                                                                  .dhcp4 = true,
                                                                  .dhcp6 = {},
                                                                  .staticAddresses = {},
                                                                  .origin = file}));
    root_.write("/proc/7/cmdline", std::string{"connmand\0-n\0-i\0eth1,eth2\0", 26});
    root_.write("/etc/connman/main.conf", "[General]\nNetworkInterfaceBlacklist=eth2\n");
    EXPECT_EQ(read().managements.at(0).names,
              (NamePatterns{.taken = {"eth1", "eth2"}, .left = {"eth2*"}}));
    root_.write("/var/lib/connman/settings", "[WiFi]\nEnable=true\n[Wired]\nEnable=false\n");
    EXPECT_THAT(read().managements, IsEmpty());
}

TEST(ConnmanCommandLine, TellsWhichLinksItTakes) {
    const auto links = [](std::string text) {
        std::replace(text.begin(), text.end(), ' ', '\0');
        return connmanLinks(text);
    };
    EXPECT_EQ(links("connmand -n "), NamePatterns{});
    for (const char* const line :
         {"connmand -i eth* -I eth2 ", "connmand -ieth* -Ieth2",
          "connmand --nodevice=eth2 --device=eth*", "connmand --device eth* --nodevice eth2 "}) {
        EXPECT_EQ(links(line), (NamePatterns{.taken = {"eth*"}, .left = {"eth2"}})) << line;
    }
    EXPECT_EQ(links("connmand -i ,eth1,,eth2,"),
              (NamePatterns{.taken = {"eth1", "eth2"}, .left = {}}));
    EXPECT_EQ(links("connmand -i"), NamePatterns{});
    EXPECT_EQ(links(""), NamePatterns{});
}

TEST(NamesOfLinks, AreTakenByPatternsUnlessTheyAreLeft) {
    EXPECT_TRUE(NamePatterns{}.take("eth1"_name));
    const NamePatterns patterns{.taken = {"eth?", "en*"}, .left = {"eth2"}};
    EXPECT_TRUE(patterns.take("eth1"_name));
    EXPECT_TRUE(patterns.take("enp3s0"_name));
    EXPECT_FALSE(patterns.take("eth2"_name));
    EXPECT_FALSE(patterns.take("eth10"_name));
}

TEST_F(ConnmanTest, WhatItLeftWhenItEndedProvesNothing) {
    write("ethernet_1_cable", "IPv4.method=dhcp\nIPv4.DHCP.LastAddress=198.51.100.7\n");
    EXPECT_EQ(readWith(readConnman, root_), ClientFacts{});
}

/// What one service in a state says, with the properties IPv4 and IPv4.Configuration.
ClientFacts say(const std::string& state, const std::string& ipv4,
                const std::string& configuration) {
    ClientFacts facts = running(Client::Connman);
    EXPECT_EQ(addConnmanServices(R"([["/s",{"State":")" + state +
                                     R"(","Ethernet":{"Interface":"eth1"},"IPv4":)" + ipv4 +
                                     R"(,"IPv4.Configuration":)" + configuration + "}]]",
                                 facts),
              "");
    return facts;
}

TEST(ConnmanServices, CapturedWhileItAsks) {
    ClientFacts facts = running(Client::Connman);
    EXPECT_EQ(addConnmanServices(sample("connman/services-asking.json"), facts), "");
    EXPECT_THAT(facts.managements, ElementsAre(LinkConfiguration{.client = Client::Connman,
                                                                 .interfaceName = "eth1"_name,
                                                                 .dhcp4 = true,
                                                                 .dhcp6 = {},
                                                                 .staticAddresses = {},
                                                                 .origin = "D-Bus net.connman"}));
    EXPECT_THAT(facts.leases, IsEmpty());
}

TEST(ConnmanServices, AnAddressThatItGotIsALease) {
    const ClientFacts facts =
        say("ready", R"({"Method":"dhcp","Address":"198.51.100.7"})", R"({"Method":"dhcp"})");
    EXPECT_EQ(facts.managements.at(0).dhcp4, true);
    EXPECT_THAT(facts.leases, ElementsAre(Lease{.client = Client::Connman,
                                                .interfaceName = "eth1"_name,
                                                .address = "198.51.100.7"_ip,
                                                .server = {},
                                                .clientAlive = true,
                                                .expires = {},
                                                .pid = 7,
                                                .origin = "D-Bus net.connman"}));
}

TEST(ConnmanServices, OneThatItGaveItselfIsNotALease) {
    const ClientFacts facts =
        say("ready", R"({"Method":"auto","Address":"169.254.3.7"})", R"({"Method":"dhcp"})");
    EXPECT_EQ(facts.managements.at(0).dhcp4, true);
    EXPECT_THAT(facts.leases, IsEmpty());
}

TEST(ConnmanServices, AnAddressThatItWasToldIsStatic) {
    const ClientFacts facts =
        say("online", R"({"Method":"manual","Address":"192.0.2.7"})", R"({"Method":"manual"})");
    EXPECT_EQ(facts.managements.at(0).dhcp4, false);
    EXPECT_THAT(facts.managements.at(0).staticAddresses, ElementsAre("192.0.2.7"_ip));
    EXPECT_THAT(facts.leases, IsEmpty());
}

TEST(ConnmanServices, WhatItDoesNotUseIsNotUnderDhcp) {
    EXPECT_THAT(say("idle", "{}", R"({"Method":"dhcp"})").managements, IsEmpty());
    EXPECT_EQ(say("failure", "{}", R"({"Method":"dhcp"})").managements.size(), 1U);
    EXPECT_EQ(say("configuration", "{}", R"({"Method":"new"})").managements.at(0).dhcp4,
              std::nullopt);
}

TEST(ConnmanServices, TheyStandInPlaceOfTheAddressesInItsFiles) {
    ClientFacts facts = running(Client::Connman);
    facts.leases = {{.client = Client::Connman,
                     .interfaceName = {},
                     .address = "198.51.100.7"_ip,
                     .server = {},
                     .expires = {}}};
    EXPECT_EQ(addConnmanServices("[]", facts), "");
    EXPECT_THAT(facts.leases, IsEmpty());
}

TEST(ConnmanServices, AnyTextGivesFactsOrAReason) {
    ClientFacts facts;
    for (const char* text : {"", "{}", "7", "[["}) {
        EXPECT_EQ(addConnmanServices(text, facts), "not an array of services") << text;
    }
    for (const char* text :
         {"[]", "[7,[],[1],[1,2],[1,{}]]", R"([["/s",{"State":"ready","Ethernet":7}]])",
          R"([["/s",{"State":"ready","Ethernet":{"Interface":"a/b"}}]])"}) {
        EXPECT_EQ(addConnmanServices(text, facts), "") << text;
    }
    EXPECT_EQ(facts, ClientFacts{});
}

}  // namespace
}  // namespace ZR::Live
