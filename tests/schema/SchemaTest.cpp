#include <gtest/gtest.h>

#include <algorithm>
#include <fstream>
#include <set>

#include "ShippedSchema.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"

namespace cimom {
namespace {

using shipped::classOf;
using shipped::propertyOf;
using shipped::repository;
using shipped::says;
using shipped::schemaDirectory;

/// One "Name:type" per property, "[]" for arrays, as the tables below are written.
std::string listed(const ClassDeclaration& declaration) {
    std::string result;
    for (const PropertyDeclaration& each : declaration.properties) {
        result += each.name + ':' +
                  (each.type == Type::reference ? each.referenceClass
                                                : std::string(typeName(each.type))) +
                  (each.isArray ? "[] " : " ");
    }
    return result;
}

// Effective properties by the class that introduces them, root downwards.
const std::string managedElement =
    "InstanceID:string Caption:string Description:string ElementName:string ";
const std::string managedSystemElement =
    "InstallDate:datetime Name:string OperationalStatus:uint16[] StatusDescriptions:string[] "
    "Status:string HealthState:uint16 CommunicationStatus:uint16 DetailedStatus:uint16 "
    "OperatingStatus:uint16 PrimaryStatus:uint16 ";
const std::string enabledLogicalElement =
    "EnabledState:uint16 OtherEnabledState:string RequestedState:uint16 EnabledDefault:uint16 "
    "TimeOfLastStateChange:datetime AvailableRequestedStates:uint16[] "
    "TransitioningToState:uint16 ";
const std::string element = managedElement + managedSystemElement + enabledLogicalElement;
const std::string accessPoint =
    "SystemCreationClassName:string SystemName:string CreationClassName:string ";
const std::string protocolEndpoint =
    "NameFormat:string ProtocolType:uint16 ProtocolIFType:uint16 OtherTypeDescription:string ";
const std::string dhcpEndpoint =
    "ClientState:uint16 RenewalTime:uint32 RebindingTime:uint32 LeaseTime:uint32 "
    "LeaseObtained:datetime LeaseExpires:datetime OptionsReceived:uint16[] ";
const std::string ipEndpoint =
    "IPv4Address:string IPv6Address:string Address:string SubnetMask:string PrefixLength:uint8 "
    "AddressType:uint16 IPVersionSupport:uint16 AddressOrigin:uint16 IPv6AddressType:uint16 "
    "IPv6SubnetPrefixLength:uint16 ";
const std::string remoteAccessPoint =
    "AccessInfo:string InfoFormat:uint16 OtherInfoFormatDescription:string AccessContext:uint16 "
    "OtherAccessContext:string ";
const std::string computerSystem =
    "CreationClassName:string NameFormat:string PrimaryOwnerName:string "
    "PrimaryOwnerContact:string Roles:string[] OtherIdentifyingInfo:string[] "
    "IdentifyingDescriptions:string[] Dedicated:uint16[] OtherDedicatedDescriptions:string[] "
    "ResetCapability:uint16 PowerManagementCapabilities:uint16[] ";
const std::string capabilities =
    "ElementNameEditSupported:boolean MaxElementNameLen:uint16 RequestedStatesSupported:uint16[] "
    "ElementNameMask:string OptionsSupported:uint16[] IPv6OptionsSupported:uint16[] ";
const std::string ipSetting =
    "ChangeableType:uint16 ConfigurationName:string AddressOrigin:uint16 ProtocolIFType:uint16 ";
const std::string dhcpSetting =
    "RequestedIPv4Address:string RequestedLeaseTime:uint32 ClientIdentifier:string "
    "VendorClassIdentifier:string RequestedOptions:uint16[] RequiredOptions:uint16[] ";
const std::string serviceProperties =
    "PrimaryOwnerName:string PrimaryOwnerContact:string StartMode:string Started:boolean ";
const std::string communicationMechanism =
    "CommunicationMechanism:uint16 OtherCommunicationMechanismDescription:string "
    "FunctionalProfilesSupported:uint16[] FunctionalProfileDescriptions:string[] "
    "MultipleOperationsSupported:boolean AuthenticationMechanismsSupported:uint16[] "
    "AuthenticationMechanismDescriptions:string[] Version:string AdvertiseTypes:uint16[] "
    "AdvertiseTypeDescriptions:string[] ";
const std::string nameSpace =
    "SystemCreationClassName:string SystemName:string ObjectManagerCreationClassName:string "
    "ObjectManagerName:string CreationClassName:string Name:string ClassInfo:uint16 "
    "DescriptionOfClassInfo:string ";
const std::string registeredSpecification =
    "SpecificationType:uint16 RegisteredOrganization:uint16 OtherRegisteredOrganization:string "
    "RegisteredName:string RegisteredVersion:string AdvertiseTypes:uint16[] "
    "AdvertiseTypeDescriptions:string[] ";

const std::string indication =
    "IndicationIdentifier:string CorrelatedIndications:string[] IndicationTime:datetime "
    "PerceivedSeverity:uint16 OtherSeverity:string IndicationFilterName:string "
    "SequenceContext:string SequenceNumber:sint64 SourceInstance:string "
    "SourceInstanceModelPath:string SourceInstanceHost:string ";

struct Expected {
    std::string name;
    std::string superclass;
    std::string properties;
    std::size_t count;
    std::set<std::string> keys;
};

class SchemaClass : public testing::TestWithParam<Expected> {};

TEST_P(SchemaClass, HasItsParentPropertiesAndKeys) {
    const Expected& expected = GetParam();
    const ClassDeclaration& declaration = classOf(expected.name);
    EXPECT_EQ(declaration.name, expected.name);
    EXPECT_EQ(declaration.superclass, expected.superclass);
    EXPECT_EQ(listed(declaration), expected.properties);
    EXPECT_EQ(declaration.properties.size(), expected.count);
    std::set<std::string> keys;
    for (const PropertyDeclaration& each : declaration.properties) {
        if (each.isKey()) {
            keys.insert(each.name);
        }
    }
    EXPECT_EQ(keys, expected.keys);
}

const std::set<std::string> accessPointKeys{"SystemCreationClassName", "SystemName",
                                            "CreationClassName", "Name"};
const std::set<std::string> systemKeys{"CreationClassName", "Name"};
const std::set<std::string> instanceId{"InstanceID"};
const std::set<std::string> dependency{"Antecedent", "Dependent"};

INSTANTIATE_TEST_SUITE_P(
    Elements, SchemaClass,
    testing::Values(
        Expected{"CIM_ManagedElement", "", managedElement, 4, {}},
        Expected{"CIM_ManagedSystemElement",
                 "CIM_ManagedElement",
                 managedElement + managedSystemElement,
                 14,
                 {}},
        Expected{"CIM_LogicalElement",
                 "CIM_ManagedSystemElement",
                 managedElement + managedSystemElement,
                 14,
                 {}},
        Expected{"CIM_EnabledLogicalElement", "CIM_LogicalElement", element, 21, {}},
        Expected{"CIM_ServiceAccessPoint", "CIM_EnabledLogicalElement", element + accessPoint, 24,
                 accessPointKeys},
        Expected{"CIM_ProtocolEndpoint", "CIM_ServiceAccessPoint",
                 element + accessPoint + protocolEndpoint, 28, accessPointKeys},
        Expected{"CIM_DHCPProtocolEndpoint", "CIM_ProtocolEndpoint",
                 element + accessPoint + protocolEndpoint + dhcpEndpoint, 35, accessPointKeys},
        Expected{"CIM_IPProtocolEndpoint", "CIM_ProtocolEndpoint",
                 element + accessPoint + protocolEndpoint + ipEndpoint, 38, accessPointKeys},
        Expected{"CIM_RemoteServiceAccessPoint", "CIM_ServiceAccessPoint",
                 element + accessPoint + remoteAccessPoint, 29, accessPointKeys},
        Expected{"CIM_ComputerSystem", "CIM_System", element + computerSystem, 32, systemKeys},
        Expected{"CIM_DHCPCapabilities", "CIM_EnabledLogicalElementCapabilities",
                 managedElement + capabilities, 10, instanceId},
        Expected{"CIM_IPAssignmentSettingData", "CIM_SettingData", managedElement + ipSetting, 8,
                 instanceId},
        Expected{"CIM_DHCPSettingData", "CIM_IPAssignmentSettingData",
                 managedElement + ipSetting + dhcpSetting, 14, instanceId},
        Expected{"CIM_ObjectManager", "CIM_WBEMService",
                 element + accessPoint + serviceProperties + "GatherStatisticalData:boolean ", 29,
                 accessPointKeys},
        Expected{"CIM_ObjectManagerCommunicationMechanism", "CIM_ServiceAccessPoint",
                 element + accessPoint + communicationMechanism, 34, accessPointKeys},
        Expected{"CIM_Namespace",
                 "CIM_ManagedElement",
                 managedElement + nameSpace,
                 12,
                 {"SystemCreationClassName", "SystemName", "ObjectManagerCreationClassName",
                  "ObjectManagerName", "CreationClassName", "Name"}},
        Expected{"CIM_RegisteredProfile", "CIM_RegisteredSpecification",
                 managedElement + registeredSpecification + "ImplementedFeatures:string[] ", 12,
                 instanceId},
        Expected{"CIM_ElementConformsToProfile",
                 "",
                 "ConformantStandard:CIM_RegisteredProfile ManagedElement:CIM_ManagedElement ",
                 2,
                 {"ConformantStandard", "ManagedElement"}},
        Expected{"CIM_ReferencedProfile", "CIM_ReferencedSpecification",
                 "Antecedent:CIM_RegisteredProfile Dependent:CIM_RegisteredProfile ", 2,
                 dependency},
        Expected{"CIM_IndicationFilter", "CIM_ManagedElement",
                 managedElement + accessPoint +
                     "Name:string SourceNamespace:string SourceNamespaces:string[] "
                     "IndividualSubscriptionSupported:boolean Query:string QueryLanguage:string ",
                 13, accessPointKeys},
        Expected{"CIM_ListenerDestinationCIMXML", "CIM_ListenerDestination",
                 managedElement + accessPoint +
                     "Name:string PersistenceType:uint16 OtherPersistenceType:string "
                     "Destination:string Protocol:uint16 OtherProtocol:string ",
                 13, accessPointKeys},
        Expected{"CIM_IndicationSubscription",
                 "",
                 "Filter:CIM_IndicationFilter Handler:CIM_ListenerDestination "
                 "OnFatalErrorPolicy:uint16 OtherOnFatalErrorPolicy:string "
                 "FailureTriggerTimeInterval:uint64 SubscriptionState:uint16 "
                 "OtherSubscriptionState:string TimeOfLastStateChange:datetime "
                 "SubscriptionDuration:uint64 SubscriptionStartTime:datetime "
                 "SubscriptionTimeRemaining:uint64 RepeatNotificationPolicy:uint16 "
                 "SubscriptionInfo:string ",
                 13,
                 {"Filter", "Handler"}},
        Expected{"CIM_IndicationService", "CIM_Service",
                 element + accessPoint + serviceProperties +
                     "FilterCreationEnabled:boolean DeliveryRetryAttempts:uint16 "
                     "DeliveryRetryInterval:uint32 SubscriptionRemovalAction:uint16 "
                     "SubscriptionRemovalTimeInterval:uint32 ",
                 33, accessPointKeys},
        Expected{"CIM_InstCreation", "CIM_InstIndication", indication, 11, {}},
        Expected{"CIM_InstDeletion", "CIM_InstIndication", indication, 11, {}},
        Expected{"CIM_InstModification",
                 "CIM_InstIndication",
                 indication + "PreviousInstance:string ",
                 12,
                 {}},
        Expected{"CIM_NamespaceInManager", "CIM_Dependency",
                 "Antecedent:CIM_ObjectManager Dependent:CIM_Namespace ", 2, dependency},
        Expected{"CIM_CommMechanismForManager", "CIM_ServiceAccessBySAP",
                 "Antecedent:CIM_ObjectManager "
                 "Dependent:CIM_ObjectManagerCommunicationMechanism ",
                 2, dependency},
        Expected{"QVXZR_ComputerSystem", "CIM_ComputerSystem", element + computerSystem, 32,
                 systemKeys},
        Expected{"QVXZR_SPComputerSystem", "CIM_ComputerSystem", element + computerSystem, 32,
                 systemKeys},
        Expected{"QVXZR_IPProtocolEndpoint", "CIM_IPProtocolEndpoint",
                 element + accessPoint + protocolEndpoint + ipEndpoint, 38, accessPointKeys},
        Expected{"QVXZR_IPAssignmentSettingData", "CIM_IPAssignmentSettingData",
                 managedElement + ipSetting, 8, instanceId},
        Expected{"QVXZR_DHCPProtocolEndpoint", "CIM_DHCPProtocolEndpoint",
                 element + accessPoint + protocolEndpoint + dhcpEndpoint +
                     "BroadcastResetSupported:boolean ",
                 36, accessPointKeys},
        Expected{"QVXZR_DHCPCapabilities", "CIM_DHCPCapabilities",
                 managedElement + capabilities + "StateAwareness:uint16[] ", 11, instanceId},
        Expected{"QVXZR_DHCPSettingData", "CIM_DHCPSettingData",
                 managedElement + ipSetting + dhcpSetting, 14, instanceId},
        Expected{"QVXZR_DHCPRemoteServiceAccessPoint", "CIM_RemoteServiceAccessPoint",
                 element + accessPoint + remoteAccessPoint, 29, accessPointKeys},
        Expected{"QVXZR_DHCPLease", "CIM_ManagedElement",
                 managedElement +
                     "InterfaceID:string Family:string ClientState:uint16 Address:string "
                     "ServerAddress:string LeaseObtained:datetime RenewalTime:datetime "
                     "RebindingTime:datetime LeaseExpires:datetime OptionsReceived:uint16[] "
                     "ClientIdentifier:string ClientName:string Process:uint32 "
                     "ClientRuns:boolean Source:string ",
                 19, instanceId},
        Expected{"QVXZR_DHCPInterface", "CIM_ManagedElement",
                 managedElement +
                     "DHCPEnabled:boolean LinkUp:boolean IPv4Address:string AddressOrigin:uint16 ",
                 8, instanceId},
        Expected{"QVXZR_DHCPDiagnostic", "CIM_ManagedElement", managedElement + "Kind:uint16 ", 5,
                 instanceId}),
    [](const auto& test) { return test.param.name; });

INSTANTIATE_TEST_SUITE_P(
    Associations, SchemaClass,
    testing::Values(
        Expected{"CIM_Dependency", "",
                 "Antecedent:CIM_ManagedElement Dependent:CIM_ManagedElement ", 2, dependency},
        Expected{"CIM_HostedDependency", "CIM_Dependency",
                 "Antecedent:CIM_ManagedElement Dependent:CIM_ManagedElement ", 2, dependency},
        Expected{"CIM_HostedAccessPoint", "CIM_HostedDependency",
                 "Antecedent:CIM_System Dependent:CIM_ServiceAccessPoint ", 2, dependency},
        Expected{"CIM_SAPSAPDependency", "CIM_Dependency",
                 "Antecedent:CIM_ServiceAccessPoint Dependent:CIM_ServiceAccessPoint ", 2,
                 dependency},
        Expected{"CIM_RemoteAccessAvailableToElement", "CIM_Dependency",
                 "Antecedent:CIM_RemoteServiceAccessPoint Dependent:CIM_EnabledLogicalElement "
                 "IsDefault:boolean OrderOfAccess:uint16 ",
                 4, dependency},
        Expected{"CIM_Component",
                 "",
                 "GroupComponent:CIM_ManagedElement PartComponent:CIM_ManagedElement ",
                 2,
                 {"GroupComponent", "PartComponent"}},
        Expected{"CIM_OrderedComponent",
                 "CIM_Component",
                 "GroupComponent:CIM_ManagedElement PartComponent:CIM_ManagedElement "
                 "AssignedSequence:uint64 ",
                 3,
                 {"GroupComponent", "PartComponent"}},
        Expected{"CIM_ElementCapabilities",
                 "",
                 "ManagedElement:CIM_ManagedElement Capabilities:CIM_Capabilities "
                 "Characteristics:uint16[] ",
                 3,
                 {"ManagedElement", "Capabilities"}},
        Expected{"CIM_ElementSettingData",
                 "",
                 "ManagedElement:CIM_ManagedElement SettingData:CIM_SettingData "
                 "IsDefault:uint16 IsCurrent:uint16 IsNext:uint16 ",
                 5,
                 {"ManagedElement", "SettingData"}},
        Expected{"QVXZR_HostedDHCPPoint", "CIM_HostedAccessPoint",
                 "Antecedent:CIM_ComputerSystem Dependent:QVXZR_DHCPProtocolEndpoint ", 2,
                 dependency},
        Expected{"QVXZR_DHCPRemoteHostedAccessPoint", "CIM_HostedAccessPoint",
                 "Antecedent:CIM_ComputerSystem Dependent:QVXZR_DHCPRemoteServiceAccessPoint ", 2,
                 dependency},
        Expected{"QVXZR_DHCPLeaseOfEndpoint", "CIM_Dependency",
                 "Antecedent:QVXZR_DHCPProtocolEndpoint Dependent:QVXZR_DHCPLease ", 2, dependency},
        Expected{"QVXZR_SAPSAPDependency", "CIM_SAPSAPDependency",
                 "Antecedent:QVXZR_IPProtocolEndpoint Dependent:QVXZR_DHCPProtocolEndpoint ", 2,
                 dependency},
        Expected{"QVXZR_DHCPElementCapabilities",
                 "CIM_ElementCapabilities",
                 "ManagedElement:QVXZR_DHCPProtocolEndpoint Capabilities:QVXZR_DHCPCapabilities "
                 "Characteristics:uint16[] ",
                 3,
                 {"ManagedElement", "Capabilities"}},
        Expected{"QVXZR_DHCPRemoteAccessAvailableToElement", "CIM_RemoteAccessAvailableToElement",
                 "Antecedent:QVXZR_DHCPRemoteServiceAccessPoint "
                 "Dependent:QVXZR_DHCPProtocolEndpoint IsDefault:boolean OrderOfAccess:uint16 ",
                 4, dependency},
        Expected{"QVXZR_DHCPElementSettingData",
                 "CIM_ElementSettingData",
                 "ManagedElement:QVXZR_DHCPProtocolEndpoint SettingData:QVXZR_DHCPSettingData "
                 "IsDefault:uint16 IsCurrent:uint16 IsNext:uint16 ",
                 5,
                 {"ManagedElement", "SettingData"}},
        Expected{"QVXZR_DHCPOrderedComponent",
                 "CIM_OrderedComponent",
                 "GroupComponent:QVXZR_IPAssignmentSettingData "
                 "PartComponent:QVXZR_DHCPSettingData AssignedSequence:uint64 ",
                 3,
                 {"GroupComponent", "PartComponent"}}),
    [](const auto& test) { return test.param.name; });

TEST(Schema, ClassesAreAbstractAndAssociationsAsTheSchemaHasThem) {
    const std::set<std::string> abstract{"CIM_ManagedElement",
                                         "CIM_ManagedSystemElement",
                                         "CIM_LogicalElement",
                                         "CIM_EnabledLogicalElement",
                                         "CIM_ServiceAccessPoint",
                                         "CIM_System",
                                         "CIM_Capabilities",
                                         "CIM_SettingData",
                                         "CIM_Dependency",
                                         "CIM_Component",
                                         "CIM_Service",
                                         "CIM_WBEMService",
                                         "CIM_Indication",
                                         "CIM_InstIndication",
                                         "CIM_ListenerDestination",
                                         "CIM_RegisteredSpecification"};
    for (const ClassDeclaration* each : repository().classes()) {
        EXPECT_EQ(says(each->qualifier("Abstract"), true), abstract.contains(each->name))
            << each->name;
        const bool linked =
            std::any_of(each->properties.begin(), each->properties.end(),
                        [](const auto& property) { return property.type == Type::reference; });
        EXPECT_EQ(each->isAssociation(), linked) << each->name;
    }
    EXPECT_TRUE(says(classOf("CIM_Component").qualifier("Aggregation"), true));
    EXPECT_TRUE(says(classOf("QVXZR_DHCPOrderedComponent").qualifier("Aggregation"), true));
    EXPECT_TRUE(says(
        propertyOf("QVXZR_DHCPOrderedComponent", "GroupComponent").qualifier("Aggregate"), true));
    EXPECT_TRUE(says(propertyOf("QVXZR_HostedDHCPPoint", "Dependent").qualifier("Weak"), true));
}

TEST(Schema, ClassRelationsHoldForEveryName) {
    const std::vector<std::pair<std::string, std::vector<std::string>>> ancestors{
        {"CIM_DHCPProtocolEndpoint",
         {"CIM_ProtocolEndpoint", "CIM_ServiceAccessPoint", "CIM_EnabledLogicalElement",
          "CIM_LogicalElement", "CIM_ManagedSystemElement", "CIM_ManagedElement"}},
        {"CIM_RemoteServiceAccessPoint", {"CIM_ServiceAccessPoint", "CIM_ManagedElement"}},
        {"CIM_ComputerSystem", {"CIM_System", "CIM_EnabledLogicalElement", "CIM_ManagedElement"}},
        {"CIM_DHCPCapabilities",
         {"CIM_EnabledLogicalElementCapabilities", "CIM_Capabilities", "CIM_ManagedElement"}},
        {"CIM_DHCPSettingData",
         {"CIM_IPAssignmentSettingData", "CIM_SettingData", "CIM_ManagedElement"}},
        {"QVXZR_HostedDHCPPoint",
         {"CIM_HostedAccessPoint", "CIM_HostedDependency", "CIM_Dependency"}},
        {"QVXZR_SAPSAPDependency", {"CIM_SAPSAPDependency", "CIM_Dependency"}},
        {"QVXZR_DHCPRemoteAccessAvailableToElement",
         {"CIM_RemoteAccessAvailableToElement", "CIM_Dependency"}},
        {"QVXZR_DHCPElementCapabilities", {"CIM_ElementCapabilities"}},
        {"QVXZR_DHCPElementSettingData", {"CIM_ElementSettingData"}},
        {"QVXZR_DHCPOrderedComponent", {"CIM_OrderedComponent", "CIM_Component"}}};
    for (const auto& [name, above] : ancestors) {
        for (const auto& ancestor : above) {
            EXPECT_TRUE(repository().isA(name, ancestor)) << name << ' ' << ancestor;
            EXPECT_FALSE(repository().isA(ancestor, name)) << ancestor << ' ' << name;
        }
    }
    EXPECT_FALSE(repository().isA("CIM_RemoteServiceAccessPoint", "CIM_ProtocolEndpoint"));
    EXPECT_FALSE(repository().isA("CIM_SAPSAPDependency", "CIM_HostedDependency"));
    EXPECT_FALSE(repository().isA("QVXZR_SPComputerSystem", "QVXZR_ComputerSystem"));
    EXPECT_FALSE(repository().isA("CIM_ElementCapabilities", "CIM_Dependency"));
}

/// Some object managers show a default for every property that a provider leaves unset.
TEST(Schema, NoPropertyHasADefault) {
    for (const ClassDeclaration* each : repository().classes()) {
        for (const PropertyDeclaration& property : each->properties) {
            EXPECT_TRUE(property.defaultValue.isNull()) << each->name << ' ' << property.name;
        }
    }
}

TEST(Schema, EveryClassAndPropertyIsDescribed) {
    const auto described = [](const Qualifier* description) {
        const auto* const text = description == nullptr || description->value.scalar() == nullptr
                                     ? nullptr
                                     : std::get_if<std::string>(description->value.scalar());
        return text != nullptr && text->size() > 5 && text->back() == '.';
    };
    for (const ClassDeclaration* each : repository().classes()) {
        EXPECT_TRUE(described(each->qualifier("Description"))) << each->name;
        for (const PropertyDeclaration& property : each->properties) {
            EXPECT_TRUE(described(property.qualifier("Description")))
                << each->name << ' ' << property.name;
        }
    }
}

TEST(Schema, ClassNamesHaveOneSchemaPrefix) {
    for (const ClassDeclaration* each : repository().classes()) {
        EXPECT_EQ(std::count(each->name.begin(), each->name.end(), '_'), 1) << each->name;
        EXPECT_TRUE(each->name.starts_with("CIM_") || each->name.starts_with("QVXZR_"));
    }
}

/// The full schema that this one is a part of has more of everything.
TEST(Schema, TextsInTheStyleOfTheFullSchemaCanBeReadOnTopOfIt) {
    ClassRepository larger;
    larger.loadDirectory(schemaDirectory());
    larger.loadText(R"(// Copyright
#pragma locale ("en_US")
// ==================================================================
//   A service
// ==================================================================
   [Abstract, Version ( "2.19.0" ),
    UMLPackagePath ( "CIM::Core::Service" ),
    Description (
       "A service with \"quotes\", a back\\slash,\n"
       "and a second line." )]
class CIM_FileService : CIM_EnabledLogicalElement {

      [Propagated ( "CIM_System.CreationClassName" ), Key,
       Description ( "." ), MaxLen ( 256 )]
   string SystemCreationClassName;

      [Override ( "Name" ), Key, MaxLen ( 256 ), MappingStrings { "MIB.IETF|X.y" },
       ModelCorrespondence { "CIM_FileService.Started" }]
   string Name;

      [Override ( "EnabledState" ), Write ( false ), ValueMap { "2", "3..5", "0x8000.." },
       Values { "A", "B", "C" }, Deprecated { "No value" }]
   uint16 EnabledState = 2;

   boolean Started;

      [EmbeddedInstance ( "CIM_Error" ), ArrayType ( "Ordered" )]
   string Errors[];

      [Description ( "Starts it." ), ValueMap { "0", ".." }, Values { "OK", "Other" }]
   uint32 StartService( );

   uint32 RequestChange(
         [In, Description ( "In." ), MinValue ( -5 )]
      sint16 Level,
         [In ( false ), Out, Description ( "Out." )]
      CIM_ConcreteJob REF Job,
         [In, Out, Required]
      datetime Times[]);
};
   [Association, Aggregation, Experimental, Version ( "2.10.0" )]
class CIM_FileServiceComponent : CIM_Component {
      [Aggregate, Override ( "GroupComponent" )]
   CIM_FileService REF GroupComponent;
      [Override ( "PartComponent" ), Max ( 1 )]
   CIM_FileService REF PartComponent;
};
)",
                    "full.mof");
    EXPECT_NO_THROW(larger.complete());
    const ClassDeclaration* const service = larger.find("CIM_FileService");
    ASSERT_NE(service, nullptr);
    EXPECT_TRUE(says(service->qualifier("Description"),
                     std::string("A service with \"quotes\", a back\\slash,\nand a second line.")));
    EXPECT_EQ(service->properties.size(), 24U);
    EXPECT_TRUE(larger.isA("CIM_FileServiceComponent", "CIM_Component"));
}

/// The other reader of this file is in the object manager; here its classes count.
TEST(Schema, RegisteredClassesAreTheElevenServedOnes) {
    std::ifstream file(schemaDirectory() / "exact/DHCPClientProvider.registration");
    ASSERT_TRUE(file);
    std::set<std::string> registered;
    std::string current;
    for (std::string line; std::getline(file, line);) {
        if (line.starts_with('[')) {
            current = line.substr(1, line.find(']') - 1);
            EXPECT_NE(repository().find(current), nullptr) << current;
            registered.insert(current);
        } else if (line.find("type:") != std::string::npos) {
            EXPECT_EQ(line.ends_with(" association"), classOf(current).isAssociation()) << current;
        }
    }
    std::set<std::string> served;
    const std::set<std::string> ends{"QVXZR_ComputerSystem", "QVXZR_SPComputerSystem",
                                     "QVXZR_IPProtocolEndpoint", "QVXZR_IPAssignmentSettingData"};
    const std::set<std::string> extensions{"QVXZR_DHCPLease",
                                           "QVXZR_DHCPLeaseOfEndpoint",
                                           "QVXZR_DHCPInterface",
                                           "QVXZR_DHCPDiagnostic",
                                           "QVXZR_RegisteredDHCPClientProfile",
                                           "QVXZR_DHCPClientConformsToProfile"};
    for (const ClassDeclaration* each : repository().classes()) {
        if (each->name.starts_with("QVXZR_") && !ends.contains(each->name) &&
            !extensions.contains(each->name)) {
            served.insert(each->name);
        }
    }
    EXPECT_EQ(registered, served);
    EXPECT_EQ(registered.size(), 11U);
}

}  // namespace
}  // namespace cimom
