#include "clients/NetworkManagerBus.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

ClientFacts say(const std::string& json, ClientFacts facts = running(Client::NetworkManager)) {
    EXPECT_EQ(addNetworkManagerDescription(json, facts), "");
    return facts;
}
ClientFacts captured(const std::string& state) {
    return say(sample("networkmanager-bus/" + state + ".json"));
}

LinkConfiguration management(std::optional<bool> dhcp4, std::optional<bool> dhcp6) {
    return {.client = Client::NetworkManager,
            .interfaceName = "eth1"_name,
            .dhcp4 = dhcp4,
            .dhcp6 = dhcp6,
            .staticAddresses = {},
            .origin = "D-Bus org.freedesktop.NetworkManager"};
}

/// One device in a state, with a method of IPv4 that was applied to it.
std::string device(unsigned state, const std::string& method, const std::string& more = "") {
    return R"({"objects":{"/d":{"org.freedesktop.NetworkManager.Device":{"Interface":"eth1",)"
           R"("Managed":true,"State":)" +
           std::to_string(state) + more + R"(}}},"applied":{"/d":{"ipv4":{"method":")" + method +
           R"(","address-data":[{"address":"192.0.2.7","prefix":24}]}}}})";
}

TEST(NetworkManagerDescription, CapturedWithLeases) {
    const ClientFacts facts = captured("bound");
    EXPECT_THAT(facts.managements, ElementsAre(management(true, true)));
    const Lease lease4{.client = Client::NetworkManager,
                       .interfaceName = "eth1"_name,
                       .address = "198.51.100.110"_ip,
                       .server = "198.51.100.1"_ip,
                       .clientAlive = true,
                       .expires = 1'795'321'563,
                       .obtained = 1'795'320'963,
                       .options = {1, 3, 12, 28, 51, 54},
                       .clientIdentifier = "01:d2:e3:ee:9c:52:73",
                       .pid = 7,
                       .origin = "D-Bus org.freedesktop.NetworkManager"};
    const Lease lease6{.client = Client::NetworkManager,
                       .interfaceName = "eth1"_name,
                       .address = "2001:db8:99::151"_ip,
                       .server = {},
                       .clientAlive = true,
                       .expires = {},
                       .options = {1, 3, 39},
                       .clientIdentifier = "00:04:33:e8:7c:10:b6:ad:ca:84:2d:29:a2:c5:ad:73:f3:86",
                       .pid = 7,
                       .origin = "D-Bus org.freedesktop.NetworkManager"};
    EXPECT_THAT(facts.leases, ElementsAre(lease4, lease6));
}

TEST(NetworkManagerDescription, CapturedWhileItAsks) {
    const ClientFacts facts = captured("asking");
    EXPECT_THAT(facts.managements, ElementsAre(management(true, std::nullopt)));
    EXPECT_THAT(facts.leases, IsEmpty());
}

TEST(NetworkManagerDescription, CapturedWithoutAConnectionAndUnmanaged) {
    for (const char* state : {"down", "unmanaged"}) {
        EXPECT_THAT(captured(state).managements, IsEmpty()) << state;
        EXPECT_THAT(captured(state).leases, IsEmpty()) << state;
    }
}

TEST(NetworkManagerDescription, WhatWasAppliedTells) {
    const LinkConfiguration manual = say(device(100, "manual")).managements.at(0);
    EXPECT_EQ(manual.dhcp4, false);
    EXPECT_THAT(manual.staticAddresses, ElementsAre("192.0.2.7"_ip));
    EXPECT_EQ(say(device(70, "auto")).managements.at(0).dhcp4, true);
    EXPECT_TRUE(say(device(100, "shared")).managements.at(0).other4);
    EXPECT_EQ(say(device(100, "")).managements.at(0).dhcp4, std::nullopt);
    // Where that may not be known, its client does.
    EXPECT_EQ(say(device(100, "", R"(,"Dhcp4Config":"/c")")).managements.at(0).dhcp4, true);
    EXPECT_EQ(say(device(100, "", R"(,"Dhcp4Config":"/")")).managements.at(0).dhcp4, std::nullopt);
}

TEST(NetworkManagerDescription, OnlyADeviceWithAConnectionIsManaged) {
    for (const unsigned state : {10U, 20U, 30U, 110U, 120U}) {
        EXPECT_THAT(say(device(state, "auto")).managements, IsEmpty()) << state;
    }
    for (const unsigned state : {40U, 70U, 100U}) {
        EXPECT_EQ(say(device(state, "auto")).managements.size(), 1U) << state;
    }
}

TEST(NetworkManagerDescription, ItStandsInPlaceOfItsFiles) {
    ClientFacts facts = running(Client::NetworkManager);
    facts.managements = {{.client = Client::NetworkManager,
                          .ifindex = 2,
                          .dhcp4 = true,
                          .dhcp6 = {},
                          .staticAddresses = {}}};
    facts.leases = {{.client = Client::NetworkManager,
                     .interfaceName = {},
                     .ifindex = 2,
                     .address = "192.0.2.7"_ip,
                     .server = {},
                     .expires = {}}};
    ClientFacts unused = facts;
    EXPECT_EQ(addNetworkManagerDescription("[]", unused), "not an object with objects");
    EXPECT_EQ(unused, facts);
    facts = say(R"({"objects":{}})", facts);
    EXPECT_THAT(facts.managements, IsEmpty());
    EXPECT_THAT(facts.leases, IsEmpty());
}

TEST(NetworkManagerDescription, AnyTextGivesFactsOrAReason) {
    ClientFacts facts;
    for (const char* text : {"", "7", "{", "{}", R"({"objects":[]})"}) {
        EXPECT_NE(addNetworkManagerDescription(text, facts), "") << text;
    }
    for (const char* text :
         {R"({"objects":{"/d":7,"/e":{"org.freedesktop.NetworkManager.Device":[]}}})",
          R"({"objects":{"/d":{"org.freedesktop.NetworkManager.Device":{"Interface":"a b",)"
          R"("Managed":true,"State":100}}}})",
          R"({"objects":{"/d":{"org.freedesktop.NetworkManager.Device":{"Interface":"eth1",)"
          R"("Managed":"true","State":"100"}}}})"}) {
        EXPECT_EQ(addNetworkManagerDescription(text, facts), "") << text;
    }
    EXPECT_EQ(facts, ClientFacts{});
}

}  // namespace
}  // namespace ZR::Live
