#include "MachineFacts.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "kit/HostNameFake.h"
#include "kit/Tree.h"

namespace {

using test::computer;
using test::dhcpInterface;
using test::host;
using test::interface;
using test::Json;
using test::serviceProcessor;
using test::staticInterface;
using ZR::DHCPClientNeighbours::ComputerFacts;
using ZR::DHCPClientNeighbours::InterfaceFacts;
using ZR::DHCPClientNeighbours::readComputers;
using ZR::DHCPClientNeighbours::readInterfaces;

class MachineFactsTest : public test::TreeTest {};

TEST_F(MachineFactsTest, EmptyMachineHasNeitherComputersNorInterfaces) {
    EXPECT_EQ(readComputers(), std::vector<ComputerFacts>{});
    EXPECT_EQ(readInterfaces(), std::vector<InterfaceFacts>{});
}

TEST_F(MachineFactsTest, ComputersAreToldInTheOrderOfTheTree) {
    setTree({serviceProcessor({}), host({}), computer("Computer", "third", {})});
    EXPECT_EQ(readComputers(), (std::vector<ComputerFacts>{
                                   {"BMC:-1", true}, {hostName(), false}, {"third", false}}));
}

TEST_F(MachineFactsTest, OnlyTheExactDescriptionMakesAServiceProcessor) {
    setTree({computer("bmc", "a", {}), computer("BMC ", "b", {}), computer("BMC", "c", {})});
    EXPECT_EQ(readComputers(),
              (std::vector<ComputerFacts>{{"a", false}, {"b", false}, {"c", true}}));
}

TEST_F(MachineFactsTest, ComputerWithoutAReadableNameIsLeftOut) {
    setTree({{{"type", "ComputerSystem"}, {"description", "Computer"}}, host({})});
    EXPECT_EQ(readComputers(), (std::vector<ComputerFacts>{{hostName(), false}}));
}

TEST_F(MachineFactsTest, InterfacesBelongToTheComputerTwoLevelsAbove) {
    setTree({host({staticInterface("eth0")}), serviceProcessor({dhcpInterface("bmc0")})});
    EXPECT_EQ(readInterfaces(), (std::vector<InterfaceFacts>{{"eth0", hostName(), false, "", 3},
                                                             {"bmc0", "BMC:-1", true, "", 1}}));
}

TEST_F(MachineFactsTest, AddressAndItsSourceAreToldAsFarAsTheyCanBeRead) {
    setTree({host({interface("all", {{"IPv4Address", "192.0.2.1"}, {"AddressSource", 4}}),
                   interface("none"),
                   interface("unreadable", {{"IPv4Address", 5}, {"AddressSource", "DHCP"}})})});
    EXPECT_EQ(readInterfaces(),
              (std::vector<InterfaceFacts>{{"all", hostName(), false, "192.0.2.1", 4},
                                           {"none", hostName(), false, "", 0},
                                           {"unreadable", hostName(), false, "", 0}}));
}

TEST_F(MachineFactsTest, InterfaceWithoutAReadableNameIsLeftOut) {
    setTree({host(
        {{{"type", "NetworkInterface"}, {"description", "nameless"}}, staticInterface("eth0")})});
    EXPECT_EQ(readInterfaces(), (std::vector<InterfaceFacts>{{"eth0", hostName(), false, "", 3}}));
}

TEST_F(MachineFactsTest, MachineThatDoesNotTellItsNameIsLeftOutButNotItsInterfaces) {
    setTree({host({staticInterface("eth0")}), serviceProcessor({dhcpInterface("bmc0")})});
    const ZR::Testing::HostNameFails failing;
    EXPECT_EQ(readComputers(), (std::vector<ComputerFacts>{{"BMC:-1", true}}));
    EXPECT_EQ(readInterfaces(), (std::vector<InterfaceFacts>{{"eth0", "", false, "", 3},
                                                             {"bmc0", "BMC:-1", true, "", 1}}));
}

TEST_F(MachineFactsTest, InterfaceWithNothingAboveIsTheHosts) {
    setTree({interface("eth0")});
    EXPECT_EQ(readInterfaces(), (std::vector<InterfaceFacts>{{"eth0", hostName(), false, "", 0}}));
}

}  // namespace
