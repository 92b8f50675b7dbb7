// The extensions' library, in object managers with every trait.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <array>

#include "cimom/ClassDeclaration.h"
#include "kit/StrictHost.h"
#include "kit/Tree.h"

namespace {

using cimom::ObjectPath;
using cimom::Value;
using strict::StrictHost;
using ::testing::_;
using ::testing::Contains;
using ::testing::Each;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::SizeIs;
using Filter = StrictHost::Filter;
using Texts = std::vector<std::string>;

ObjectPath pathOf(const std::string& className, const std::string& id,
                  const std::string& nameSpace = "root/cimv2") {
    ObjectPath path{"", nameSpace, className, {}};
    if (!id.empty()) {
        path.keys.push_back({"InstanceID", Value::ofString(id)});
    }
    return path;
}

ObjectPath lease(const std::string& id) {
    return pathOf("QVXZR_DHCPLease", id);
}

const ObjectPath profile =
    pathOf("QVXZR_RegisteredDHCPClientProfile", "QVXZR:DHCP Client", "root/interop");

const ObjectPath& referenceIn(const ObjectPath& path, const std::string& role) {
    return *std::get<std::shared_ptr<const ObjectPath>>(*path.key(role)->scalar());
}

std::string textOf(const cimom::Scalar& scalar) {
    if (const auto* text = std::get_if<std::string>(&scalar)) {
        return *text;
    }
    if (const auto* truth = std::get_if<bool>(&scalar)) {
        return *truth ? "true" : "false";
    }
    const auto* number = std::get_if<std::uint64_t>(&scalar);
    return number == nullptr ? "other" : std::to_string(*number);
}

/// "Name=value" of each property that is not null.
Texts factsOf(const cimom::Instance& instance) {
    Texts facts;
    for (const cimom::NamedValue& property : instance.properties) {
        if (const cimom::Scalar* scalar = property.value.scalar()) {
            facts.push_back(property.name + '=' + textOf(*scalar));
        } else if (const cimom::Array* array = property.value.array()) {
            std::string text = property.name + '=';
            for (const cimom::Scalar& element : *array) {
                text += '[' + textOf(element) + ']';
            }
            facts.push_back(text);
        }
    }
    return facts;
}

class ExtensionsTest : public test::TreeTest {
  protected:
    explicit ExtensionsTest(const strict::Traits& traits = {})
        : host_(ZR_SOURCE_DIR "/schema", {ZR_SOURCE_DIR "/schema/DHCPClient.registration"},
                ZR_BINARY_DIR "/lib/cmpi", traits) {}

    static test::Json leaseNode(test::Json properties) {
        return {{"type", "DHCPLease"},
                {"description", "DHCP lease"},
                {"properties", std::move(properties)}};
    }

    static test::Json with(test::Json interface, std::vector<test::Json> leases) {
        interface["children"] = std::move(leases);
        return interface;
    }

    void SetUp() override {
        setTree({test::host({with(test::dhcpInterface("eth0", {"192.0.2.1"}),
                                  {leaseNode({{"Family", "IPv4"},
                                              {"ClientState", 8},
                                              {"Address", "192.0.2.17"},
                                              {"ServerAddress", "192.0.2.1"},
                                              {"LeaseObtained", 1'700'000'000},
                                              {"RenewalTime", 1'700'001'800},
                                              {"RebindingTime", 1'700'003'150},
                                              {"LeaseExpires", 1'700'003'600},
                                              {"OptionsReceived", {1, 51, 54}},
                                              {"ClientIdentifier", "01:02"},
                                              {"Client", "dhclient"},
                                              {"Process", 412},
                                              {"ClientRuns", true},
                                              {"Source", "/var/lib/dhcp/dhclient.eth0.leases"}}),
                                   leaseNode({{"Family", "IPv6"}, {"Client", "dhclient"}})}),
                             test::dhcpInterface("eth1"), test::staticInterface("fixed0")}),
                 test::serviceProcessor(
                     {with(test::dhcpInterface("bmc0"), {leaseNode({{"Family", "IPv4"}})})})});
        static_cast<void>(strict::violations().take());
    }

    void TearDown() override { EXPECT_THAT(strict::violations().take(), IsEmpty()); }

    std::vector<ObjectPath> endpoints() {
        return host_.enumerateNames(pathOf("QVXZR_DHCPProtocolEndpoint", "")).paths;
    }

    StrictHost host_;
};

class ExtensionsWith : public ExtensionsTest,
                       public ::testing::WithParamInterface<strict::NamedTraits> {
  protected:
    ExtensionsWith() : ExtensionsTest(GetParam().traits) {}
};

INSTANTIATE_TEST_SUITE_P(Trait, ExtensionsWith, ::testing::ValuesIn(strict::namedTraits),
                         [](const auto& each) { return std::string(each.param.name); });

TEST_P(ExtensionsWith, ALeaseHasAllThatIsKnownOfIt) {
    const auto response = host_.get(lease("Computer%eth0%IPv4%dhclient"));
    ASSERT_THAT(response.instances, SizeIs(1)) << response.message;
    EXPECT_THAT(
        factsOf(response.instances.front()),
        ::testing::UnorderedElementsAre(
            "InstanceID=Computer%eth0%IPv4%dhclient", "ElementName=eth0",
            "InterfaceID=Computer%eth0", "Family=IPv4", "ClientState=8", "Address=192.0.2.17",
            "ServerAddress=192.0.2.1", "LeaseObtained=20231114221320.000000+000",
            "RenewalTime=20231114224320.000000+000", "RebindingTime=20231114230550.000000+000",
            "LeaseExpires=20231114231320.000000+000", "OptionsReceived=[1][51][54]",
            "ClientIdentifier=01:02", "ClientName=dhclient", "Process=412", "ClientRuns=true",
            "Source=/var/lib/dhcp/dhclient.eth0.leases"));
}

TEST_P(ExtensionsWith, WhatIsNotKnownOfALeaseIsNull) {
    const auto response = host_.get(lease("Computer%eth0%IPv6%dhclient"));
    ASSERT_THAT(response.instances, SizeIs(1)) << response.message;
    EXPECT_THAT(factsOf(response.instances.front()),
                ::testing::UnorderedElementsAre("InstanceID=Computer%eth0%IPv6%dhclient",
                                                "ElementName=eth0", "InterfaceID=Computer%eth0",
                                                "Family=IPv6", "ClientName=dhclient"));
}

TEST_P(ExtensionsWith, WhatIsListedCanBeGot) {
    for (const char* name : {"QVXZR_DHCPLease", "QVXZR_DHCPInterface", "QVXZR_DHCPLeaseOfEndpoint",
                             "QVXZR_DHCPClientConformsToProfile"}) {
        const auto names = host_.enumerateNames(pathOf(name, "")).paths;
        const auto instances = host_.enumerate(pathOf(name, "")).instances;
        EXPECT_THAT(names, Not(IsEmpty())) << name;
        ASSERT_EQ(names.size(), instances.size()) << name;
        for (std::size_t i = 0; i < names.size(); ++i) {
            EXPECT_EQ(instances[i].path, names[i]);
            const auto response = host_.get(names[i]);
            ASSERT_THAT(response.instances, SizeIs(1)) << name;
            EXPECT_EQ(response.instances.front(), instances[i]);
        }
    }
}

TEST_P(ExtensionsWith, PropertyListsAreApplied) {
    std::array<const char*, 3> list{"address", "NoSuchProperty", nullptr};
    const auto response = host_.get(lease("Computer%eth0%IPv4%dhclient"), list.data());
    ASSERT_THAT(response.instances, SizeIs(1));
    EXPECT_THAT(factsOf(response.instances.front()), ElementsAre("Address=192.0.2.17"));
    list[0] = nullptr;
    EXPECT_THAT(factsOf(host_.enumerate(pathOf("QVXZR_DHCPLease", ""), list.data()).instances[0]),
                IsEmpty());
}

TEST_P(ExtensionsWith, LeasesAreOfTheEndpointsThatTheGatewayLists) {
    const std::vector<ObjectPath> known = endpoints();
    const auto links = host_.enumerateNames(pathOf("QVXZR_DHCPLeaseOfEndpoint", "")).paths;
    ASSERT_THAT(links, SizeIs(3));
    for (const ObjectPath& link : links) {
        const ObjectPath& endpoint = referenceIn(link, "Antecedent");
        const ObjectPath& dependent = referenceIn(link, "Dependent");
        EXPECT_THAT(known, Contains(endpoint));
        const Filter filter{"CIM_Dependency", "QVXZR_DHCPLease", "Antecedent", "Dependent"};
        EXPECT_THAT(host_.associatorNames(endpoint, filter).paths, Contains(dependent));
        EXPECT_THAT(host_.associatorNames(dependent, {}).paths, ElementsAre(endpoint));
        const auto far = host_.associators(dependent, {}).instances;
        ASSERT_THAT(far, SizeIs(1));
        EXPECT_EQ(far.front(), host_.get(endpoint).instances.front());
        EXPECT_THAT(host_.referenceNames(dependent, {}).paths, ElementsAre(link));
        EXPECT_THAT(host_.referenceNames(endpoint, {"CIM_Dependency"}).paths, Contains(link));
        EXPECT_EQ(host_.references(dependent, {}).instances, host_.get(link).instances);
    }
    EXPECT_EQ(referenceIn(links.back(), "Antecedent").keys.front().value,
              Value::ofString("QVXZR_SPComputerSystem"));
}

TEST_P(ExtensionsWith, EveryFilterOfAssociationsCounts) {
    const ObjectPath source = lease("Computer%eth0%IPv4%dhclient");
    for (const Filter& none : {Filter{"CIM_Component", nullptr, nullptr, nullptr},
                               Filter{nullptr, "CIM_SettingData", nullptr, nullptr},
                               Filter{nullptr, nullptr, "Antecedent", nullptr},
                               Filter{nullptr, nullptr, nullptr, "Dependent"}}) {
        EXPECT_THAT(host_.associatorNames(source, none).paths, IsEmpty());
        EXPECT_THAT(host_.associators(source, none).instances, IsEmpty());
    }
    for (const Filter& one :
         {Filter{"qvxzr_dhcpleaseofendpoint", "cim_protocolendpoint", "dependent", "ANTECEDENT"},
          Filter{"", "", "", ""}}) {
        EXPECT_THAT(host_.associatorNames(source, one).paths, SizeIs(1));
    }
    EXPECT_THAT(host_.referenceNames(source, {"CIM_Component"}).paths, IsEmpty());
    EXPECT_THAT(host_.referenceNames(source, {nullptr, nullptr, "Antecedent"}).paths, IsEmpty());
}

// Discovery.

/// As clients look for the central instances of a profile.
TEST_P(ExtensionsWith, TheProfileLeadsToEveryEndpointInItsNamespace) {
    const Filter filter{"CIM_ElementConformsToProfile", nullptr, nullptr, "ManagedElement"};
    const std::vector<ObjectPath> found = host_.associatorNames(profile, filter).paths;
    EXPECT_EQ(found, endpoints());
    EXPECT_THAT(found, SizeIs(3));
    for (const ObjectPath& each : found) {
        EXPECT_EQ(each.nameSpace, "root/cimv2");
    }
    std::vector<ObjectPath> ofInstances;
    for (const cimom::Instance& each : host_.associators(profile, filter).instances) {
        ofInstances.push_back(each.path);
    }
    EXPECT_EQ(ofInstances, found);
    for (const ObjectPath& each : host_.referenceNames(profile, {}).paths) {
        EXPECT_EQ(each.nameSpace, "root/interop");
        EXPECT_EQ(referenceIn(each, "ConformantStandard"), profile);
        EXPECT_THAT(found, Contains(referenceIn(each, "ManagedElement")));
    }
}

TEST_P(ExtensionsWith, EachEndpointLeadsToTheProfileInTheInteropNamespace) {
    for (const ObjectPath& endpoint : endpoints()) {
        const Filter filter{"CIM_ElementConformsToProfile", "CIM_RegisteredProfile", nullptr,
                            "ConformantStandard"};
        EXPECT_THAT(host_.associatorNames(endpoint, filter).paths, ElementsAre(profile));
        EXPECT_EQ(host_.associators(endpoint, filter).instances, host_.get(profile).instances);
        const auto links = host_.referenceNames(endpoint, {"CIM_ElementConformsToProfile"}).paths;
        ASSERT_THAT(links, SizeIs(1));
        EXPECT_EQ(links.front().nameSpace, "root/cimv2");
        EXPECT_EQ(referenceIn(links.front(), "ManagedElement"), endpoint);
        EXPECT_EQ(referenceIn(links.front(), "ConformantStandard"), profile);
    }
}

TEST_F(ExtensionsTest, TheProfileIsThatOfDmtf) {
    const auto response = host_.enumerate(pathOf("CIM_RegisteredProfile", "", "root/interop"));
    ASSERT_THAT(response.instances, SizeIs(1));
    EXPECT_EQ(response.instances.front().path, profile);
    EXPECT_THAT(factsOf(response.instances.front()),
                ::testing::UnorderedElementsAre(
                    "InstanceID=QVXZR:DHCP Client", "ElementName=DHCP Client Profile",
                    "SpecificationType=2", "RegisteredOrganization=2", "RegisteredName=DHCP Client",
                    "RegisteredVersion=1.0.4", "AdvertiseTypes=[2]"));
}

/// Object managers call their interop namespace by other names, too.
TEST_F(ExtensionsTest, TheProfileIsInTheNamespaceInWhichItIsAsked) {
    for (const char* name : {"interop", "root/PG_InterOp"}) {
        ObjectPath there = profile;
        there.nameSpace = name;
        EXPECT_THAT(host_.associatorNames(there, {}).paths, ElementsAre(_, _, _));
        for (const ObjectPath& link : host_.referenceNames(there, {}).paths) {
            EXPECT_EQ(referenceIn(link, "ConformantStandard"), there);
            EXPECT_EQ(referenceIn(link, "ManagedElement").nameSpace, "root/cimv2");
        }
    }
}

// What cannot be.

TEST_P(ExtensionsWith, WhatIsNotThereIsNotFound) {
    for (const ObjectPath& missing :
         {lease("Computer%eth9%IPv4%dhclient"), pathOf("QVXZR_DHCPInterface", "Computer%eth9"),
          pathOf("QVXZR_DHCPDiagnostic", "0%x")}) {
        const auto response = host_.get(missing);
        EXPECT_EQ(response.code, CMPI_RC_ERR_NOT_FOUND) << missing.className;
        EXPECT_THAT(response.message, HasSubstr("there is no " + missing.className));
        EXPECT_EQ(host_.associatorNames(missing, {}).code, CMPI_RC_ERR_NOT_FOUND);
        // Whatever it is asked for.
        EXPECT_EQ(host_.references(missing, {"CIM_Component"}).code, CMPI_RC_ERR_NOT_FOUND);
    }
    auto link = host_.enumerateNames(pathOf("QVXZR_DHCPLeaseOfEndpoint", "")).paths.front();
    link.keys.at(1).value.content =
        cimom::Scalar(std::make_shared<const ObjectPath>(lease("Computer%bmc0%IPv4%dhclient")));
    EXPECT_EQ(host_.get(link).code, CMPI_RC_ERR_NOT_FOUND);
}

TEST_P(ExtensionsWith, KeysThatAreMissingOrTooManyAreInvalid) {
    ObjectPath more = lease("Computer%eth0%IPv4%dhclient");
    more.keys.push_back({"Extra", Value::ofString("key")});
    ObjectPath number = lease("x");
    number.keys.front().value = {cimom::Type::uint64, false, cimom::Scalar(std::uint64_t{4})};
    ObjectPath half = host_.enumerateNames(pathOf("QVXZR_DHCPLeaseOfEndpoint", "")).paths.front();
    half.keys.pop_back();
    for (const ObjectPath& wrong : {lease(""), more, number, half}) {
        const auto response = host_.get(wrong);
        EXPECT_EQ(response.code, CMPI_RC_ERR_INVALID_PARAMETER);
        EXPECT_THAT(response.message, Not(IsEmpty()));
    }
}

TEST_P(ExtensionsWith, NothingCanBeMadeChangedOrDeleted) {
    const cimom::Instance instance{lease("Computer%eth0%IPv4%dhclient"),
                                   {{"Address", Value::ofString("192.0.2.99")}}};
    EXPECT_EQ(host_.create(instance).code, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(host_.modify(instance).code, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(host_.remove(instance.path).code, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(host_.query(instance.path, "SELECT * FROM QVXZR_DHCPLease", "WQL").code,
              CMPI_RC_ERR_NOT_SUPPORTED);
}

TEST_F(ExtensionsTest, InterfacesAreToldWithAndWithoutDhcp) {
    std::vector<Texts> facts;
    for (const auto& each : host_.enumerate(pathOf("QVXZR_DHCPInterface", "")).instances) {
        facts.push_back(factsOf(each));
    }
    ASSERT_THAT(facts, SizeIs(4));
    EXPECT_THAT(facts, Each(Contains("LinkUp=true")));
    EXPECT_THAT(facts[2], ::testing::UnorderedElementsAre("InstanceID=Computer%fixed0",
                                                          "ElementName=fixed0", "DHCPEnabled=false",
                                                          "LinkUp=true", "AddressOrigin=3"));
    EXPECT_THAT(facts[3], Contains("InstanceID=BMC%bmc0"));
}

TEST_F(ExtensionsTest, WhatIsNotAsItLooksIsTold) {
    setTree({test::host({test::dhcpInterface("eth0", {"nowhere"})})});
    const auto told = host_.enumerate(pathOf("QVXZR_DHCPDiagnostic", "")).instances;
    ASSERT_THAT(told, SizeIs(1));
    EXPECT_THAT(factsOf(told.front()),
                Contains(HasSubstr("\"nowhere\" is not an IP address")).Times(2));
    EXPECT_EQ(host_.get(told.front().path).instances.front(), told.front());
}

}  // namespace
