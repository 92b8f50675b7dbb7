#include "clients/ConnmanBus.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

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
