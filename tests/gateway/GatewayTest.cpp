#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <fstream>
#include <sstream>

#include "GatewayFixture.h"
#include "kit/Files.h"

namespace gateway {
namespace {

using cimom::Value;
using strict::StrictHost;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::SizeIs;
using ::testing::UnorderedElementsAre;
using Filter = StrictHost::Filter;

constexpr std::array elements{"QVXZR_DHCPProtocolEndpoint", "QVXZR_DHCPCapabilities",
                              "QVXZR_DHCPSettingData", "QVXZR_DHCPRemoteServiceAccessPoint"};
constexpr std::array associations{"QVXZR_DHCPElementCapabilities",
                                  "QVXZR_SAPSAPDependency",
                                  "QVXZR_HostedDHCPPoint",
                                  "QVXZR_DHCPRemoteAccessAvailableToElement",
                                  "QVXZR_DHCPRemoteHostedAccessPoint",
                                  "QVXZR_DHCPElementSettingData",
                                  "QVXZR_DHCPOrderedComponent"};

/// With each trait of object managers.
class GatewayWith : public GatewayTest, public ::testing::WithParamInterface<strict::NamedTraits> {
  protected:
    GatewayWith() : GatewayTest(GetParam().traits) {}
};

INSTANTIATE_TEST_SUITE_P(Trait, GatewayWith, ::testing::ValuesIn(strict::testedTraits()),
                         [](const auto& each) { return std::string(each.param.name); });

TEST_P(GatewayWith, GetsEveryInstanceThatItLists) {
    std::vector<const char*> all(elements.begin(), elements.end());
    all.insert(all.end(), associations.begin(), associations.end());
    for (const char* className : all) {
        const auto names = host_.enumerateNames(pathOf(className)).paths;
        const auto instances = host_.enumerate(pathOf(className)).instances;
        ASSERT_EQ(names.size(), instances.size()) << className;
        EXPECT_THAT(names, Not(IsEmpty())) << className;
        for (std::size_t i = 0; i < names.size(); ++i) {
            EXPECT_EQ(instances[i].path, names[i]);
            const auto response = host_.get(names[i]);
            ASSERT_THAT(response.instances, SizeIs(1)) << brief(names[i]);
            EXPECT_EQ(response.instances.front(), instances[i]);
        }
    }
}

TEST_P(GatewayWith, EveryAssociationIsSeenFromBothEnds) {
    for (const char* className : associations) {
        for (const auto& path : host_.enumerateNames(pathOf(className)).paths) {
            for (std::size_t end = 0; end < 2; ++end) {
                const cimom::NamedValue& near = path.keys.at(end);
                const cimom::NamedValue& far = path.keys.at(1 - end);
                const auto& nearPath = *referenceOf(near.value);
                const auto& farPath = *referenceOf(far.value);
                const Filter filter{className, nullptr, near.name.c_str(), far.name.c_str()};
                EXPECT_THAT(host_.referenceNames(nearPath, filter).paths, ::testing::Contains(path))
                    << brief(path);
                EXPECT_THAT(host_.associatorNames(nearPath, filter).paths,
                            ::testing::Contains(farPath))
                    << brief(path);
            }
        }
    }
}

TEST_P(GatewayWith, NamesAndInstancesAreTheSame) {
    for (const auto& source :
         {endpoint("eth0"), endpoint("my_nic"), computer(), serviceProcessor(), ipEndpoint("eth0"),
          accessPoint("my_nic_IPv4"), setting("Computer%eth0"), setting("BMC%bmc0")}) {
        EXPECT_EQ(briefs(host_.associatorNames(source, {}).paths),
                  briefs(host_.associators(source, {}).instances))
            << brief(source);
        EXPECT_EQ(briefs(host_.referenceNames(source, {}).paths),
                  briefs(host_.references(source, {}).instances))
            << brief(source);
    }
}

TEST_P(GatewayWith, AnEndpointHasItsOwnAssociatorsOnly) {
    EXPECT_THAT(
        briefs(host_.associatorNames(endpoint("eth0"), {}).paths),
        UnorderedElementsAre(
            "DHCPCapabilities eth0", "ComputerSystem " + hostName(), "IPProtocolEndpoint eth0",
            "DHCPRemoteServiceAccessPoint eth0_IPv4", "DHCPRemoteServiceAccessPoint eth0_IPv6",
            "DHCPSettingData Computer%eth0", "RegisteredDHCPClientProfile QVXZR:DHCP Client"));
    // It has no address, and so no IP side.
    EXPECT_THAT(briefs(host_.associatorNames(endpoint("eth2"), {}).paths),
                UnorderedElementsAre("DHCPCapabilities eth2", "ComputerSystem " + hostName(),
                                     "DHCPSettingData Computer%eth2",
                                     "RegisteredDHCPClientProfile QVXZR:DHCP Client"));
    EXPECT_THAT(
        briefs(host_.associatorNames(accessPoint("my_nic_IPv4"), {}).paths),
        UnorderedElementsAre("ComputerSystem " + hostName(), "DHCPProtocolEndpoint my_nic"));
}

TEST_P(GatewayWith, EachComputerHostsItsOwnEndpoints) {
    const Filter hosted{"QVXZR_HostedDHCPPoint", nullptr, nullptr, nullptr};
    EXPECT_THAT(briefs(host_.associatorNames(computer(), hosted).paths),
                ElementsAre("DHCPProtocolEndpoint eth0", "DHCPProtocolEndpoint my_nic",
                            "DHCPProtocolEndpoint eth2"));
    EXPECT_THAT(briefs(host_.associatorNames(serviceProcessor(), hosted).paths),
                ElementsAre("DHCPProtocolEndpoint bmc0"));
    EXPECT_THAT(briefs(host_.enumerateNames(pathOf("QVXZR_HostedDHCPPoint")).paths),
                ::testing::Contains("HostedDHCPPoint Dependent=DHCPProtocolEndpoint bmc0 "
                                    "Antecedent=SPComputerSystem BMC:-1"));
}

TEST_P(GatewayWith, EveryEndpointHasItsSettingWhateverComesFirst) {
    EXPECT_THAT(briefs(host_.enumerateNames(pathOf("QVXZR_DHCPElementSettingData")).paths),
                ElementsAre("DHCPElementSettingData SettingData=DHCPSettingData Computer%eth0 "
                            "ManagedElement=DHCPProtocolEndpoint eth0",
                            "DHCPElementSettingData SettingData=DHCPSettingData Computer%my_nic "
                            "ManagedElement=DHCPProtocolEndpoint my_nic",
                            "DHCPElementSettingData SettingData=DHCPSettingData Computer%eth2 "
                            "ManagedElement=DHCPProtocolEndpoint eth2",
                            "DHCPElementSettingData SettingData=DHCPSettingData BMC%bmc0 "
                            "ManagedElement=DHCPProtocolEndpoint bmc0"));
}

TEST_P(GatewayWith, GetsOnlyWhatIsNamedCompletely) {
    EXPECT_EQ(host_.get(setting("Computer%nothing")).code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(host_.get(setting("computer%eth0")).code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(host_.get(endpoint("fixed0")).code, CMPI_RC_ERR_NOT_FOUND);
    const auto missing = host_.get(pathOf("QVXZR_DHCPProtocolEndpoint", {{"Name", "eth0"}}));
    EXPECT_EQ(missing.code, CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(missing.message,
              "the key SystemCreationClassName of QVXZR_DHCPProtocolEndpoint is missing");
    auto more = setting("Computer%eth0");
    more.keys.push_back({"Name", Value::ofString("eth0")});
    EXPECT_EQ(host_.get(more).code, CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(host_.get(pathOf("QVXZR_DHCPSettingData")).code, CMPI_RC_ERR_INVALID_PARAMETER);
}

TEST_F(GatewayTest, NamesOfClassesAndKeysHaveNoCase) {
    const auto response =
        host_.get(pathOf("qvxzr_dhcpsettingdata", {{"instanceid", "Computer%eth0"}}));
    ASSERT_THAT(response.instances, SizeIs(1));
    EXPECT_EQ(brief(response.instances.front().path), "DHCPSettingData Computer%eth0");
    cimom::ObjectPath lower = endpoint("eth0");
    for (cimom::NamedValue& key : lower.keys) {
        std::transform(key.name.begin(), key.name.end(), key.name.begin(),
                       [](unsigned char letter) { return std::tolower(letter); });
    }
    EXPECT_THAT(host_.get(lower).instances, SizeIs(1));
    EXPECT_THAT(host_.associatorNames(lower, {}).paths, SizeIs(7));
}

TEST_F(GatewayTest, TellsAssociationsThatAreNotThere) {
    const auto paths = host_.enumerateNames(pathOf("QVXZR_DHCPElementCapabilities")).paths;
    ASSERT_THAT(paths, SizeIs(4));
    cimom::ObjectPath crossed = paths.front();
    crossed.keys.at(1) = paths.at(1).keys.at(1);
    const auto response = host_.get(crossed);
    EXPECT_EQ(response.code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(response.message,
              "there is no QVXZR_DHCPElementCapabilities.ManagedElement=a "
              "QVXZR_DHCPProtocolEndpoint,Capabilities=a QVXZR_DHCPCapabilities");
    crossed.keys.pop_back();
    EXPECT_EQ(host_.get(crossed).code, CMPI_RC_ERR_INVALID_PARAMETER);
}

/// The filters, with the names that clients send: of any case, and of superclasses.
struct Filtered {
    const char* name;
    Filter filter;
    Texts associators;
};

class GatewayFilter : public GatewayTest, public ::testing::WithParamInterface<Filtered> {};

TEST_P(GatewayFilter, IsApplied) {
    const auto response = host_.associatorNames(endpoint("my_nic"), GetParam().filter);
    EXPECT_EQ(response.code, CMPI_RC_OK);
    Texts expected = GetParam().associators;
    for (std::string& text : expected) {
        text += text == "ComputerSystem " ? hostName() : "";
    }
    EXPECT_THAT(briefs(response.paths), ::testing::UnorderedElementsAreArray(expected));
    if (GetParam().filter.resultClass == nullptr && GetParam().filter.resultRole == nullptr) {
        EXPECT_THAT(host_.references(endpoint("my_nic"), GetParam().filter).instances,
                    SizeIs(expected.size()));
    }
}

INSTANTIATE_TEST_SUITE_P(
    Of, GatewayFilter,
    ::testing::Values(
        Filtered{"Association",
                 {"qvxzr_sapsapdependency", nullptr, nullptr, nullptr},
                 {"IPProtocolEndpoint my_nic"}},
        Filtered{
            "Superclass", {"CIM_HostedDependency", nullptr, nullptr, nullptr}, {"ComputerSystem "}},
        Filtered{"OldestSuperclass",
                 {"cim_dependency", nullptr, nullptr, nullptr},
                 {"ComputerSystem ", "IPProtocolEndpoint my_nic",
                  "DHCPRemoteServiceAccessPoint my_nic_IPv4"}},
        Filtered{"ResultClass",
                 {nullptr, "CIM_ServiceAccessPoint", nullptr, nullptr},
                 {"IPProtocolEndpoint my_nic", "DHCPRemoteServiceAccessPoint my_nic_IPv4"}},
        Filtered{"ResultClassOfAll",
                 {"", "CIM_SettingData", "", ""},
                 {"DHCPSettingData Computer%my_nic"}},
        Filtered{"Role",
                 {nullptr, nullptr, "managedelement", nullptr},
                 {"DHCPCapabilities my_nic", "DHCPSettingData Computer%my_nic",
                  "RegisteredDHCPClientProfile QVXZR:DHCP Client"}},
        Filtered{
            "ResultRole", {nullptr, nullptr, nullptr, "CAPABILITIES"}, {"DHCPCapabilities my_nic"}},
        Filtered{"OtherRole", {"CIM_Dependency", nullptr, "Antecedent", nullptr}, {}},
        Filtered{"OtherAssociation", {"CIM_Component", nullptr, nullptr, nullptr}, {}},
        Filtered{"UnknownAssociation", {"TEST_None", nullptr, nullptr, nullptr}, {}},
        Filtered{"UnknownResultClass", {nullptr, "TEST_None", nullptr, nullptr}, {}}),
    [](const auto& each) { return std::string(each.param.name); });

TEST_F(GatewayTest, AStrangersSourceHasNothingAndOneThatIsNotThereIsTold) {
    for (const auto& stranger : {pathOf("TEST_Thing", {{"Name", "eth0"}}),
                                 pathOf("QVXZR_HostedDHCPPoint"), pathOf("CIM_ComputerSystem")}) {
        EXPECT_EQ(host_.associatorNames(stranger, {}).code, CMPI_RC_OK);
        EXPECT_EQ(host_.associators(stranger, {}).code, CMPI_RC_OK);
        EXPECT_EQ(host_.referenceNames(stranger, {}).code, CMPI_RC_OK);
        EXPECT_EQ(host_.references(stranger, {}).code, CMPI_RC_OK);
        EXPECT_THAT(host_.references(stranger, {}).instances, IsEmpty());
    }
    cimom::ObjectPath nowhere = computer();
    nowhere.keys.back().value = Value::ofString("elsewhere");
    for (const auto& missing : {endpoint("eth9"), setting("Computer%eth9"), nowhere,
                                ipEndpoint("eth2"), accessPoint("eth0_IPv5")}) {
        const auto response = host_.associators(missing, {});
        EXPECT_EQ(response.code, CMPI_RC_ERR_NOT_FOUND) << brief(missing);
        EXPECT_THAT(response.message, HasSubstr("there is no " + missing.className))
            << brief(missing);
        EXPECT_EQ(host_.referenceNames(missing, {}).code, CMPI_RC_ERR_NOT_FOUND);
        // Whatever it is asked for.
        EXPECT_EQ(host_.references(missing, {"CIM_Component", nullptr, nullptr, nullptr}).code,
                  CMPI_RC_ERR_NOT_FOUND);
    }
}

TEST_P(GatewayWith, PropertyListsAreApplied) {
    std::array<const char*, 4> list{"configurationname", "InstanceID", "NoSuchProperty", nullptr};
    std::ofstream(dataDirectory() + "ifcfg-eth0") << "CONFIG_NAME=office\n";
    const auto instance = host_.get(setting("Computer%eth0"), list.data()).instances.at(0);
    for (const cimom::NamedValue& property : instance.properties) {
        // What the host shows of itself are defaults, which are null here.
        EXPECT_TRUE(property.value.isNull() || property.name == "ConfigurationName" ||
                    property.name == "InstanceID")
            << property.name;
    }
    EXPECT_EQ(*instance.property("ConfigurationName"), Value::ofString("office"));
    EXPECT_EQ(*instance.property("InstanceID"), Value::ofString("Computer%eth0"));
    std::array<const char*, 1> none{nullptr};
    const auto bare = host_.get(endpoint("eth0"), none.data()).instances.at(0);
    for (const cimom::NamedValue& property : bare.properties) {
        EXPECT_TRUE(property.value.isNull()) << property.name;
    }
    std::array<const char*, 2> own{"AssignedSequence", nullptr};
    for (const auto& each :
         host_.enumerate(pathOf("QVXZR_DHCPOrderedComponent"), own.data()).instances) {
        // Some object managers want the references of the path.
        EXPECT_FALSE(each.property("PartComponent")->isNull());
        EXPECT_FALSE(each.property("AssignedSequence")->isNull());
    }
    std::array<const char*, 2> address{"IPv4Address", nullptr};
    const auto far = host_.associators(
        endpoint("eth0"), {"QVXZR_SAPSAPDependency", nullptr, nullptr, nullptr}, address.data());
    ASSERT_THAT(far.instances, SizeIs(1));
    EXPECT_EQ(*far.instances.front().property("IPv4Address"), Value::ofString("192.0.2.10"));
    EXPECT_TRUE(far.instances.front().property("ElementName") == nullptr ||
                far.instances.front().property("ElementName")->isNull());
}

/// Those of which object managers would show the default of the standard schema.
TEST_P(GatewayWith, WhatIsNotKnownIsNullAndHasNoDefault) {
    const auto expectNull = [this](const char* className,
                                   std::initializer_list<const char*> names) {
        const auto response = host_.enumerate(pathOf(className));
        EXPECT_THAT(response.instances, Not(IsEmpty()));
        for (const auto& instance : response.instances) {
            for (const char* name : names) {
                const Value* value = instance.property(name);
                ASSERT_NE(value, nullptr) << className << '.' << name;
                EXPECT_TRUE(value->isNull()) << className << '.' << name;
            }
        }
    };
    expectNull("QVXZR_DHCPProtocolEndpoint", {"EnabledDefault", "TransitioningToState"});
    expectNull("QVXZR_DHCPRemoteServiceAccessPoint",
               {"EnabledState", "RequestedState", "EnabledDefault", "TransitioningToState"});
    std::array<const char*, 2> list{"Caption", nullptr};
    const auto asked = host_.get(endpoint("eth0"), list.data()).instances.at(0);
    ASSERT_NE(asked.property("Caption"), nullptr);
    EXPECT_TRUE(asked.property("Caption")->isNull());
}

TEST_F(GatewayTest, SeveralServersOfAnInterfaceHaveNoOrder) {
    const auto ordersOf = [](const std::vector<cimom::Instance>& instances) {
        Texts orders;
        for (const auto& instance : instances) {
            const cimom::Scalar* order = instance.property("OrderOfAccess")->scalar();
            orders.push_back(brief(*referenceOf(*instance.path.key("Antecedent"))) + ": " +
                             std::to_string(std::get<std::uint64_t>(*order)));
        }
        return orders;
    };
    const char* const available = "QVXZR_DHCPRemoteAccessAvailableToElement";
    const Filter filter{available, nullptr, nullptr, nullptr};
    EXPECT_THAT(ordersOf(host_.enumerate(pathOf(available)).instances),
                ElementsAre("DHCPRemoteServiceAccessPoint eth0_IPv4: 0",
                            "DHCPRemoteServiceAccessPoint eth0_IPv6: 0",
                            "DHCPRemoteServiceAccessPoint my_nic_IPv4: 1",
                            "DHCPRemoteServiceAccessPoint bmc0_IPv4: 1"));
    EXPECT_THAT(ordersOf(host_.references(endpoint("eth0"), filter).instances),
                ElementsAre("DHCPRemoteServiceAccessPoint eth0_IPv4: 0",
                            "DHCPRemoteServiceAccessPoint eth0_IPv6: 0"));
    EXPECT_THAT(ordersOf(host_.references(accessPoint("eth0_IPv6"), filter).instances),
                ElementsAre("DHCPRemoteServiceAccessPoint eth0_IPv6: 0"));
    EXPECT_THAT(ordersOf(host_.references(accessPoint("my_nic_IPv4"), filter).instances),
                ElementsAre("DHCPRemoteServiceAccessPoint my_nic_IPv4: 1"));
}

TEST_F(GatewayTest, RefusesTheRestWithAMessage) {
    const cimom::Instance instance{setting("Computer%eth0"), {}};
    for (const auto& response : {host_.create(instance), host_.remove(instance.path),
                                 host_.query(instance.path, "", "")}) {
        EXPECT_EQ(response.code, CMPI_RC_ERR_NOT_SUPPORTED);
        EXPECT_THAT(response.message, Not(IsEmpty()));
    }
}

/// The level of a line is its second field.
std::size_t failuresIn(const std::string& log) {
    std::ifstream file(log);
    std::size_t count = 0;
    for (std::string line; std::getline(file, line);) {
        std::istringstream fields(line);
        std::string time;
        int level = 0;
        fields >> time >> level;
        count += level >= 6000 ? 1 : 0;
    }
    return count;
}

/// Made before the library is loaded, which reads its settings then.
struct Sink {
    Sink() { ::setenv("ZR_LOG_SINK", ("file:" + log).c_str(), 1); }
    ~Sink() { ::setenv("ZR_LOG_SINK", "none", 1); }
    Sink(const Sink&) = delete;
    Sink& operator=(const Sink&) = delete;
    ZR::Testing::TemporaryDirectory directory;
    std::string log = directory / "log";
};

class GatewayLogTest : public Sink, public GatewayTest {};

TEST_F(GatewayLogTest, IsSilentAboutResponsesThatAreEmptyByTheRules) {
    for (const auto& source : {endpoint("eth0"), endpoint("eth2"), computer(), serviceProcessor(),
                               accessPoint("my_nic_IPv4"), setting("Computer%fixed0")}) {
        EXPECT_EQ(host_.associators(source, {}).code, CMPI_RC_OK);
        EXPECT_EQ(host_.associatorNames(source, {}).code, CMPI_RC_OK);
        EXPECT_EQ(host_.references(source, {}).code, CMPI_RC_OK);
        EXPECT_EQ(host_.referenceNames(source, {}).code, CMPI_RC_OK);
    }
    EXPECT_EQ(failuresIn(log), 0U);
    // What goes wrong leaves one.
    std::ofstream(dataDirectory() + "ifcfg-eth0") << "CONFIG_NAME=office\n";
    static_cast<void>(host_.modify(
        {setting("Computer%eth0"), {{"ConfigurationName", Value::ofString("two\nlines")}}}));
    EXPECT_EQ(failuresIn(log), 1U);
}

}  // namespace
}  // namespace gateway
