// Every association, asked in each of the four ways from each kind of source, on one
// machine. What a walk yields is sometimes odd, and known to clients as it is:
//  - an interface without DHCP in a filtered walk lets the next one through unfiltered;
//  - a name filter rejects no access point of an interface without "_" in its name;
//  - an end that is not walked stands on its first object when no key narrows it;
//  - an association path as source has no far end: each step is told as a failure.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <ostream>
#include <string>
#include <vector>

#include "cimom/ClassDeclaration.h"
#include "cimom/Instance.h"
#include "kit/AssociationMachine.h"
#include "kit/LogCapture.h"

namespace {

using test::briefs;
using test::endPath;
using test::Host;
using test::ofHost;
using test::pathFrom;
using test::Texts;
using ZR::Testing::LogCapture;

constexpr const char* nothingToDeliver = "The broker made no object; it is left out of the result";

struct Cell {
    const char* name;
    const char* association;
    std::string source;
    Texts associators;
    Texts references;
    unsigned steps = 0;             ///< of an associator walk that yields nothing
    const char* failure = nullptr;  ///< what ends the walk over the references
};

std::ostream& operator<<(std::ostream& out, const Cell& cell) {
    return out << cell.association << ' ' << cell.name;
}

class AssociationCells : public test::MachineTest, public ::testing::WithParamInterface<Cell> {
  protected:
    static Texts failuresOf(const LogCapture& log) {
        Texts texts;
        for (const std::string& message : log.logMessages()) {
            texts.push_back(message.substr(message.find("]: ") + 3));
        }
        return texts;
    }

    /// Names and instances are the same objects; each is told when it cannot be.
    void expectAssociators(const Host::Response& response, const LogCapture& log) const {
        EXPECT_EQ(response.code, CMPI_RC_OK);
        EXPECT_FALSE(response.hasMessage);
        EXPECT_EQ(briefs(response), ofHost(GetParam().associators));
        EXPECT_EQ(response.returnDoneCalls, 1U);
        EXPECT_EQ(failuresOf(log), Texts(GetParam().steps, nothingToDeliver));
    }

    void expectReferences(const Host::Response& response) const {
        EXPECT_EQ(response.code, CMPI_RC_OK);
        EXPECT_FALSE(response.hasMessage);
        EXPECT_EQ(briefs(response), ofHost(GetParam().references));
        EXPECT_EQ(response.returnDoneCalls, GetParam().failure == nullptr ? 1U : 0U);
    }

    Host host_{Host::Neighbours::served};
    cimom::ObjectPath source_ = pathFrom(GetParam().source);
};

TEST_P(AssociationCells, AssociatorNames) {
    const LogCapture log(6000, 6000);
    expectAssociators(host_.associatorNames(source_, GetParam().association), log);
}

TEST_P(AssociationCells, Associators) {
    const LogCapture log(6000, 6000);
    expectAssociators(host_.associators(source_, GetParam().association), log);
}

TEST_P(AssociationCells, FarEndsGoByTheirClassAndByTheStandardOne) {
    const Host::Response all = host_.associatorNames(source_, GetParam().association);
    if (all.paths.empty()) {
        EXPECT_EQ(GetParam().associators, Texts{});
        return;
    }
    ASSERT_TRUE(all.paths.front());
    const std::string farClass = all.paths.front()->className;
    // That of the same stem, where there is one.
    std::string standard = "CIM" + farClass.substr(farClass.find('_'));
    if (host_.repository().find(standard) == nullptr) {
        standard = host_.repository().find(farClass)->superclass;
    }
    for (const std::string& wanted : {farClass, standard}) {
        EXPECT_EQ(briefs(host_.associatorNames(source_, GetParam().association, wanted.c_str())),
                  ofHost(GetParam().associators))
            << wanted;
    }
    for (const std::string& wanted : {farClass + '~', standard + '~'}) {
        EXPECT_EQ(briefs(host_.associatorNames(source_, GetParam().association, wanted.c_str())),
                  Texts{})
            << wanted;
    }
}

TEST_P(AssociationCells, ReferenceNames) {
    const LogCapture log(6000, 6000);
    expectReferences(host_.referenceNames(source_, GetParam().association));
    EXPECT_EQ(failuresOf(log), Texts{});
}

TEST_P(AssociationCells, References) {
    const LogCapture log(6000, 6000);
    expectReferences(host_.references(source_, GetParam().association));
    EXPECT_EQ(failuresOf(log), GetParam().failure == nullptr ? Texts{} : Texts{GetParam().failure});
}

// Sources.

const std::string computer = endPath("QVXZR_ComputerSystem", "eth1");
const std::string eth1 = endPath("QVXZR_DHCPProtocolEndpoint", "eth1");
const std::string ipEth1 = endPath("QVXZR_IPProtocolEndpoint", "eth1");
const std::string server = endPath("QVXZR_DHCPRemoteServiceAccessPoint", "eth1");
const std::string capabilities = endPath("QVXZR_DHCPCapabilities", "eth1");
const std::string setting = endPath("QVXZR_DHCPSettingData", "eth1");
const std::string assignment = endPath("QVXZR_IPAssignmentSettingData", "eth1");
constexpr const char* keylessComputer = "QVXZR_ComputerSystem";
constexpr const char* keylessEndpoint = "QVXZR_DHCPProtocolEndpoint";
constexpr const char* keylessIPEndpoint = "QVXZR_IPProtocolEndpoint";
constexpr const char* keylessServer = "QVXZR_DHCPRemoteServiceAccessPoint";
constexpr const char* keylessCapabilities = "QVXZR_DHCPCapabilities";
constexpr const char* keylessSetting = "QVXZR_DHCPSettingData";
constexpr const char* keylessAssignment = "QVXZR_IPAssignmentSettingData";
constexpr const char* stranger =
    R"(QVXZR_SPComputerSystem.CreationClassName="QVXZR_SPComputerSystem",Name="BMC:-1")";

// Objects.

const Texts allEndpoints{"DHCPProtocolEndpoint @ eth0", "DHCPProtocolEndpoint @ eth1",
                         "DHCPProtocolEndpoint @ eth2", "DHCPProtocolEndpoint BMC:-1 bmc0"};
const Texts allServers{"DHCPRemoteServiceAccessPoint @ eth0_IPv4",
                       "DHCPRemoteServiceAccessPoint @ eth1_IPv4",
                       "DHCPRemoteServiceAccessPoint @ eth1_IPv6"};
const Texts allCapabilities{"DHCPCapabilities eth0", "DHCPCapabilities eth1",
                            "DHCPCapabilities eth2", "DHCPCapabilities bmc0"};
const Texts allSettings{"DHCPSettingData Computer%eth0", "DHCPSettingData Computer%eth1",
                        "DHCPSettingData Computer%eth2", "DHCPSettingData Computer%eth3",
                        "DHCPSettingData BMC%bmc0"};

std::string name(const ::testing::TestParamInfo<Cell>& info) {
    return info.param.name;
}

// Computer system and DHCP protocol endpoint.

constexpr const char* hostedPoint = "QVXZR_HostedDHCPPoint";

const std::string hostedEth0 =
    "HostedDHCPPoint Antecedent[ComputerSystem @] Dependent[DHCPProtocolEndpoint @ eth0]";
const std::string hostedEth1 =
    "HostedDHCPPoint Antecedent[ComputerSystem @] Dependent[DHCPProtocolEndpoint @ eth1]";
const Texts allHosted{
    hostedEth0, hostedEth1,
    "HostedDHCPPoint Antecedent[ComputerSystem @] Dependent[DHCPProtocolEndpoint @ eth2]",
    "HostedDHCPPoint Antecedent[ComputerSystem @] Dependent[DHCPProtocolEndpoint BMC:-1 bmc0]"};

INSTANTIATE_TEST_SUITE_P(
    HostedDHCPPoint, AssociationCells,
    ::testing::Values(Cell{"FromAComputer", hostedPoint, computer, allEndpoints, allHosted},
                      Cell{"FromAnEndpoint", hostedPoint, eth1, {"ComputerSystem @"}, {hostedEth1}},
                      Cell{"FromItsOwnClass", hostedPoint, hostedPoint, {}, allHosted, 4},
                      Cell{"FromAComputerWithoutKeys", hostedPoint, keylessComputer, allEndpoints,
                           allHosted},
                      Cell{"FromAnEndpointWithoutKeys",
                           hostedPoint,
                           keylessEndpoint,
                           {"ComputerSystem @"},
                           {hostedEth0}},
                      Cell{"FromAnotherClass", hostedPoint, stranger, {}, {}}),
    name);

// IP protocol endpoint and DHCP protocol endpoint.

constexpr const char* dependency = "QVXZR_SAPSAPDependency";

const std::string dependencyEth0 =
    "SAPSAPDependency Antecedent[IPProtocolEndpoint @ eth0] Dependent[DHCPProtocolEndpoint @ eth0]";
const std::string dependencyEth1 =
    "SAPSAPDependency Antecedent[IPProtocolEndpoint @ eth1] Dependent[DHCPProtocolEndpoint @ eth1]";
const Texts allDependencies{
    dependencyEth0, dependencyEth1,
    "SAPSAPDependency Antecedent[IPProtocolEndpoint @ eth2] Dependent[DHCPProtocolEndpoint @ eth2]",
    "SAPSAPDependency Antecedent[IPProtocolEndpoint BMC:-1 bmc0] "
    "Dependent[DHCPProtocolEndpoint BMC:-1 bmc0]"};

INSTANTIATE_TEST_SUITE_P(
    SAPSAPDependency, AssociationCells,
    ::testing::Values(
        Cell{"FromAnIPEndpoint",
             dependency,
             ipEth1,
             {"DHCPProtocolEndpoint @ eth1"},
             {dependencyEth1}},
        Cell{
            "FromADHCPEndpoint", dependency, eth1, {"IPProtocolEndpoint @ eth1"}, {dependencyEth1}},
        Cell{"FromItsOwnClass", dependency, dependency, {}, allDependencies, 4},
        Cell{"FromAnIPEndpointWithoutKeys", dependency, keylessIPEndpoint, allEndpoints,
             allDependencies},
        Cell{"FromADHCPEndpointWithoutKeys",
             dependency,
             keylessEndpoint,
             {"IPProtocolEndpoint @ eth0"},
             {dependencyEth0}},
        Cell{"FromAnotherClass", dependency, computer, {}, {}}),
    name);

// DHCP protocol endpoint and DHCP capabilities.

constexpr const char* elementCapabilities = "QVXZR_DHCPElementCapabilities";

const std::string capabilitiesEth0 =
    "DHCPElementCapabilities ManagedElement[DHCPProtocolEndpoint @ eth0] "
    "Capabilities[DHCPCapabilities eth0]";
const std::string capabilitiesEth1 =
    "DHCPElementCapabilities ManagedElement[DHCPProtocolEndpoint @ eth1] "
    "Capabilities[DHCPCapabilities eth1]";
const Texts allElementCapabilities{
    capabilitiesEth0, capabilitiesEth1,
    "DHCPElementCapabilities ManagedElement[DHCPProtocolEndpoint @ eth2] "
    "Capabilities[DHCPCapabilities eth2]",
    "DHCPElementCapabilities ManagedElement[DHCPProtocolEndpoint BMC:-1 bmc0] "
    "Capabilities[DHCPCapabilities bmc0]"};

INSTANTIATE_TEST_SUITE_P(
    ElementCapabilities, AssociationCells,
    ::testing::Values(Cell{"FromAnEndpoint",
                           elementCapabilities,
                           eth1,
                           {"DHCPCapabilities eth1"},
                           {capabilitiesEth1}},
                      Cell{"FromCapabilities",
                           elementCapabilities,
                           capabilities,
                           {"DHCPProtocolEndpoint @ eth1"},
                           {capabilitiesEth1}},
                      Cell{"FromItsOwnClass",
                           elementCapabilities,
                           elementCapabilities,
                           {},
                           allElementCapabilities,
                           4},
                      Cell{"FromAnEndpointWithoutKeys", elementCapabilities, keylessEndpoint,
                           allCapabilities, Texts(4, capabilitiesEth0)},
                      Cell{"FromCapabilitiesWithoutKeys", elementCapabilities, keylessCapabilities,
                           allEndpoints, allElementCapabilities},
                      Cell{"FromAnotherClass", elementCapabilities, setting, {}, {}}),
    name);

// Computer system and remote access point.

constexpr const char* remoteHostedPoint = "QVXZR_DHCPRemoteHostedAccessPoint";

const std::string remoteHostedEth0 =
    "DHCPRemoteHostedAccessPoint Antecedent[ComputerSystem @] "
    "Dependent[DHCPRemoteServiceAccessPoint @ eth0_IPv4]";
const Texts allRemoteHosted{remoteHostedEth0,
                            "DHCPRemoteHostedAccessPoint Antecedent[ComputerSystem @] "
                            "Dependent[DHCPRemoteServiceAccessPoint @ eth1_IPv4]",
                            "DHCPRemoteHostedAccessPoint Antecedent[ComputerSystem @] "
                            "Dependent[DHCPRemoteServiceAccessPoint @ eth1_IPv6]"};

INSTANTIATE_TEST_SUITE_P(
    RemoteHostedAccessPoint, AssociationCells,
    ::testing::Values(
        Cell{"FromAComputer", remoteHostedPoint, computer, allServers, allRemoteHosted},
        Cell{"FromAnAccessPoint",
             remoteHostedPoint,
             server,
             {"ComputerSystem @"},
             {remoteHostedEth0}},
        Cell{"FromItsOwnClass", remoteHostedPoint, remoteHostedPoint, {}, allRemoteHosted, 3},
        Cell{"FromAComputerWithoutKeys", remoteHostedPoint, keylessComputer, allServers,
             allRemoteHosted},
        Cell{"FromAnAccessPointWithoutKeys",
             remoteHostedPoint,
             keylessServer,
             {"ComputerSystem @"},
             {remoteHostedEth0}},
        Cell{"FromAnotherClass", remoteHostedPoint, eth1, {}, {}}),
    name);

// Remote access point and DHCP protocol endpoint.

constexpr const char* available = "QVXZR_DHCPRemoteAccessAvailableToElement";

const std::string availableEth0 =
    "DHCPRemoteAccessAvailableToElement Antecedent[DHCPRemoteServiceAccessPoint @ eth0_IPv4] "
    "Dependent[DHCPProtocolEndpoint @ eth0]";
const Texts allAvailable{
    availableEth0,
    "DHCPRemoteAccessAvailableToElement Antecedent[DHCPRemoteServiceAccessPoint @ eth1_IPv4] "
    "Dependent[DHCPProtocolEndpoint @ eth1]",
    "DHCPRemoteAccessAvailableToElement Antecedent[DHCPRemoteServiceAccessPoint @ eth1_IPv6] "
    "Dependent[DHCPProtocolEndpoint @ eth1]"};

INSTANTIATE_TEST_SUITE_P(
    RemoteAccessAvailableToElement, AssociationCells,
    ::testing::Values(Cell{"FromAnAccessPoint",
                           available,
                           server,
                           {"DHCPProtocolEndpoint @ eth1"},
                           {availableEth0}},
                      Cell{"FromAnEndpoint", available, eth1, allServers, allAvailable},
                      Cell{"FromItsOwnClass", available, available, {}, allAvailable, 3},
                      Cell{"FromAnAccessPointWithoutKeys", available, keylessServer, allEndpoints,
                           Texts(4, availableEth0)},
                      Cell{"FromAnEndpointWithoutKeys", available, keylessEndpoint, allServers,
                           allAvailable},
                      Cell{"FromAnotherClass", available, computer, {}, {}}),
    name);

// DHCP protocol endpoint and DHCP setting data.

constexpr const char* elementSetting = "QVXZR_DHCPElementSettingData";
constexpr const char* noEndpoint = "Could not get 'System Name' and  'Name' key";

const std::string settingEth0 =
    "DHCPElementSettingData ManagedElement[DHCPProtocolEndpoint @ eth0] "
    "SettingData[DHCPSettingData Computer%eth0]";
const std::string settingEth1 =
    "DHCPElementSettingData ManagedElement[DHCPProtocolEndpoint @ eth1] "
    "SettingData[DHCPSettingData Computer%eth1]";
const Texts settingsUpToTheStaticInterface{
    settingEth0, settingEth1,
    "DHCPElementSettingData ManagedElement[DHCPProtocolEndpoint @ eth2] "
    "SettingData[DHCPSettingData Computer%eth2]"};

INSTANTIATE_TEST_SUITE_P(
    ElementSettingData, AssociationCells,
    ::testing::Values(Cell{"FromAnEndpoint",
                           elementSetting,
                           eth1,
                           {"DHCPSettingData Computer%eth1"},
                           {settingEth1}},
                      Cell{"FromASetting",
                           elementSetting,
                           setting,
                           {"DHCPProtocolEndpoint @ eth1"},
                           {settingEth1}},
                      Cell{"FromItsOwnClass",
                           elementSetting,
                           elementSetting,
                           {},
                           settingsUpToTheStaticInterface,
                           5,
                           noEndpoint},
                      Cell{"FromAnEndpointWithoutKeys", elementSetting, keylessEndpoint,
                           allSettings, settingsUpToTheStaticInterface, 0, noEndpoint},
                      Cell{"FromASettingWithoutKeys", elementSetting, keylessSetting, allEndpoints,
                           Texts(4, settingEth0)},
                      Cell{"FromAnotherClass", elementSetting, capabilities, {}, {}}),
    name);

// IP assignment setting data and DHCP setting data.

constexpr const char* ordered = "QVXZR_DHCPOrderedComponent";

const std::string orderedEth0 =
    "DHCPOrderedComponent GroupComponent[IPAssignmentSettingData Computer%eth0%dhcp] "
    "PartComponent[DHCPSettingData Computer%eth0]";
const std::string orderedEth1 =
    "DHCPOrderedComponent GroupComponent[IPAssignmentSettingData Computer%eth1%dhcp] "
    "PartComponent[DHCPSettingData Computer%eth1]";
const Texts allOrdered{
    orderedEth0, orderedEth1,
    "DHCPOrderedComponent GroupComponent[IPAssignmentSettingData Computer%eth2%dhcp] "
    "PartComponent[DHCPSettingData Computer%eth2]",
    "DHCPOrderedComponent GroupComponent[IPAssignmentSettingData Computer%eth3%dhcp] "
    "PartComponent[DHCPSettingData Computer%eth3]",
    "DHCPOrderedComponent GroupComponent[IPAssignmentSettingData BMC%bmc0%dhcp] "
    "PartComponent[DHCPSettingData BMC%bmc0]"};

INSTANTIATE_TEST_SUITE_P(
    OrderedComponent, AssociationCells,
    ::testing::Values(Cell{"FromAnAssignment",
                           ordered,
                           assignment,
                           {"DHCPSettingData Computer%eth1"},
                           {orderedEth1}},
                      Cell{"FromASetting",
                           ordered,
                           setting,
                           {"IPAssignmentSettingData Computer%eth1%dhcp"},
                           {orderedEth1}},
                      Cell{"FromItsOwnClass", ordered, ordered, {}, allOrdered, 5},
                      Cell{"FromAnAssignmentWithoutKeys", ordered, keylessAssignment, allSettings,
                           allOrdered},
                      Cell{"FromASettingWithoutKeys",
                           ordered,
                           keylessSetting,
                           {"IPAssignmentSettingData Computer%eth0%dhcp"},
                           {orderedEth0}},
                      Cell{"FromAnotherClass", ordered, eth1, {}, {}}),
    name);

}  // namespace
