// What is particular to each of the seven associations, and how requests choose among
// them. AssociationCellsTest walks all from every side.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <stdexcept>
#include <string>
#include <vector>

#include "cimom/Instance.h"
#include "kit/AssociationMachine.h"
#include "kit/Host.h"
#include "kit/LogCapture.h"

namespace {

using test::briefs;
using test::Fault;
using test::Function;
using test::host;
using test::Host;
using test::keyOf;
using test::ofHost;
using test::pathOf;
using test::staticInterface;
using test::Texts;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::SizeIs;
using ZR::Testing::LogCapture;

class AssociationsTest : public test::MachineTest {
  protected:
    Host host_{Host::Neighbours::served, Host::Calls::counted};
};

// Hosted access point.

constexpr const char* hosted = "QVXZR_HostedDHCPPoint";

TEST_F(AssociationsTest, EndpointHasItsComputer) {
    const Host::Response names = host_.associatorNames(endpoint("eth0"), hosted);
    EXPECT_EQ(names.code, CMPI_RC_OK);
    EXPECT_EQ(briefs(names), ofHost(Texts{"ComputerSystem @"}));
    EXPECT_EQ(names.returnDoneCalls, 1U);
    EXPECT_EQ(briefs(host_.associators(endpoint("eth0"), hosted)),
              ofHost(Texts{"ComputerSystem @"}));
}

TEST_F(AssociationsTest, EndpointOfTheServiceProcessorReachesItsComputer) {
    cimom::ObjectPath path =
        pathOf("QVXZR_DHCPProtocolEndpoint", {{"SystemName", "BMC:-1"}, {"Name", "bmc0"}});
    EXPECT_THAT(briefs(host_.associatorNames(path, hosted)),
                ElementsAre("SPComputerSystem BMC:-1"));
}

// The static interface agrees with the system name filter and is then skipped for
// its DHCP flag; what follows it is not filtered again, and so is delivered too.
TEST_F(AssociationsTest, ComputerHasItsEndpointsAndTheOneBehindAnInterfaceWithoutDHCP) {
    const Host::Response names = host_.associatorNames(computer(hostName()), hosted);
    EXPECT_EQ(briefs(names),
              ofHost(Texts{"DHCPProtocolEndpoint @ eth0", "DHCPProtocolEndpoint @ eth1",
                           "DHCPProtocolEndpoint @ eth2", "DHCPProtocolEndpoint BMC:-1 bmc0"}));
    EXPECT_EQ(briefs(host_.associators(computer(hostName()), hosted)), briefs(names));
}

TEST_F(AssociationsTest, ReferenceOfAnEndpointHasTheComputersPathAndAnEndpointPathOfOurs) {
    const Host::Response names = host_.referenceNames(endpoint("eth0"), hosted);
    ASSERT_EQ(names.code, CMPI_RC_OK);
    EXPECT_EQ(briefs(names), ofHost(Texts{"HostedDHCPPoint Antecedent[ComputerSystem @] "
                                          "Dependent[DHCPProtocolEndpoint @ eth0]"}));
    EXPECT_EQ(names.returnDoneCalls, 1U);
    const Host::Response instances = host_.references(endpoint("eth0"), hosted);
    ASSERT_THAT(instances.instances, SizeIs(1));
    EXPECT_NE(instances.instances[0]->property("Antecedent"), nullptr);
    EXPECT_NE(instances.instances[0]->property("Dependent"), nullptr);
    EXPECT_EQ(briefs(instances), briefs(names));
}

TEST_F(AssociationsTest, EnumeratingTheHostedClassYieldsThePairs) {
    const Host::Response names = host_.enumerateNames(pathOf(hosted));
    EXPECT_EQ(briefs(names), ofHost(Texts{"HostedDHCPPoint Antecedent[ComputerSystem @] "
                                          "Dependent[DHCPProtocolEndpoint @ eth0]",
                                          "HostedDHCPPoint Antecedent[ComputerSystem @] "
                                          "Dependent[DHCPProtocolEndpoint @ eth1]",
                                          "HostedDHCPPoint Antecedent[ComputerSystem @] "
                                          "Dependent[DHCPProtocolEndpoint @ eth2]",
                                          "HostedDHCPPoint Antecedent[ComputerSystem @] "
                                          "Dependent[DHCPProtocolEndpoint BMC:-1 bmc0]"}));
    EXPECT_EQ(names.returnDoneCalls, 1U);
    EXPECT_EQ(host_.enumerate(pathOf(hosted)).returnDoneCalls, 0U);
}

TEST_F(AssociationsTest, EnumeratingTheHostedClassWithoutAnEndpointYieldsNothing) {
    setTree({host({staticInterface("eth0")})});
    EXPECT_THAT(briefs(host_.enumerateNames(pathOf(hosted))), IsEmpty());
}

TEST_F(AssociationsTest, EndpointPathWithoutKeysYieldsEveryComputerThatIsEnumerated) {
    EXPECT_EQ(briefs(host_.associatorNames(pathOf("QVXZR_DHCPProtocolEndpoint"), hosted)),
              ofHost(Texts{"ComputerSystem @"}));
}

TEST_F(AssociationsTest, ResultClassIsComparedWithoutCaseButNoSuperclassCounts) {
    const auto path = computer(hostName());
    EXPECT_THAT(briefs(host_.associators(path, hosted, "cim_dhcpprotocolendpoint")), SizeIs(4));
    EXPECT_THAT(briefs(host_.associatorNames(path, hosted, "QVXZR_DHCPPROTOCOLENDPOINT")),
                SizeIs(4));
    for (const char* other : {"CIM_ProtocolEndpoint", "CIM_ComputerSystem", "", "x"}) {
        const Host::Response response = host_.associatorNames(path, hosted, other);
        EXPECT_THAT(response.paths, IsEmpty()) << other;
        EXPECT_EQ(response.code, CMPI_RC_OK);
        EXPECT_EQ(response.returnDoneCalls, 1U);
    }
}

// Association requests and the classes that they name.

TEST_F(AssociationsTest, StandardParentRunsBothHostedAssociationsAndEndsOnce) {
    const Host::Response response =
        host_.associatorNames(computer(hostName()), "CIM_HostedAccessPoint");
    EXPECT_EQ(briefs(response),
              ofHost(Texts{"DHCPProtocolEndpoint @ eth0", "DHCPProtocolEndpoint @ eth1",
                           "DHCPProtocolEndpoint @ eth2", "DHCPProtocolEndpoint BMC:-1 bmc0",
                           "DHCPRemoteServiceAccessPoint @ eth0_IPv4",
                           "DHCPRemoteServiceAccessPoint @ eth1_IPv4",
                           "DHCPRemoteServiceAccessPoint @ eth1_IPv6"}));
    EXPECT_EQ(response.returnDoneCalls, 1U);
}

TEST_F(AssociationsTest, StandardParentRunsTheSecondAlsoWhenTheSourceTakesNoPartInIt) {
    const LogCapture log(4000, 6000);
    const Host::Response response =
        host_.associatorNames(endpoint("eth0"), "CIM_HostedAccessPoint");
    EXPECT_EQ(briefs(response), ofHost(Texts{"ComputerSystem @"}));
    EXPECT_EQ(response.returnDoneCalls, 1U);
    std::vector<std::string> adapters;
    for (const auto& line : log.log()) {
        if (line.function.starts_with("~") && line.file.ends_with("HostedAccessPoint") &&
            line.file.starts_with("CMPI/")) {
            adapters.push_back(line.file);
        }
    }
    EXPECT_THAT(adapters, ElementsAre("CMPI/CMPIDHCPHostedAccessPoint",
                                      "CMPI/CMPIDHCPRemoteHostedAccessPoint"));
}

TEST_F(AssociationsTest, RolesChangeNothing) {
    const auto withRoles = [this](const char* role, const char* resultRole) {
        return host_.request(
            Host::Kind::paths, endpoint("eth0"), [&](auto* context, auto* result, auto* path) {
                return host_.associationTable().associatorNames(nullptr, context, result, path,
                                                                hosted, nullptr, role, resultRole);
            });
    };
    const auto referencesWithRole = [this](const char* role) {
        return host_.request(Host::Kind::paths, endpoint("eth0"),
                             [&](auto* context, auto* result, auto* path) {
                                 return host_.associationTable().referenceNames(
                                     nullptr, context, result, path, hosted, role);
                             });
    };
    for (const char* role : {"Antecedent", "Dependent", "", "NoSuchRole"}) {
        EXPECT_EQ(briefs(withRoles(role, nullptr)), ofHost(Texts{"ComputerSystem @"})) << role;
        EXPECT_EQ(briefs(withRoles(nullptr, role)), ofHost(Texts{"ComputerSystem @"})) << role;
        EXPECT_THAT(briefs(referencesWithRole(role)), SizeIs(1)) << role;
    }
}

TEST_F(AssociationsTest, UnknownAssociationClassIsAnEmptySuccessForNamesAndInvalidForInstances) {
    const Host::Response names = host_.associatorNames(endpoint("eth0"), "CIM_NoSuchClass");
    EXPECT_EQ(names.code, CMPI_RC_OK);
    EXPECT_THAT(names.paths, IsEmpty());
    EXPECT_EQ(names.returnDoneCalls, 1U);
    const Host::Response instances = host_.associators(endpoint("eth0"), "CIM_NoSuchClass");
    EXPECT_EQ(instances.code, CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_FALSE(instances.hasMessage);
    EXPECT_THAT(instances.instances, IsEmpty());
    EXPECT_EQ(instances.returnDoneCalls, 1U);
}

TEST_F(AssociationsTest, UnknownAssociationClassIsTracedOnceByItsHandlerAndAKnownOneIsNot) {
    const auto traced = [this](bool names, const char* association) {
        const LogCapture log;
        if (names) {
            host_.associatorNames(endpoint("eth0"), association);
        } else {
            host_.associators(endpoint("eth0"), association);
        }
        EXPECT_EQ(log.logMessages(), log.traceMessages());
        std::vector<ZR::Testing::LogRecord> lines = log.log();
        std::erase_if(lines, [](const auto& line) {
            return line.message.find("CMPI_RC_ERR_INVALID_CLASS") == std::string::npos;
        });
        return lines;
    };
    for (const bool names : {true, false}) {
        const auto lines = traced(names, "CIM_NoSuchClass");
        ASSERT_THAT(lines, SizeIs(1));
        EXPECT_EQ(lines[0].level, 4000);
        EXPECT_EQ(lines[0].file, "DHCPClientProvider");
        EXPECT_EQ(lines[0].function,
                  names ? "DHCPClient_AssociatorNames" : "DHCPClient_Associators");
        EXPECT_THAT(lines[0].message,
                    ::testing::MatchesRegex("VARIABLE: 'CMPI_RC_ERR_INVALID_CLASS' has Value '5' "
                                            "at line [0-9]+ in DHCPClientProvider"));
        EXPECT_THAT(traced(names, hosted), IsEmpty());
        EXPECT_THAT(traced(names, "CIM_HostedAccessPoint"), IsEmpty());
    }
}

TEST_F(AssociationsTest, ElementClassAsAssociationClassIsInvalidAndLeavesTheResultOpen) {
    const LogCapture log(4000);
    for (const Host::Response& response :
         {host_.associatorNames(endpoint("eth0"), "QVXZR_DHCPSettingData"),
          host_.associators(endpoint("eth0"), "QVXZR_DHCPSettingData")}) {
        EXPECT_EQ(response.code, CMPI_RC_ERR_INVALID_CLASS);
        EXPECT_EQ(response.returnDoneCalls, 0U);
    }
    EXPECT_THAT(log.logMessages(),
                ::testing::Contains(::testing::StartsWith("VARIABLE: 'rcode' has Value '0'")));
}

TEST_F(AssociationsTest, ReferencesServeOnlyTheExactClass) {
    for (const char* name :
         {"CIM_ElementSettingData", "CIM_HostedAccessPoint", "CIM_NoSuchClass"}) {
        for (const Host::Response& response : {host_.referenceNames(endpoint("eth0"), name),
                                               host_.references(endpoint("eth0"), name)}) {
            EXPECT_EQ(response.code, CMPI_RC_ERR_INVALID_CLASS) << name;
            EXPECT_EQ(response.returnDoneCalls, 0U);
        }
    }
    EXPECT_EQ(host_.referenceNames(endpoint("eth0"), nullptr).code, CMPI_RC_ERR_INVALID_CLASS);
    const Host::Response served =
        host_.referenceNames(endpoint("eth0"), "QVXZR_DHCPElementSettingData");
    EXPECT_EQ(briefs(served),
              ofHost(Texts{"DHCPElementSettingData ManagedElement[DHCPProtocolEndpoint @ eth0] "
                           "SettingData[DHCPSettingData Computer%eth0]"}));
    EXPECT_EQ(served.returnDoneCalls, 1U);
}

TEST_F(AssociationsTest, NoAssociationClassRunsAllSeven) {
    const Host::Response response = host_.associatorNames(endpoint("eth0"), nullptr);
    EXPECT_EQ(response.code, CMPI_RC_OK);
    EXPECT_EQ(
        briefs(response),
        ofHost(Texts{"DHCPCapabilities eth0", "ComputerSystem @", "IPProtocolEndpoint @ eth0",
                     "DHCPRemoteServiceAccessPoint @ eth0_IPv4",
                     "DHCPRemoteServiceAccessPoint @ eth1_IPv4",
                     "DHCPRemoteServiceAccessPoint @ eth1_IPv6", "DHCPSettingData Computer%eth0"}));
    EXPECT_EQ(response.returnDoneCalls, 1U);
}

// The other six.

TEST_F(AssociationsTest, IPEndpointAndDHCPEndpointLeadToEachOther) {
    constexpr const char* name = "QVXZR_SAPSAPDependency";
    EXPECT_EQ(briefs(host_.associatorNames(endpoint("eth1"), name)),
              ofHost(Texts{"IPProtocolEndpoint @ eth1"}));
    const auto ip =
        pathOf("QVXZR_IPProtocolEndpoint", {{"SystemCreationClassName", "QVXZR_ComputerSystem"},
                                            {"SystemName", hostName()},
                                            {"CreationClassName", "QVXZR_IPProtocolEndpoint"},
                                            {"Name", "eth1"}});
    EXPECT_EQ(briefs(host_.associators(ip, name)), ofHost(Texts{"DHCPProtocolEndpoint @ eth1"}));
}

TEST_F(AssociationsTest, ReferenceOfAnIPEndpointIsRecomputedFromTheDHCPEndpoint) {
    // The source path lacks a key that the recomputed reference has.
    const auto ip =
        pathOf("QVXZR_IPProtocolEndpoint", {{"SystemName", hostName()}, {"Name", "eth1"}});
    const Host::Response response = host_.referenceNames(ip, "QVXZR_SAPSAPDependency");
    ASSERT_THAT(response.paths, SizeIs(1));
    const auto& antecedent = std::get<std::shared_ptr<const cimom::ObjectPath>>(
        *response.paths[0]->key("Antecedent")->scalar());
    EXPECT_EQ(keyOf(*antecedent, "CreationClassName"), "QVXZR_IPProtocolEndpoint");
    EXPECT_EQ(keyOf(*antecedent, "Name"), "eth1");
}

TEST_F(AssociationsTest, EndpointAndCapabilitiesLeadToEachOther) {
    constexpr const char* name = "QVXZR_DHCPElementCapabilities";
    EXPECT_EQ(briefs(host_.associatorNames(endpoint("eth1"), name)),
              Texts{"DHCPCapabilities eth1"});
    const auto capabilitiesPath = pathOf("QVXZR_DHCPCapabilities", {{"InstanceID", "eth1"}});
    EXPECT_EQ(briefs(host_.associators(capabilitiesPath, name)),
              ofHost(Texts{"DHCPProtocolEndpoint @ eth1"}));
    const Host::Response references = host_.references(capabilitiesPath, name);
    ASSERT_THAT(references.instances, SizeIs(1));
    EXPECT_EQ(references.instances[0]->property("Characteristics"), nullptr);
}

TEST_F(AssociationsTest, AccessPointAndItsComputerLeadToEachOther) {
    constexpr const char* name = "QVXZR_DHCPRemoteHostedAccessPoint";
    const auto accessPointPath = pathOf("QVXZR_DHCPRemoteServiceAccessPoint",
                                        {{"SystemName", hostName()}, {"Name", "eth0_IPv4"}});
    EXPECT_EQ(briefs(host_.associatorNames(accessPointPath, name)),
              ofHost(Texts{"ComputerSystem @"}));
    EXPECT_THAT(briefs(host_.associators(computer(hostName()), name)), SizeIs(3));
    EXPECT_EQ(briefs(host_.enumerateNames(pathOf(name))),
              ofHost(Texts{"DHCPRemoteHostedAccessPoint Antecedent[ComputerSystem @] "
                           "Dependent[DHCPRemoteServiceAccessPoint @ eth0_IPv4]",
                           "DHCPRemoteHostedAccessPoint Antecedent[ComputerSystem @] "
                           "Dependent[DHCPRemoteServiceAccessPoint @ eth1_IPv4]",
                           "DHCPRemoteHostedAccessPoint Antecedent[ComputerSystem @] "
                           "Dependent[DHCPRemoteServiceAccessPoint @ eth1_IPv6]"}));
}

TEST_F(AssociationsTest, EachEndIsAskedOnceInEachStepOfTheWalkOverHostedAccessPoints) {
    const LogCapture log(4000, 6000);
    EXPECT_THAT(host_.enumerateNames(pathOf("QVXZR_DHCPRemoteHostedAccessPoint")).paths, SizeIs(3));
    const auto asked = [lines = log.log()](const std::string& file) {
        return std::count_if(lines.begin(), lines.end(), [&file](const auto& line) {
            return line.file == file && line.function == R"(operator\x20bool)";
        });
    };
    EXPECT_EQ(asked("CMPI/CMPIDHCPRemoteHostedAccessPoint"), 4);
    EXPECT_EQ(asked("CMPI/CMPIDHCPComputerSystem"), 4);
    // Once more when the computer is located from it.
    EXPECT_EQ(asked("CMPI/CMPIDHCPRemoteServiceAccessPoint"), 5);
}

TEST_F(AssociationsTest, OrderOfAccessOfAReferenceDependsOnWhereTheWalkStarted) {
    constexpr const char* name = "QVXZR_DHCPRemoteAccessAvailableToElement";
    const auto order = [](const Host::Response& response) {
        std::vector<std::uint64_t> values;
        for (const auto& instance : response.instances) {
            values.push_back(test::numberOf(*instance, "OrderOfAccess").value_or(77));
        }
        return values;
    };
    const auto accessPointPath = [](const char* key) {
        return pathOf("QVXZR_DHCPRemoteServiceAccessPoint",
                      {{"SystemName", hostName()}, {"Name", key}});
    };
    // One server: untouched. Several: 0 after the look-up from the access point.
    EXPECT_THAT(order(host_.references(accessPointPath("eth0_IPv4"), name)), ElementsAre(1));
    EXPECT_THAT(order(host_.references(accessPointPath("eth1_IPv4"), name)), ElementsAre(0));
    EXPECT_THAT(briefs(host_.associatorNames(accessPointPath("eth1_IPv4"), name)),
                ElementsAre(ofHost("DHCPProtocolEndpoint @ eth1")));
}

TEST_F(AssociationsTest, EndpointReachesTheAccessPointsOfEveryInterfaceWithoutUnderscore) {
    EXPECT_EQ(
        briefs(host_.associatorNames(endpoint("eth1"), "QVXZR_DHCPRemoteAccessAvailableToElement")),
        ofHost(Texts{"DHCPRemoteServiceAccessPoint @ eth0_IPv4",
                     "DHCPRemoteServiceAccessPoint @ eth1_IPv4",
                     "DHCPRemoteServiceAccessPoint @ eth1_IPv6"}));
}

TEST_F(AssociationsTest, EndpointAndSettingLeadToEachOther) {
    constexpr const char* name = "QVXZR_DHCPElementSettingData";
    EXPECT_EQ(briefs(host_.associatorNames(endpoint("eth2"), name)),
              Texts{"DHCPSettingData Computer%eth2"});
    const auto settingPath = pathOf("QVXZR_DHCPSettingData", {{"InstanceID", "Computer%eth2"}});
    EXPECT_EQ(briefs(host_.associators(settingPath, name)),
              ofHost(Texts{"DHCPProtocolEndpoint @ eth2"}));
    const Host::Response references = host_.references(settingPath, name);
    ASSERT_THAT(references.instances, SizeIs(1));
    EXPECT_EQ(test::numberOf(*references.instances[0], "IsCurrent"), 1U);
    EXPECT_EQ(references.instances[0]->property("IsCurrent")->type, cimom::Type::uint16);
}

TEST_F(AssociationsTest, EnumerationOfElementSettingDataEndsAtAnInterfaceWithoutDHCP) {
    // The setting of the static interface has no endpoint: the walk ends there, and
    // what was delivered stays.
    const LogCapture log(6000, 6000);
    const Host::Response response = host_.enumerateNames(pathOf("QVXZR_DHCPElementSettingData"));
    EXPECT_EQ(response.code, CMPI_RC_OK);
    EXPECT_THAT(response.paths, SizeIs(3));
    ASSERT_THAT(log.log(), SizeIs(1));
    EXPECT_THAT(log.log()[0].message,
                ::testing::EndsWith("Could not get 'System Name' and  'Name' key"));
}

TEST_F(AssociationsTest, SettingAndAssignmentLeadToEachOther) {
    constexpr const char* name = "QVXZR_DHCPOrderedComponent";
    const auto settingPath = pathOf("QVXZR_DHCPSettingData", {{"InstanceID", "Computer%eth3"}});
    EXPECT_EQ(briefs(host_.associators(settingPath, name)),
              Texts{"IPAssignmentSettingData Computer%eth3%dhcp"});
    const auto assignmentPath =
        pathOf("QVXZR_IPAssignmentSettingData", {{"InstanceID", "Computer%eth3%dhcp"}});
    EXPECT_EQ(briefs(host_.associatorNames(assignmentPath, name)),
              Texts{"DHCPSettingData Computer%eth3"});
    const Host::Response references = host_.references(assignmentPath, name);
    ASSERT_THAT(references.instances, SizeIs(1));
    EXPECT_EQ(test::numberOf(*references.instances[0], "AssignedSequence"), 1U);
    EXPECT_EQ(references.instances[0]->property("AssignedSequence")->type, cimom::Type::uint64);
}

TEST_F(AssociationsTest, EnumeratingOrderedComponentsPlacesBothEndsByTheirPaths) {
    constexpr const char* name = "QVXZR_DHCPOrderedComponent";
    EXPECT_EQ(briefs(host_.enumerateNames(pathOf(name))),
              (Texts{"DHCPOrderedComponent GroupComponent[IPAssignmentSettingData "
                     "Computer%eth0%dhcp] PartComponent[DHCPSettingData Computer%eth0]",
                     "DHCPOrderedComponent GroupComponent[IPAssignmentSettingData "
                     "Computer%eth1%dhcp] PartComponent[DHCPSettingData Computer%eth1]",
                     "DHCPOrderedComponent GroupComponent[IPAssignmentSettingData "
                     "Computer%eth2%dhcp] PartComponent[DHCPSettingData Computer%eth2]",
                     "DHCPOrderedComponent GroupComponent[IPAssignmentSettingData "
                     "Computer%eth3%dhcp] PartComponent[DHCPSettingData Computer%eth3]",
                     "DHCPOrderedComponent GroupComponent[IPAssignmentSettingData "
                     "BMC%bmc0%dhcp] PartComponent[DHCPSettingData BMC%bmc0]"}));
    cimom::ObjectPath narrowed = pathOf(name);
    for (const auto& [role, path] :
         {std::pair{"PartComponent",
                    pathOf("QVXZR_DHCPSettingData", {{"InstanceID", "Computer%eth1"}})},
          std::pair{"GroupComponent", pathOf("QVXZR_IPAssignmentSettingData",
                                             {{"InstanceID", "Computer%eth1%dhcp"}})}}) {
        cimom::Value reference;
        reference.type = cimom::Type::reference;
        reference.content = cimom::Scalar(std::make_shared<const cimom::ObjectPath>(path));
        narrowed.keys.push_back({role, reference});
    }
    const Host::Response got = host_.get(narrowed);
    ASSERT_THAT(got.instances, SizeIs(1));
    EXPECT_EQ(test::numberOf(*got.instances[0], "AssignedSequence"), 1U);
}

TEST_F(AssociationsTest, AssignmentOfASettingIsFetchedSinglyThroughTheBroker) {
    const Host::Response response =
        host_.associators(pathOf("QVXZR_DHCPSettingData", {{"InstanceID", "Computer%eth1"}}),
                          "QVXZR_DHCPOrderedComponent");
    EXPECT_EQ(briefs(response), Texts{"IPAssignmentSettingData Computer%eth1%dhcp"});
    EXPECT_EQ(host_.counted().calls(Function::getInstance), 1U);
    EXPECT_EQ(host_.counted().calls(Function::enumerateInstances), 0U);
}

TEST_F(AssociationsTest, MissingAssignmentFailsWithTheComputersMessageAndStaysOk) {
    Host withoutNeighbours;
    const LogCapture log(6000, 6000);
    const Host::Response response = withoutNeighbours.associators(
        pathOf("QVXZR_DHCPSettingData", {{"InstanceID", "Computer%eth0"}}),
        "QVXZR_DHCPOrderedComponent");
    EXPECT_EQ(response.code, CMPI_RC_OK);
    EXPECT_THAT(response.instances, IsEmpty());
    EXPECT_EQ(response.returnDoneCalls, 1U);
    ASSERT_THAT(log.log(), SizeIs(1));
    EXPECT_THAT(log.log()[0].message,
                ::testing::EndsWith("Could not obtain an instance of Computer System"));
}

// Ends that cannot be found or named.

TEST_F(AssociationsTest, FarEndThatCannotBecomeAPathCoversEveryInstance) {
    // The first path is the one without keys, which then stays.
    host_.counted().fail(Function::newObjectPath, 2, Fault::null);
    EXPECT_EQ(briefs(host_.associatorNames(endpoint("eth1"), "QVXZR_DHCPElementCapabilities")),
              (Texts{"DHCPCapabilities eth0", "DHCPCapabilities eth1", "DHCPCapabilities eth2",
                     "DHCPCapabilities bmc0"}));
}

TEST_F(AssociationsTest, EndWithoutAPathLeavesItsReferenceOut) {
    host_.counted().fail(Function::enumerateInstances, 1, Fault::null);
    EXPECT_EQ(briefs(host_.enumerateNames(pathOf(hosted))),
              ofHost(Texts{"HostedDHCPPoint Dependent[DHCPProtocolEndpoint @ eth0]",
                           "HostedDHCPPoint Dependent[DHCPProtocolEndpoint @ eth1]",
                           "HostedDHCPPoint Dependent[DHCPProtocolEndpoint @ eth2]",
                           "HostedDHCPPoint Dependent[DHCPProtocolEndpoint BMC:-1 bmc0]"}));
    host_.counted().fail(Function::enumerateInstances, 1, Fault::null);
    const Host::Response instances = host_.enumerate(pathOf(hosted));
    ASSERT_THAT(instances.instances, SizeIs(4));
    EXPECT_EQ(instances.instances[0]->property("Antecedent"), nullptr);
    EXPECT_NE(instances.instances[0]->property("Dependent"), nullptr);
}

// Several computers from the broker. It has three of one name, and hands out the first
// two: the last of several is never delivered.

class SeveralComputersTest : public AssociationsTest {
  protected:
    void SetUp() override {
        AssociationsTest::SetUp();
        std::vector<test::Json> computers;
        for (const char* name : {"eth0", "eth1", "eth2"}) {
            computers.push_back(host({test::dhcpInterface(name, {"192.0.2.1"})}));
        }
        setTree(computers);
        // A walk that does not end is ended here, long after it had to.
        for (const Function function : {Function::returnObjectPath, Function::returnInstance}) {
            host_.counted().watch(function, [this, function] {
                if (host_.counted().calls(function) > 100) {
                    throw std::runtime_error("the walk does not end");
                }
            });
            if (function == Function::returnObjectPath) {
                names_ = host_.enumerateNames(pathOf("QVXZR_DHCPRemoteHostedAccessPoint"));
            } else {
                instances_ = host_.enumerate(pathOf("QVXZR_DHCPRemoteHostedAccessPoint"));
            }
        }
    }

    Host::Response names_;
    Host::Response instances_;
};

TEST_F(SeveralComputersTest, WalkOverRemoteHostedAccessPointsEndsWithTheAccessPoints) {
    const Texts expected =
        ofHost(Texts{"DHCPRemoteHostedAccessPoint Antecedent[ComputerSystem @] "
                     "Dependent[DHCPRemoteServiceAccessPoint @ eth0_IPv4]",
                     "DHCPRemoteHostedAccessPoint Antecedent[ComputerSystem @] "
                     "Dependent[DHCPRemoteServiceAccessPoint @ eth1_IPv4]",
                     "DHCPRemoteHostedAccessPoint Antecedent[ComputerSystem @] "
                     "Dependent[DHCPRemoteServiceAccessPoint @ eth2_IPv4]"});
    EXPECT_EQ(briefs(names_), expected);
    EXPECT_EQ(briefs(instances_), expected);
}

TEST_F(SeveralComputersTest, WalkOverHostedPointsGoesThroughTheEndpointsOfEachComputer) {
    const auto pair = [](const std::string& name) {
        return ofHost(
            "HostedDHCPPoint Antecedent[ComputerSystem @] Dependent[DHCPProtocolEndpoint "
            "@ " +
            name + "]");
    };
    EXPECT_EQ(briefs(host_.enumerateNames(pathOf(hosted))),
              (Texts{pair("eth0"), pair("eth1"), pair("eth2"), pair("eth0"), pair("eth1"),
                     pair("eth2")}));
}

TEST_F(SeveralComputersTest, EndpointAndAccessPointReachAllButTheLast) {
    const Texts computers = ofHost(Texts{"ComputerSystem @", "ComputerSystem @"});
    EXPECT_EQ(briefs(host_.associatorNames(endpoint("eth1"), hosted)), computers);
    EXPECT_EQ(briefs(host_.associators(endpoint("eth1"), hosted)), computers);
    EXPECT_THAT(briefs(host_.referenceNames(endpoint("eth1"), hosted)), SizeIs(2));
    const auto accessPointPath = pathOf("QVXZR_DHCPRemoteServiceAccessPoint",
                                        {{"SystemName", hostName()}, {"Name", "eth1_IPv4"}});
    constexpr const char* remoteHosted = "QVXZR_DHCPRemoteHostedAccessPoint";
    EXPECT_EQ(briefs(host_.associatorNames(accessPointPath, remoteHosted)), computers);
    EXPECT_EQ(briefs(host_.associators(accessPointPath, remoteHosted)), computers);
    EXPECT_THAT(briefs(host_.referenceNames(accessPointPath, remoteHosted)), SizeIs(2));
}

// Failures in one association.

TEST_F(AssociationsTest, EveryAssociationIsTracedAsServedAlsoTheOneThatFailed) {
    Host withoutNeighbours;
    const LogCapture log(4000, 6000);
    withoutNeighbours.associatorNames(endpoint("eth2"), nullptr);
    std::vector<std::string> codes;
    for (const auto& line : log.log()) {
        if (line.message.starts_with("VARIABLE: 'rcode'")) {
            EXPECT_EQ(line.level, 4000);
            EXPECT_EQ(line.function, "DHCPClient_AssociatorNames");
            codes.push_back(line.message.substr(0, line.message.find(" at line")));
        }
    }
    EXPECT_EQ(codes, Texts(7, "VARIABLE: 'rcode' has Value '1'"));
}

TEST_F(AssociationsTest, FailureInOneAssociationIsSilentForNamesAndLoggedForInstances) {
    Host withoutNeighbours;
    const LogCapture log(6000, 6000);
    const Host::Response names = withoutNeighbours.associatorNames(endpoint("eth2"), nullptr);
    EXPECT_EQ(names.code, CMPI_RC_OK);
    EXPECT_EQ(briefs(names), (Texts{"DHCPCapabilities eth2", "DHCPSettingData Computer%eth2"}));
    EXPECT_EQ(names.returnDoneCalls, 1U);
    EXPECT_THAT(log.log(), IsEmpty());
    const Host::Response instances = withoutNeighbours.associators(endpoint("eth2"), nullptr);
    EXPECT_EQ(instances.code, CMPI_RC_OK);
    EXPECT_EQ(briefs(instances), briefs(names));
    EXPECT_THAT(log.log(), SizeIs(3));
}

TEST_F(AssociationsTest, FailureOfReferencesLeavesTheResultOpenAndIsLoggedOnceForInstances) {
    Host withoutNeighbours;
    const LogCapture log(6000, 6000);
    const Host::Response names = withoutNeighbours.referenceNames(endpoint("eth0"), hosted);
    EXPECT_EQ(names.code, CMPI_RC_OK);
    EXPECT_EQ(names.returnDoneCalls, 0U);
    EXPECT_THAT(log.log(), IsEmpty());
    const Host::Response instances = withoutNeighbours.references(endpoint("eth0"), hosted);
    EXPECT_EQ(instances.code, CMPI_RC_OK);
    EXPECT_EQ(instances.returnDoneCalls, 0U);
    EXPECT_THAT(log.log(), SizeIs(1));
}

}  // namespace
