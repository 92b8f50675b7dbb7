// Every class, operation and filter, in every kind of object manager: the same responses
// from all.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cctype>
#include <memory>
#include <optional>
#include <stdexcept>

#include "Hosts.h"
#include "Model.h"
#include "kit/StrictObjects.h"
#include "kit/Tree.h"

namespace {

using conformance::HostKind;
using conformance::Link;
using conformance::Model;
using conformance::Name;
using conformance::Operation;
using conformance::Request;
using conformance::Response;
using conformance::textOf;
using conformance::Texts;
using conformance::textsOf;
using ::testing::IsEmpty;
using ::testing::Not;

const Texts elementClasses{"QVXZR_ComputerSystem",
                           "QVXZR_SPComputerSystem",
                           "QVXZR_IPProtocolEndpoint",
                           "QVXZR_IPAssignmentSettingData",
                           "QVXZR_DHCPProtocolEndpoint",
                           "QVXZR_DHCPCapabilities",
                           "QVXZR_DHCPSettingData",
                           "QVXZR_DHCPRemoteServiceAccessPoint",
                           "QVXZR_DHCPLease",
                           "QVXZR_DHCPInterface"};
const Texts associationClasses{
    "QVXZR_DHCPElementCapabilities",     "QVXZR_HostedDHCPPoint",
    "QVXZR_DHCPRemoteHostedAccessPoint", "QVXZR_SAPSAPDependency",
    "QVXZR_DHCPOrderedComponent",        "QVXZR_DHCPRemoteAccessAvailableToElement",
    "QVXZR_DHCPElementSettingData",      "QVXZR_DHCPLeaseOfEndpoint",
    "QVXZR_DHCPClientConformsToProfile"};
const Texts elementParents{"CIM_ManagedElement",
                           "CIM_EnabledLogicalElement",
                           "CIM_System",
                           "CIM_ComputerSystem",
                           "CIM_ServiceAccessPoint",
                           "CIM_ProtocolEndpoint",
                           "CIM_IPProtocolEndpoint",
                           "CIM_DHCPProtocolEndpoint",
                           "CIM_RemoteServiceAccessPoint",
                           "CIM_Capabilities",
                           "CIM_DHCPCapabilities",
                           "CIM_SettingData",
                           "CIM_IPAssignmentSettingData",
                           "CIM_DHCPSettingData"};
const Texts associationParents{"CIM_Dependency",
                               "CIM_HostedDependency",
                               "CIM_HostedAccessPoint",
                               "CIM_SAPSAPDependency",
                               "CIM_RemoteAccessAvailableToElement",
                               "CIM_Component",
                               "CIM_OrderedComponent",
                               "CIM_ElementCapabilities",
                               "CIM_ElementSettingData",
                               "CIM_ElementConformsToProfile"};
const Texts roles{"Antecedent",  "Dependent",      "ManagedElement", "Capabilities",
                  "SettingData", "GroupComponent", "PartComponent",  "ConformantStandard"};
constexpr Operation associationOperations[] = {Operation::associatorNames, Operation::associators,
                                               Operation::referenceNames, Operation::references};

bool isOfReferences(Operation operation) {
    return operation == Operation::referenceNames || operation == Operation::references;
}

Texts joined(const Texts& one, const Texts& other) {
    Texts all = one;
    all.insert(all.end(), other.begin(), other.end());
    return all;
}

std::string upper(std::string text) {
    std::transform(text.begin(), text.end(), text.begin(),
                   [](unsigned char letter) { return static_cast<char>(std::toupper(letter)); });
    return text;
}

cimom::ObjectPath classPath(const std::string& className) {
    return {"", conformance::nameSpace, className, {}};
}

class ConformanceTest : public test::TreeTest, public ::testing::WithParamInterface<HostKind> {
  protected:
    static const cimom::ClassRepository& repository() {
        static const cimom::ClassRepository loaded = [] {
            cimom::ClassRepository classes;
            classes.loadDirectory(ZR_SOURCE_DIR "/schema");
            classes.complete();
            return classes;
        }();
        return loaded;
    }

    /// An interface without DHCP comes first; names with an underscore; servers of both
    /// families, none, and of an interface that does not use DHCP any more; a service
    /// processor.
    static Model machine() {
        return {{{"static0", false, false, "192.0.2.13"},
                 {"eth0", false, true, "192.0.2.10", {"192.0.2.1", "2001:db8::1"}, "office"},
                 {"my_nic", false, true, "192.0.2.11", {"192.0.2.1"}},
                 {"eth3", false, true, ""},
                 {"old0", false, false, "", {"192.0.2.2"}},
                 {"bmc0", true, true, "192.0.2.20", {"192.0.2.1"}},
                 {"bmc1", true, false, ""}},
                hostName(),
                repository()};
    }

    void SetUp() override {
        setTree(model_.tree());
        model_.writeFiles(dataDirectory());
        static_cast<void>(strict::violations().take());
        host_ = GetParam().make();
    }

    void TearDown() override {
        host_.reset();
        EXPECT_THAT(strict::violations().take(), IsEmpty());
    }

    /// The response; what an object manager leaves out by a property list itself is left out
    /// here: the references without which some have nothing for their clients.
    Response ask(const Request& request) const {
        Response response = host_->ask(request);
        if (!GetParam().isBare || !request.properties) {
            return response;
        }
        for (cimom::Instance& instance : response.instances) {
            std::erase_if(instance.properties, [&](const cimom::NamedValue& property) {
                return property.value.type == cimom::Type::reference &&
                       std::find(request.properties->begin(), request.properties->end(),
                                 property.name) == request.properties->end();
            });
        }
        return response;
    }

    void expectAsDescribed(const Request& request) const {
        const Response response = ask(request);
        EXPECT_EQ(response.code, CMPI_RC_OK) << request.text() << '\n' << response.message;
        EXPECT_EQ(textsOf(response), textsOf(model_.responseTo(request))) << request.text();
    }

    void expectRefused(const Request& request, CMPIrc code) const {
        const Response response = ask(request);
        EXPECT_EQ(response.code, code) << request.text();
        EXPECT_THAT(response.message, Not(IsEmpty())) << request.text();
        EXPECT_THAT(textsOf(response), IsEmpty()) << request.text();
    }

    Model model_ = machine();
    std::unique_ptr<conformance::Host> host_;
};

// Instances.

TEST_P(ConformanceTest, EnumerationsGiveTheInstancesOfAClassAndOfThoseBelow) {
    for (const std::string& name : joined(joined(elementClasses, associationClasses),
                                          joined(elementParents, associationParents))) {
        for (const Operation operation : {Operation::enumerateNames, Operation::enumerate}) {
            expectAsDescribed({.operation = operation, .path = classPath(name)});
        }
    }
}

TEST_P(ConformanceTest, WhatIsListedCanBeGotAndFollowed) {
    for (const std::string& name : joined(elementClasses, associationClasses)) {
        const Response listed =
            ask({.operation = Operation::enumerateNames, .path = classPath(name)});
        EXPECT_THAT(listed.paths, Not(IsEmpty())) << name;
        for (const cimom::ObjectPath& path : listed.paths) {
            expectAsDescribed({.operation = Operation::get, .path = path});
            for (const Operation operation : associationOperations) {
                expectAsDescribed({.operation = operation, .path = path});
            }
        }
    }
}

TEST_P(ConformanceTest, PropertyListsChooseTheProperties) {
    std::vector<Texts> lists{{}, {"NoSuchProperty"}, {"Name", "ElementName", "InstanceID"}};
    lists.push_back({"Antecedent", "SettingData", "GroupComponent", "OptionsReceived",
                     "OrderOfAccess", "RequestedState"});
    for (const Texts& list : lists) {
        for (const cimom::Instance& each : model_.all()) {
            expectAsDescribed({.operation = Operation::get, .path = each.path, .properties = list});
        }
        for (const std::string& name : joined(elementClasses, associationClasses)) {
            expectAsDescribed(
                {.operation = Operation::enumerate, .path = classPath(name), .properties = list});
        }
        for (const cimom::Instance& each : model_.objects()) {
            for (const Operation operation : {Operation::associators, Operation::references}) {
                expectAsDescribed({.operation = operation, .path = each.path, .properties = list});
            }
        }
    }
}

TEST_P(ConformanceTest, NamesInAnyCaseAndKeysInAnyOrderNameTheSame) {
    for (const cimom::Instance& each : model_.all()) {
        cimom::ObjectPath path = each.path;
        path.className = upper(path.className);
        std::reverse(path.keys.begin(), path.keys.end());
        for (cimom::NamedValue& key : path.keys) {
            key.name = upper(key.name);
        }
        Response response = ask({.operation = Operation::get, .path = path});
        EXPECT_EQ(response.code, CMPI_RC_OK) << textOf(path) << response.message;
        ASSERT_EQ(response.instances.size(), 1U) << textOf(path);
        response.instances[0].path = each.path;
        EXPECT_EQ(textsOf(response),
                  textsOf(model_.responseTo({.operation = Operation::get, .path = each.path})));
        for (const Operation operation : associationOperations) {
            EXPECT_EQ(textsOf(ask({.operation = operation, .path = path})),
                      textsOf(model_.responseTo({.operation = operation, .path = each.path})))
                << textOf(path);
        }
    }
}

// Keys that name nothing.

/// The same path with another value for a key, which names nothing.
cimom::ObjectPath withOther(cimom::ObjectPath path, std::size_t at) {
    cimom::Value& value = path.keys.at(at).value;
    const cimom::Scalar scalar = *value.scalar();
    if (const auto* text = std::get_if<std::string>(&scalar)) {
        value = cimom::Value::ofString(*text + "x");
    } else {
        cimom::ObjectPath far = *std::get<std::shared_ptr<const cimom::ObjectPath>>(scalar);
        far.keys.back().value = cimom::Value::ofString("x");
        value.content = cimom::Scalar(std::make_shared<const cimom::ObjectPath>(far));
    }
    return path;
}

TEST_P(ConformanceTest, InstancesThatAreNotThereAreNotFound) {
    for (const cimom::Instance& each : model_.all()) {
        for (std::size_t at = 0; at < each.path.keys.size(); ++at) {
            expectRefused({.operation = Operation::get, .path = withOther(each.path, at)},
                          CMPI_RC_ERR_NOT_FOUND);
        }
    }
}

TEST_P(ConformanceTest, ReferencesOfOtherAssociationsNameNoInstance) {
    for (const Link& one : model_.links()) {
        for (const Link& other : model_.links()) {
            const bool alike = one.association.path.className == other.association.path.className &&
                               one.ends.at(0) != other.ends.at(0) &&
                               one.ends.at(1) != other.ends.at(1);
            if (!alike) {
                continue;
            }
            cimom::ObjectPath mixed = one.association.path;
            mixed.keys.at(1) = other.association.path.keys.at(1);
            expectRefused({.operation = Operation::get, .path = mixed}, CMPI_RC_ERR_NOT_FOUND);
        }
    }
}

/// The neighbours give the first where keys are missing: so the exact provider asks them.
bool isOfNeighbours(const std::string& className) {
    return className.ends_with("ComputerSystem") || className == "QVXZR_IPProtocolEndpoint" ||
           className == "QVXZR_IPAssignmentSettingData";
}

TEST_P(ConformanceTest, MissingAndFurtherKeysAndKeysOfOtherTypesAreInvalid) {
    cimom::Value number{cimom::Type::uint64, false, cimom::Scalar(std::uint64_t{4})};
    for (const cimom::Instance& each : model_.all()) {
        for (std::size_t at = 0; at < each.path.keys.size(); ++at) {
            cimom::ObjectPath fewer = each.path;
            fewer.keys.erase(fewer.keys.begin() + static_cast<std::ptrdiff_t>(at));
            if (!isOfNeighbours(each.path.className)) {
                expectRefused({.operation = Operation::get, .path = fewer},
                              CMPI_RC_ERR_INVALID_PARAMETER);
            }
            cimom::ObjectPath otherType = each.path;
            otherType.keys.at(at).value = number;
            expectRefused({.operation = Operation::get, .path = otherType},
                          CMPI_RC_ERR_INVALID_PARAMETER);
        }
        cimom::ObjectPath more = each.path;
        more.keys.push_back({"Extra", cimom::Value::ofString("key")});
        expectRefused({.operation = Operation::get, .path = more}, CMPI_RC_ERR_INVALID_PARAMETER);
    }
}

// Associations.

/// Whether a path is of a computer, or of one of the two interfaces that have everything.
bool isOfWholeInterface(const cimom::ObjectPath& path) {
    const std::string text = textOf(path);
    return text.find("eth0") != std::string::npos || text.find("bmc0") != std::string::npos ||
           path.className.ends_with("ComputerSystem");
}

TEST_P(ConformanceTest, EveryFilterOfAssociationsCounts) {
    const auto ask = [this](const Request& request) {
        const bool ofAssociators = request.resultClass || request.resultRole;
        for (const Operation operation : associationOperations) {
            if (!ofAssociators || !isOfReferences(operation)) {
                Request each = request;
                each.operation = operation;
                expectAsDescribed(each);
            }
        }
    };
    for (const cimom::Instance& each : model_.objects()) {
        if (!isOfWholeInterface(each.path)) {
            continue;
        }
        for (const std::string& name : joined(associationClasses, associationParents)) {
            ask({.path = each.path, .association = name});
        }
        for (const std::string& name : joined(elementClasses, elementParents)) {
            ask({.path = each.path, .resultClass = name});
        }
        for (const std::string& name : roles) {
            ask({.path = each.path, .role = name});
            ask({.path = each.path, .resultRole = upper(name)});
        }
    }
}

TEST_P(ConformanceTest, FiltersOfAssociationsCountTogether) {
    for (const Link& link : model_.links()) {
        for (const std::size_t near : {std::size_t{0}, std::size_t{1}}) {
            const cimom::Instance& source = model_.objects().at(link.ends.at(near));
            const cimom::Instance& other = model_.objects().at(link.ends.at(1 - near));
            for (const Operation operation : {Operation::associatorNames, Operation::associators}) {
                Request request{.operation = operation,
                                .path = source.path,
                                .association = link.association.path.className,
                                .resultClass = other.path.className,
                                .role = link.roles.at(near),
                                .resultRole = link.roles.at(1 - near)};
                expectAsDescribed(request);
                std::swap(request.role, request.resultRole);
                expectAsDescribed(request);
            }
            for (const Operation operation : {Operation::referenceNames, Operation::references}) {
                for (const std::string& role : link.roles) {
                    expectAsDescribed({.operation = operation,
                                       .path = source.path,
                                       .association = upper(link.association.path.className),
                                       .role = role});
                }
            }
        }
    }
}

TEST_P(ConformanceTest, BothEndsOfAnAssociationSeeEachOtherAndTheAssociation) {
    for (const std::string& name : associationClasses) {
        const Response all = ask({.operation = Operation::enumerate, .path = classPath(name)});
        EXPECT_THAT(all.instances, Not(IsEmpty())) << name;
        for (const cimom::Instance& association : all.instances) {
            std::vector<cimom::ObjectPath> ends;
            for (const cimom::NamedValue& key : association.path.keys) {
                ends.push_back(*std::get<std::shared_ptr<const cimom::ObjectPath>>(
                    *association.property(key.name)->scalar()));
            }
            ASSERT_EQ(ends.size(), 2U);
            for (const std::size_t near : {std::size_t{0}, std::size_t{1}}) {
                const cimom::ObjectPath& source = ends.at(near);
                EXPECT_THAT(textsOf(ask({.operation = Operation::get, .path = source})),
                            ::testing::SizeIs(1))
                    << textOf(source);
                EXPECT_THAT(textsOf(ask({.operation = Operation::associatorNames,
                                         .path = source,
                                         .association = name})),
                            ::testing::Contains(textOf(ends.at(1 - near))))
                    << textOf(source);
                // It is in the namespace in which it is asked for.
                cimom::Instance seen = association;
                seen.path.nameSpace = source.nameSpace;
                EXPECT_THAT(
                    textsOf(ask(
                        {.operation = Operation::references, .path = source, .association = name})),
                    ::testing::Contains(textOf(seen)))
                    << textOf(source);
            }
        }
    }
}

TEST_P(ConformanceTest, SourcesThatAreNotThereAreNotFound) {
    for (const cimom::Instance& each : model_.objects()) {
        for (std::size_t at = 0; at < each.path.keys.size(); ++at) {
            for (const Operation operation : associationOperations) {
                expectRefused({.operation = operation, .path = withOther(each.path, at)},
                              CMPI_RC_ERR_NOT_FOUND);
            }
        }
    }
}

TEST_P(ConformanceTest, AnAssociationIsTheEndOfNone) {
    for (const Link& each : model_.links()) {
        for (const Operation operation : associationOperations) {
            expectAsDescribed({.operation = operation, .path = each.association.path});
        }
    }
}

// Changes.

class ModificationTest : public ConformanceTest {
  protected:
    static cimom::NamedValue text(const std::string& name, const std::string& value) {
        return {name, cimom::Value::ofString(value)};
    }

    /// The settings of an interface, with these properties alone.
    cimom::Instance setting(const std::string& interface,
                            std::vector<cimom::NamedValue> properties) const {
        for (const cimom::Instance& each : model_.objects()) {
            if (each.path.className == "QVXZR_DHCPSettingData" &&
                *each.property("ElementName") == cimom::Value::ofString(interface)) {
                return {each.path, std::move(properties)};
            }
        }
        throw std::logic_error("no such interface");
    }

    void expectModified(const cimom::Instance& instance,
                        const std::optional<Texts>& properties = std::nullopt) const {
        const Response response = host_->modify(instance, properties);
        EXPECT_EQ(response.code, CMPI_RC_OK) << textOf(instance) << '\n' << response.message;
    }

    void expectRefusal(const cimom::Instance& instance, CMPIrc code,
                       const std::optional<Texts>& properties = std::nullopt) const {
        const Response response = host_->modify(instance, properties);
        EXPECT_EQ(response.code, code) << textOf(instance) << '\n' << response.message;
        EXPECT_THAT(response.message, Not(IsEmpty())) << textOf(instance);
    }

    /// That the settings of all interfaces are as they were, but for the configuration that
    /// eth0 has.
    void expectConfiguration(const std::string& name) const {
        const Request request{.operation = Operation::enumerate,
                              .path = classPath("QVXZR_DHCPSettingData")};
        Response expected = model_.responseTo(request);
        for (cimom::Instance& each : expected.instances) {
            for (cimom::NamedValue& property : each.properties) {
                if (property.name == "ConfigurationName") {
                    property.value = cimom::Value::ofString(name);
                }
            }
        }
        EXPECT_EQ(textsOf(ask(request)), textsOf(expected));
    }
};

TEST_P(ModificationTest, ThePropertyListSaysWhatChanges) {
    const cimom::NamedValue next = text("ConfigurationName", "home");
    expectModified(setting("eth0", {next}), Texts{});
    expectConfiguration("office");
    expectModified(setting("eth0", {next, text("ElementName", "eth0")}), Texts{"ElementName"});
    expectConfiguration("office");
    expectModified(setting("eth0", {next, text("ElementName", "other")}),
                   Texts{"CONFIGURATIONNAME"});
    expectConfiguration("home");
    expectModified(setting("eth0", {text("ConfigurationName", "third")}));
    expectConfiguration("third");
    expectModified(setting("eth0", {text("ElementName", "eth0")}));
    expectConfiguration("third");
    // All that it has, as clients send that have read it before.
    cimom::Instance whole = setting("eth0", {});
    whole.properties =
        ask({.operation = Operation::get, .path = whole.path}).instances.at(0).properties;
    expectModified(whole);
    expectConfiguration("third");
}

TEST_P(ModificationTest, WhatCannotChangeIsRefused) {
    expectRefusal(
        setting("eth0", {text("ConfigurationName", "home"), text("ElementName", "other")}),
        CMPI_RC_ERR_NOT_SUPPORTED);
    expectRefusal(setting("eth0", {text("ConfigurationName", "home")}),
                  CMPI_RC_ERR_NO_SUCH_PROPERTY, Texts{"ConfigurationName", "NoSuchProperty"});
    // Some object managers do not let it through.
    expectRefusal(setting("eth0", {text("ConfigurationName", "two\nlines")}),
                  GetParam().isBare ? CMPI_RC_ERR_FAILED : CMPI_RC_ERR_INVALID_PARAMETER);
    // It has no file.
    expectRefusal(setting("my_nic", {text("ConfigurationName", "home")}), CMPI_RC_ERR_FAILED);
    expectConfiguration("office");
    for (const cimom::Instance& each : model_.objects()) {
        expectRefusal({each.path, {text("ElementName", "other")}}, CMPI_RC_ERR_NOT_SUPPORTED);
    }
}

TEST_P(ModificationTest, InstancesThatAreNotThereAreNotFound) {
    cimom::Instance nothing = setting("eth0", {text("ConfigurationName", "home")});
    nothing.path = withOther(nothing.path, 0);
    expectRefusal(nothing, CMPI_RC_ERR_NOT_FOUND);
    expectRefusal(nothing, CMPI_RC_ERR_NOT_FOUND, Texts{});
    nothing.path.keys.clear();
    expectRefusal(nothing, CMPI_RC_ERR_INVALID_PARAMETER);
    expectConfiguration("office");
}

// What a host lets through.

TEST_P(ConformanceTest, UnknownNamesHaveOneResponse) {
    const cimom::ObjectPath& source = model_.links().front().association.path;
    const cimom::ObjectPath& object = model_.objects().at(model_.links().front().ends.at(0)).path;
    ASSERT_NE(textOf(source), textOf(object));
    for (const Request& unknown : {Request{.path = object, .association = "No_SuchClass"},
                                   Request{.path = object, .resultClass = "No_SuchClass"},
                                   Request{.path = object, .role = "NoSuchRole"},
                                   Request{.path = object, .resultRole = "NoSuchRole"}}) {
        std::vector<CMPIrc> codes;
        for (const Operation operation : associationOperations) {
            if (isOfReferences(operation) && (unknown.resultClass || unknown.resultRole)) {
                continue;
            }
            Request request = unknown;
            request.operation = operation;
            const Response response = ask(request);
            EXPECT_THAT(textsOf(response), IsEmpty()) << request.text();
            codes.push_back(response.code);
        }
        EXPECT_THAT(codes, ::testing::Each(codes.front())) << unknown.text();
        if (GetParam().isBare) {
            EXPECT_EQ(codes.front(), CMPI_RC_OK) << unknown.text();
        }
    }
}

TEST_P(ConformanceTest, SourcesOfOtherClassesHaveNoAssociations) {
    for (const std::string name : {"CIM_ManagedElement", "No_SuchClass", "CIM_Dependency"}) {
        // An object manager with a schema refuses an unknown class before it asks providers.
        const bool refused = !GetParam().isBare && name == "No_SuchClass";
        cimom::ObjectPath path = classPath(name);
        path.keys.push_back({"InstanceID", cimom::Value::ofString("x")});
        for (const Operation operation : associationOperations) {
            const Response response = ask({.operation = operation, .path = path});
            EXPECT_EQ(response.code, refused ? CMPI_RC_ERR_INVALID_CLASS : CMPI_RC_OK) << name;
            EXPECT_THAT(textsOf(response), IsEmpty()) << name;
        }
    }
}

INSTANTIATE_TEST_SUITE_P(In, ModificationTest, ::testing::ValuesIn(conformance::hostKinds()),
                         [](const auto& each) { return each.param.name; });
INSTANTIATE_TEST_SUITE_P(In, ConformanceTest, ::testing::ValuesIn(conformance::hostKinds()),
                         [](const auto& each) { return each.param.name; });

}  // namespace
