#include <gtest/gtest.h>

#include <algorithm>
#include <set>

#include "ShippedSchema.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/Instance.h"

namespace cimom {
namespace {

using shipped::propertyOf;
using shipped::repository;
using shipped::says;
using shipped::texts;

TEST(SchemaValues, EveryValueHasAName) {
    for (const ClassDeclaration* each : repository().classes()) {
        for (const PropertyDeclaration& property : each->properties) {
            const auto map = texts(property.qualifier("ValueMap"));
            const auto values = texts(property.qualifier("Values"));
            if (property.type != Type::string) {
                EXPECT_EQ(map.size(), values.size()) << each->name << ' ' << property.name;
            }
            EXPECT_EQ(std::set<std::string>(map.begin(), map.end()).size(), map.size())
                << each->name << ' ' << property.name;
        }
    }
}

TEST(SchemaValues, EnumeratedPropertiesHaveValueMaps) {
    const std::vector<std::pair<std::string, std::vector<std::string>>> enumerated{
        {"QVXZR_DHCPProtocolEndpoint",
         {"OperationalStatus", "HealthState", "CommunicationStatus", "DetailedStatus",
          "OperatingStatus", "PrimaryStatus", "EnabledState", "RequestedState", "EnabledDefault",
          "AvailableRequestedStates", "TransitioningToState", "ProtocolType", "ProtocolIFType",
          "ClientState", "OptionsReceived", "Status"}},
        {"QVXZR_DHCPCapabilities",
         {"RequestedStatesSupported", "OptionsSupported", "StateAwareness"}},
        {"QVXZR_DHCPSettingData",
         {"ChangeableType", "AddressOrigin", "ProtocolIFType", "RequestedOptions",
          "RequiredOptions"}},
        {"QVXZR_DHCPRemoteServiceAccessPoint", {"InfoFormat", "AccessContext"}},
        {"QVXZR_DHCPElementSettingData", {"IsDefault", "IsCurrent", "IsNext"}},
        {"QVXZR_DHCPElementCapabilities", {"Characteristics"}},
        {"QVXZR_IPProtocolEndpoint",
         {"AddressOrigin", "AddressType", "IPVersionSupport", "IPv6AddressType"}},
        {"QVXZR_ComputerSystem",
         {"NameFormat", "Dedicated", "ResetCapability", "PowerManagementCapabilities"}}};
    for (const auto& [name, properties] : enumerated) {
        for (const auto& property : properties) {
            EXPECT_FALSE(texts(propertyOf(name, property).qualifier("ValueMap")).empty())
                << name << ' ' << property;
        }
    }
}

std::string nameOf(std::string_view className, std::string_view property,
                   const std::string& value) {
    const PropertyDeclaration& declaration = propertyOf(className, property);
    const auto map = texts(declaration.qualifier("ValueMap"));
    const auto values = texts(declaration.qualifier("Values"));
    const auto found = std::find(map.begin(), map.end(), value);
    return found == map.end() ? "" : values.at(static_cast<std::size_t>(found - map.begin()));
}

TEST(SchemaValues, ValuesThatTheProviderUsesHaveTheirNames) {
    const char* const endpoint = "QVXZR_DHCPProtocolEndpoint";
    EXPECT_EQ(nameOf(endpoint, "EnabledState", "2"), "Enabled");
    EXPECT_EQ(nameOf(endpoint, "EnabledState", "6"), "Enabled but Offline");
    EXPECT_EQ(nameOf(endpoint, "RequestedState", "3"), "Disabled");
    EXPECT_EQ(nameOf(endpoint, "ClientState", "8"), "Bound");
    EXPECT_EQ(nameOf(endpoint, "ProtocolIFType", "1"), "Other");
    const char* const server = "QVXZR_DHCPRemoteServiceAccessPoint";
    EXPECT_EQ(nameOf(server, "AccessContext", "6"), "DHCP Server");
    EXPECT_EQ(nameOf(server, "AccessContext", "7"), "SMTP Server");
    EXPECT_EQ(nameOf(server, "AccessContext", "9"), "Network Time Protocol (NTP) Server");
    EXPECT_EQ(nameOf(server, "InfoFormat", "3"), "IPv4 Address");
    EXPECT_EQ(nameOf(server, "InfoFormat", "206"), "Parameterized URL");
    EXPECT_EQ(nameOf("QVXZR_DHCPSettingData", "AddressOrigin", "4"), "DHCP");
    EXPECT_EQ(nameOf("QVXZR_IPAssignmentSettingData", "AddressOrigin", "11"),
              "cumulative configuration");
    EXPECT_EQ(nameOf("QVXZR_DHCPElementSettingData", "IsCurrent", "1"), "Is Current");
}

TEST(SchemaValues, OneMapOfNinetyThreeOptionsServesAllOptionLists) {
    const std::vector<std::pair<std::string, std::string>> lists{
        {"QVXZR_DHCPProtocolEndpoint", "OptionsReceived"},
        {"QVXZR_DHCPCapabilities", "OptionsSupported"},
        {"QVXZR_DHCPSettingData", "RequestedOptions"},
        {"QVXZR_DHCPSettingData", "RequiredOptions"}};
    const auto& first = propertyOf(lists[0].first, lists[0].second);
    EXPECT_EQ(texts(first.qualifier("ValueMap")).size(), 93U);
    for (const auto& [name, property] : lists) {
        const auto& each = propertyOf(name, property);
        EXPECT_EQ(texts(each.qualifier("ValueMap")), texts(first.qualifier("ValueMap")));
        EXPECT_EQ(texts(each.qualifier("Values")), texts(first.qualifier("Values")));
        EXPECT_EQ(nameOf(name, property, "0"), "Unknown");
        EXPECT_EQ(nameOf(name, property, "8"), "Domain Name Server");
        EXPECT_EQ(nameOf(name, property, "14"), "Host Name");
        EXPECT_EQ(nameOf(name, property, "17"), "Domain Name");
        EXPECT_EQ(nameOf(name, property, "53"), "Lease Time");
        EXPECT_EQ(nameOf(name, property, "85..118"), "DMTF Reserved");
        EXPECT_EQ(nameOf(name, property, "257"), "End");
        EXPECT_EQ(nameOf(name, property, "32768..65535"), "Vendor Reserved");
    }
}

TEST(SchemaValues, CardinalitiesAndBoundsHold) {
    const std::uint64_t one = 1;
    for (const char* name : {"QVXZR_HostedDHCPPoint", "QVXZR_DHCPRemoteHostedAccessPoint"}) {
        EXPECT_TRUE(says(propertyOf(name, "Antecedent").qualifier("Min"), one));
        EXPECT_TRUE(says(propertyOf(name, "Antecedent").qualifier("Max"), one));
        EXPECT_EQ(propertyOf(name, "Dependent").qualifier("Max"), nullptr);
    }
    EXPECT_TRUE(says(propertyOf("CIM_HostedDependency", "Antecedent").qualifier("Max"), one));
    EXPECT_TRUE(
        says(propertyOf("QVXZR_DHCPElementCapabilities", "ManagedElement").qualifier("Min"), one));
    EXPECT_TRUE(
        says(propertyOf("QVXZR_DHCPCapabilities", "MaxElementNameLen").qualifier("MaxValue"),
             std::int64_t{256}));
    EXPECT_TRUE(says(propertyOf("QVXZR_DHCPProtocolEndpoint", "Name").qualifier("MaxLen"),
                     std::uint64_t{256}));
    EXPECT_TRUE(says(propertyOf("CIM_ManagedSystemElement", "Name").qualifier("MaxLen"),
                     std::uint64_t{1024}));
}

TEST(SchemaValues, OnlyTheConfigurationNameOfTheServedClassIsMadeWritable) {
    EXPECT_TRUE(
        says(propertyOf("QVXZR_DHCPSettingData", "ConfigurationName").qualifier("Write"), true));
    EXPECT_EQ(propertyOf("CIM_DHCPSettingData", "ConfigurationName").qualifier("Write"), nullptr);
    EXPECT_TRUE(
        says(propertyOf("CIM_DHCPSettingData", "ClientIdentifier").qualifier("Write"), true));
    EXPECT_TRUE(
        says(propertyOf("QVXZR_DHCPSettingData", "ElementName").qualifier("Required"), true));
}

}  // namespace
}  // namespace cimom
