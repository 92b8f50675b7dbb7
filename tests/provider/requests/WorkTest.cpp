// The work of each request, counted: nodes that cursors were placed on, and calls of
// the broker. Counts are exact, so that work that grows faster than it must shows.
//
// The source of a request, where it has one, is the last of N interfaces, each of
// which has DHCP, one server and an address.

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <ostream>
#include <string>
#include <vector>

#include "Requests.h"
#include "kit/Sanitizers.h"
#include "kit/Tree.h"
#include "zrclient/Instrumentation.h"

namespace {

using test::Host;
using test::Request;

/// A count by the number N of interfaces: constant + linear N + pairs N (N - 1) / 2.
/// Pairs come of a walk, on which clients rely, from the first interface to the Nth, for each of N.
struct Growth {
    std::uint64_t constant = 0;
    std::uint64_t linear = 0;
    std::uint64_t pairs = 0;

    [[nodiscard]] std::uint64_t at(std::uint64_t n) const {
        return constant + linear * n + pairs * (n * (n - 1) / 2);
    }
};

struct Work {
    const char* request;
    Growth objects;
    Growth visits;
    Growth calls;
};

// An endpoint's system is two visits, its parent and the node above; the name and the
// class of the system are asked once for a path and once more for an instance.
const std::vector<Work> expectedWork{
    {"namesOfDHCPProtocolEndpoint", {0, 1}, {0, 5}, {6, 10}},
    {"instancesOfDHCPProtocolEndpoint", {0, 1}, {0, 9}, {6, 36}},
    {"getOfDHCPProtocolEndpoint", {1}, {12, 3}, {62}},
    {"namesOfDHCPCapabilities", {0, 1}, {0, 1}, {6, 4}},
    {"instancesOfDHCPCapabilities", {0, 1}, {0, 1}, {6, 16}},
    {"getOfDHCPCapabilities", {1}, {0, 1}, {27}},
    {"namesOfDHCPSettingData", {0, 1}, {0, 3}, {5, 4}},
    {"instancesOfDHCPSettingData", {0, 1}, {0, 5}, {5, 12}},
    {"getOfDHCPSettingData", {1}, {4, 3}, {22}},
    {"namesOfDHCPRemoteServiceAccessPoint", {0, 1}, {0, 3}, {5, 10}},
    {"instancesOfDHCPRemoteServiceAccessPoint", {0, 1}, {0, 5}, {5, 25}},
    {"getOfDHCPRemoteServiceAccessPoint", {0, 1}, {0, 5}, {25, 25}},
    {"modifyOfDHCPSettingData", {0}, {0, 3}, {15}},
    {"namesOfHostedDHCPPoint", {0, 1}, {5, 5}, {47, 15}},
    {"instancesOfHostedDHCPPoint", {0, 1}, {5, 5}, {46, 26}},
    {"getOfHostedDHCPPoint", {0}, {0}, {2}},
    {"associatornamesOfComputerSystemThroughHostedDHCPPoint", {0, 1}, {1, 7}, {37, 10}},
    {"associatorsOfComputerSystemThroughHostedDHCPPoint", {0, 1}, {1, 11}, {37, 36}},
    {"referencenamesOfComputerSystemThroughHostedDHCPPoint", {0, 1}, {1, 7}, {35, 14}},
    {"referencesOfComputerSystemThroughHostedDHCPPoint", {0, 1}, {1, 7}, {35, 25}},
    {"associatornamesOfDHCPProtocolEndpointThroughHostedDHCPPoint", {1}, {5, 3}, {61}},
    {"associatorsOfDHCPProtocolEndpointThroughHostedDHCPPoint", {1}, {5, 3}, {60}},
    {"referencenamesOfDHCPProtocolEndpointThroughHostedDHCPPoint", {1}, {9, 3}, {71}},
    {"referencesOfDHCPProtocolEndpointThroughHostedDHCPPoint", {1}, {9, 3}, {82}},
    {"namesOfSAPSAPDependency", {0, 1}, {4, 5}, {20, 45}},
    {"instancesOfSAPSAPDependency", {0, 1}, {4, 5}, {20, 56}},
    {"getOfSAPSAPDependency", {0}, {0}, {2}},
    {"associatornamesOfIPProtocolEndpointThroughSAPSAPDependency", {1}, {8, 6}, {61}},
    {"associatorsOfIPProtocolEndpointThroughSAPSAPDependency", {1}, {12, 6}, {87}},
    {"referencenamesOfIPProtocolEndpointThroughSAPSAPDependency", {1}, {8, 6}, {94}},
    {"referencesOfIPProtocolEndpointThroughSAPSAPDependency", {1}, {8, 6}, {105}},
    {"associatornamesOfDHCPProtocolEndpointThroughSAPSAPDependency", {1}, {4, 3}, {63}},
    {"associatorsOfDHCPProtocolEndpointThroughSAPSAPDependency", {1}, {4, 3}, {62}},
    {"referencenamesOfDHCPProtocolEndpointThroughSAPSAPDependency", {1}, {8, 3}, {104}},
    {"referencesOfDHCPProtocolEndpointThroughSAPSAPDependency", {1}, {8, 3}, {115}},
    {"namesOfDHCPElementCapabilities", {0, 1}, {6, 6, 1}, {48, 39}},
    {"instancesOfDHCPElementCapabilities", {0, 1}, {6, 6, 1}, {47, 50}},
    {"getOfDHCPElementCapabilities", {0}, {0}, {2}},
    {"associatornamesOfDHCPProtocolEndpointThroughDHCPElementCapabilities", {1}, {4, 5}, {64}},
    {"associatorsOfDHCPProtocolEndpointThroughDHCPElementCapabilities", {1}, {4, 5}, {76}},
    {"referencenamesOfDHCPProtocolEndpointThroughDHCPElementCapabilities", {1}, {8, 6}, {97}},
    {"referencesOfDHCPProtocolEndpointThroughDHCPElementCapabilities", {1}, {8, 6}, {108}},
    {"associatornamesOfDHCPCapabilitiesThroughDHCPElementCapabilities", {1}, {5, 3}, {46}},
    {"associatorsOfDHCPCapabilitiesThroughDHCPElementCapabilities", {1}, {9, 3}, {72}},
    {"referencenamesOfDHCPCapabilitiesThroughDHCPElementCapabilities", {1}, {5, 4}, {73}},
    {"referencesOfDHCPCapabilitiesThroughDHCPElementCapabilities", {1}, {5, 4}, {84}},
    {"namesOfDHCPRemoteHostedAccessPoint", {0, 1}, {3, 3}, {44, 15}},
    {"instancesOfDHCPRemoteHostedAccessPoint", {0, 1}, {3, 3}, {44, 26}},
    {"getOfDHCPRemoteHostedAccessPoint", {0, 1}, {3, 3}, {44, 26}},
    {"associatornamesOfComputerSystemThroughDHCPRemoteHostedAccessPoint", {0, 1}, {1, 3}, {37, 10}},
    {"associatorsOfComputerSystemThroughDHCPRemoteHostedAccessPoint", {0, 1}, {1, 5}, {37, 25}},
    {"referencenamesOfComputerSystemThroughDHCPRemoteHostedAccessPoint", {0, 1}, {1, 3}, {35, 14}},
    {"referencesOfComputerSystemThroughDHCPRemoteHostedAccessPoint", {0, 1}, {1, 3}, {35, 25}},
    {"associatornamesOfDHCPRemoteServiceAccessPointThroughDHCPRemoteHostedAccessPoint",
     {1},
     {2},
     {61}},
    {"associatorsOfDHCPRemoteServiceAccessPointThroughDHCPRemoteHostedAccessPoint", {1}, {2}, {60}},
    {"referencenamesOfDHCPRemoteServiceAccessPointThroughDHCPRemoteHostedAccessPoint",
     {1},
     {4},
     {71}},
    {"referencesOfDHCPRemoteServiceAccessPointThroughDHCPRemoteHostedAccessPoint", {1}, {4}, {82}},
    {"namesOfDHCPRemoteAccessAvailableToElement", {0, 1}, {10, 4, 1}, {62, 45}},
    {"instancesOfDHCPRemoteAccessAvailableToElement", {0, 1}, {10, 4, 1}, {62, 57}},
    {"getOfDHCPRemoteAccessAvailableToElement", {0, 1}, {10, 4, 1}, {62, 57}},
    {"associatornamesOfDHCPRemoteServiceAccessPointThroughDHCPRemoteAccessAvailableToElement",
     {1},
     {9, 4},
     {85}},
    {"associatorsOfDHCPRemoteServiceAccessPointThroughDHCPRemoteAccessAvailableToElement",
     {1},
     {13, 4},
     {111}},
    {"referencenamesOfDHCPRemoteServiceAccessPointThroughDHCPRemoteAccessAvailableToElement",
     {1},
     {8, 4},
     {118}},
    {"referencesOfDHCPRemoteServiceAccessPointThroughDHCPRemoteAccessAvailableToElement",
     {1},
     {8, 4},
     {130}},
    {"associatornamesOfDHCPProtocolEndpointThroughDHCPRemoteAccessAvailableToElement",
     {0, 1},
     {4, 7},
     {63, 10}},
    {"associatorsOfDHCPProtocolEndpointThroughDHCPRemoteAccessAvailableToElement",
     {0, 1},
     {4, 9},
     {63, 25}},
    {"referencenamesOfDHCPProtocolEndpointThroughDHCPRemoteAccessAvailableToElement",
     {0, 1},
     {4, 8, 1},
     {61, 45}},
    {"referencesOfDHCPProtocolEndpointThroughDHCPRemoteAccessAvailableToElement",
     {0, 1},
     {4, 8, 1},
     {61, 57}},
    {"namesOfDHCPElementSettingData", {0, 1}, {14, 8, 1}, {45, 25}},
    {"instancesOfDHCPElementSettingData", {0, 1}, {14, 8, 1}, {45, 37}},
    {"getOfDHCPElementSettingData", {0, 1}, {14, 8, 1}, {45, 37}},
    {"associatornamesOfDHCPProtocolEndpointThroughDHCPElementSettingData", {1}, {6, 9}, {64}},
    {"associatorsOfDHCPProtocolEndpointThroughDHCPElementSettingData", {1}, {8, 9}, {72}},
    {"referencenamesOfDHCPProtocolEndpointThroughDHCPElementSettingData", {1}, {10, 10}, {83}},
    {"referencesOfDHCPProtocolEndpointThroughDHCPElementSettingData", {1}, {10, 10}, {95}},
    {"associatornamesOfDHCPSettingDataThroughDHCPElementSettingData", {1}, {12, 7}, {59}},
    {"associatorsOfDHCPSettingDataThroughDHCPElementSettingData", {1}, {16, 7}, {85}},
    {"referencenamesOfDHCPSettingDataThroughDHCPElementSettingData", {1}, {14, 8}, {72}},
    {"referencesOfDHCPSettingDataThroughDHCPElementSettingData", {1}, {14, 8}, {84}},
    {"namesOfDHCPOrderedComponent", {0, 1}, {0, 4, 1}, {14, 21}},
    {"instancesOfDHCPOrderedComponent", {0, 1}, {0, 4, 1}, {14, 33}},
    {"getOfDHCPOrderedComponent", {0, 1}, {0, 4, 1}, {14, 33}},
    {"associatornamesOfIPAssignmentSettingDataThroughDHCPOrderedComponent", {1}, {2, 6}, {32}},
    {"associatorsOfIPAssignmentSettingDataThroughDHCPOrderedComponent", {1}, {4, 6}, {40}},
    {"referencenamesOfIPAssignmentSettingDataThroughDHCPOrderedComponent", {1}, {2, 7}, {47}},
    {"referencesOfIPAssignmentSettingDataThroughDHCPOrderedComponent", {1}, {2, 7}, {59}},
    {"associatornamesOfDHCPSettingDataThroughDHCPOrderedComponent", {1}, {0, 4}, {30}},
    {"associatorsOfDHCPSettingDataThroughDHCPOrderedComponent", {1}, {0, 4}, {29}},
    {"referencenamesOfDHCPSettingDataThroughDHCPOrderedComponent", {1}, {2, 5}, {47}},
    {"referencesOfDHCPSettingDataThroughDHCPOrderedComponent", {1}, {2, 5}, {59}},
};

class WorkTest : public test::TreeTest, public ::testing::WithParamInterface<Request> {
  protected:
    static void setInterfaces(std::uint64_t count) {
        std::vector<test::Json> interfaces;
        for (std::uint64_t i = 0; i < count; ++i) {
            interfaces.push_back(test::dhcpInterface("eth" + std::to_string(i), {"192.0.2.1"}));
            interfaces.back()["properties"]["IPv4Address"] = "192.0.2.10";
        }
        setTree({test::host(interfaces)});
    }

    /// The request for the last interface instead of the first.
    static Request forTheLastOf(std::uint64_t count, Request request) {
        const std::string first = "eth0";
        if (const auto at = request.path.find(first); at != std::string::npos) {
            request.path.replace(at, first.size(), "eth" + std::to_string(count - 1));
        }
        return request;
    }

    Host host_{Host::Neighbours::served, Host::Calls::counted};
};

TEST_P(WorkTest, GrowsAsItsResponseAndTheWalksOfItsClientsDo) {
    const std::string identifier = GetParam().identifier();
    const auto expected =
        std::find_if(expectedWork.begin(), expectedWork.end(),
                     [&](const Work& work) { return identifier == work.request; });
    ASSERT_NE(expected, expectedWork.end()) << "no expected work for " << identifier;
    for (const std::uint64_t interfaces : {10U, 100U, 1000U}) {
        if (interfaces == 1000 && ZR::Testing::sanitized) {
            break;  // a million visits, each checked, show nothing more than ten thousand
        }
        SCOPED_TRACE(std::to_string(interfaces) + " interfaces");
        setInterfaces(interfaces);
        const std::uint64_t before = ZR::Instrumentation::nodeVisits();
        const Host::Response response = run(host_, forTheLastOf(interfaces, GetParam()));
        const std::uint64_t visits = ZR::Instrumentation::nodeVisits() - before;
        EXPECT_EQ(response.paths.size() + response.instances.size(),
                  expected->objects.at(interfaces));
        EXPECT_EQ(visits, expected->visits.at(interfaces));
        EXPECT_EQ(host_.counted().calls(), expected->calls.at(interfaces));
    }
}

INSTANTIATE_TEST_SUITE_P(All, WorkTest, ::testing::ValuesIn(test::allRequests()),
                         [](const auto& each) { return each.param.identifier(); });

}  // namespace
