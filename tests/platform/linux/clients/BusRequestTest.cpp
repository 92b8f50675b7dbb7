#include "clients/BusRequest.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "FakeBus.h"
#include "LinuxSupport.h"
#include "clients/ManagerBuses.h"
#include "clients/NetworkdBus.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr BusMethod method() {
    return {.path = "/p", .interface = "a.b", .name = "Get"};
}

BusRequests::Deadline soon() {
    // Far more than a request takes, and less than a test may.
    return std::chrono::steady_clock::now() + std::chrono::seconds{5};
}

/// What a program says that responds with a message of these types and values.
template <typename... Values>
nlohmann::json said(const char* types, Values... values) {
    const FakeBus bus{[&](sd_bus_message* request) {
        return sd_bus_reply_method_return(request, types, values...);
    }};
    BusRequests requests{"it", "a.b", soon()};
    const auto value = requests.call(method());
    EXPECT_EQ(requests.failure(), "");
    return value.value_or("no response");
}

TEST(BusRequests, AllTypesOfValuesBecomeJson) {
    EXPECT_EQ(said("s", "text"), "text");
    EXPECT_EQ(said("o", "/an/object"), "/an/object");
    EXPECT_EQ(said("g", "a{sv}"), "a{sv}");
    EXPECT_EQ(said("b", 1), true);
    EXPECT_EQ(said("y", 255), 255);
    EXPECT_EQ(said("n", -2), -2);
    EXPECT_EQ(said("q", 65'535), 65'535);
    EXPECT_EQ(said("i", -7), -7);
    EXPECT_EQ(said("u", 4'000'000'000U), 4'000'000'000U);
    EXPECT_EQ(said("x", std::int64_t{-1} << 40), std::int64_t{-1} << 40);
    EXPECT_EQ(said("t", UINT64_MAX), UINT64_MAX);
    EXPECT_EQ(said("d", 0.5), 0.5);
    EXPECT_EQ(said("ay", 2, 7, 8).dump(), "[7,8]");
    EXPECT_EQ(said("as", 0).dump(), "[]");
    EXPECT_EQ(said("(sv)", "a", "u", 7U).dump(), R"(["a",7])");
    EXPECT_EQ(said("a{sv}", 2, "a", "s", "b", "c", "as", 1, "d").dump(), R"({"a":"b","c":["d"]})");
    EXPECT_EQ(said("a{us}", 1, 7U, "b").dump(), R"({"7":"b"})");
    EXPECT_EQ(said("a{oa{sa{sv}}}", 1, "/o", 1, "i", 1, "p", "b", 0).dump(),
              R"({"/o":{"i":{"p":false}}})");
    EXPECT_EQ(said("st", "the first of two", UINT64_MAX), "the first of two");
    EXPECT_EQ(said(""), "no response");
}

TEST(BusRequests, AnArgumentGoesWithTheRequest) {
    const FakeBus bus{[](sd_bus_message* request) {
        std::uint32_t argument = 0;
        EXPECT_GT(sd_bus_message_read(request, "u", &argument), 0);
        EXPECT_EQ(sd_bus_message_get_auto_start(request), 0);
        return sd_bus_reply_method_return(request, "u", argument + 1);
    }};
    BusRequests requests{"it", "a.b", soon()};
    BusMethod request = method();
    request.argument = 41;
    EXPECT_EQ(requests.call(request), 42);
}

/// The failure after a program's own error of a name, where one such means nothing.
std::string failureAfter(const char* error) {
    const FakeBus bus{[&](sd_bus_message* request) {
        return sd_bus_reply_method_errorf(request, error, "text");
    }};
    BusRequests requests{"it", "a.b", soon()};
    BusMethod request = method();
    request.nothing = "a.b.None";
    EXPECT_EQ(requests.call(request), std::nullopt);
    return requests.failure();
}

TEST(BusRequests, WhatIsNotThereIsNotAFailure) {
    for (const char* error :
         {SD_BUS_ERROR_SERVICE_UNKNOWN, SD_BUS_ERROR_NAME_HAS_NO_OWNER, SD_BUS_ERROR_UNKNOWN_METHOD,
          SD_BUS_ERROR_UNKNOWN_OBJECT, SD_BUS_ERROR_UNKNOWN_INTERFACE, "a.b.None"}) {
        EXPECT_EQ(failureAfter(error), "") << error;
    }
    EXPECT_EQ(failureAfter(SD_BUS_ERROR_ACCESS_DENIED), "it cannot be asked: Permission denied");
}

TEST(BusRequests, AProgramThatDoesNotRespondIsNotWaitedForBeyondTheDeadline) {
    const FakeBus bus{[](sd_bus_message* /*request*/) { return 0; }};
    const auto start = std::chrono::steady_clock::now();
    BusRequests requests{"it", "a.b", start + std::chrono::milliseconds{300}};
    EXPECT_EQ(requests.call(method()), std::nullopt);
    EXPECT_EQ(requests.failure(), "it cannot be asked: Connection timed out");
    EXPECT_EQ(requests.call(method()), std::nullopt) << "nor a second time";
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds{4});
}

TEST(AskConnman, ItsServicesAreRead) {
    const FakeBus bus{[](sd_bus_message* request) {
        EXPECT_GT(sd_bus_message_is_method_call(request, "net.connman.Manager", "GetServices"), 0);
        EXPECT_STREQ(sd_bus_message_get_path(request), "/");
        return sd_bus_reply_method_return(
            request, "a(oa{sv})", 1, "/net/connman/service/ethernet_1_cable", 4,  //
            "State", "s", "configuration",                                        //
            "Ethernet", "a{sv}", 2, "Interface", "s", "eth1", "MTU", "q", 1500,   //
            "IPv4", "a{sv}", 0,                                                   //
            "IPv4.Configuration", "a{sv}", 1, "Method", "s", "dhcp");
    }};
    const BusResponse response = askConnman(soon());
    EXPECT_EQ(response.reason, "");
    ClientFacts facts = running(Client::Connman);
    EXPECT_EQ(addConnmanServices(response.json, facts), "");
    ASSERT_EQ(facts.managements.size(), 1U);
    EXPECT_EQ(facts.managements[0].interfaceName, "eth1"_name);
    EXPECT_EQ(facts.managements[0].dhcp4, true);
}

TEST(AskNetworkd, ItsDescriptionIsAText) {
    const FakeBus bus{[](sd_bus_message* request) {
        return sd_bus_reply_method_return(request, "s", R"({"Interfaces":[]})");
    }};
    EXPECT_EQ(askNetworkd(soon()), (BusResponse{.json = R"({"Interfaces":[]})", .reason = {}}));
}

constexpr const char* deviceInterface = "org.freedesktop.NetworkManager.Device";

/// A NetworkManager with one device that asks for a lease; what it responds when it is asked
/// what it has applied to the device.
BusResponse networkManager(const std::function<int(sd_bus_message*)>& applied) {
    const FakeBus bus{[&](sd_bus_message* request) {
        if (sd_bus_message_is_method_call(request, deviceInterface, "GetAppliedConnection") > 0) {
            EXPECT_STREQ(sd_bus_message_get_path(request), "/d");
            return applied(request);
        }
        EXPECT_STREQ(sd_bus_message_get_path(request), "/org/freedesktop");
        return sd_bus_reply_method_return(request, "a{oa{sa{sv}}}", 2,                            //
                                          "/s", 1, "org.freedesktop.NetworkManager.Settings", 0,  //
                                          "/d", 1, deviceInterface, 3, "Interface", "s", "eth1",  //
                                          "Managed", "b", 1, "State", "u", 70U);
    }};
    return askNetworkManager(soon());
}

TEST(AskNetworkManager, ItsDevicesAndWhatItHasAppliedToThem) {
    const BusResponse response = networkManager([](sd_bus_message* request) {
        return sd_bus_reply_method_return(request, "a{sa{sv}}t", 2,         //
                                          "connection", 1, "id", "s", "x",  //
                                          "ipv4", 1, "method", "s", "auto", std::uint64_t{3});
    });
    EXPECT_EQ(response.reason, "");
    EXPECT_EQ(response.json.find("Settings"), std::string::npos) << response.json;
    EXPECT_EQ(response.json.find("connection"), std::string::npos) << response.json;
    ClientFacts facts = running(Client::NetworkManager);
    EXPECT_EQ(addNetworkManagerDescription(response.json, facts), "");
    ASSERT_EQ(facts.managements.size(), 1U);
    EXPECT_EQ(facts.managements[0].dhcp4, true);
}

TEST(AskNetworkManager, ADeviceMayLoseItsConnectionMeanwhile) {
    const BusResponse response = networkManager([](sd_bus_message* request) {
        return sd_bus_reply_method_errorf(
            request, "org.freedesktop.NetworkManager.Device.NotActive", "not activated");
    });
    EXPECT_EQ(response.reason, "");
    ClientFacts facts = running(Client::NetworkManager);
    EXPECT_EQ(addNetworkManagerDescription(response.json, facts), "");
    ASSERT_EQ(facts.managements.size(), 1U);
    EXPECT_EQ(facts.managements[0].dhcp4, std::nullopt);
}

TEST(AskNetworkManager, HalfOfWhatItSaysIsNotUsed) {
    const BusResponse response = networkManager([](sd_bus_message* /*request*/) { return -EIO; });
    EXPECT_EQ(response.json, "");
    EXPECT_EQ(response.reason, "NetworkManager cannot be asked: Input/output error");
}

}  // namespace
}  // namespace ZR::Live
