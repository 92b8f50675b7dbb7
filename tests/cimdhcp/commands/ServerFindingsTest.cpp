// What is told of an object manager whose responses are wrong in one way at a time.
#include "commands/check/Findings.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <map>
#include <memory>
#include <set>

#include "cimom/Instance.h"
#include "cimom/Requests.h"
#include "client/Client.h"
#include "client/Response.h"

namespace cimdhcp {
namespace {

using cimom::Instance;
using cimom::ObjectPath;
using cimom::Value;
using testing::AllOf;
using testing::Contains;
using testing::Each;
using testing::ElementsAre;
using testing::Field;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::SizeIs;

ObjectPath element(const std::string& className, const std::string& id) {
    return {"", "root/cimv2", className, {{"InstanceID", Value::ofString(id)}}};
}

Value reference(const ObjectPath& path) {
    Value value;
    value.type = cimom::Type::reference;
    value.content = cimom::Scalar(std::make_shared<const ObjectPath>(path));
    return value;
}

/// An object manager with two instances of each class, whose associations are all between
/// a DHCP endpoint and the IP endpoint of the same number.
class Manager : public Client {
  public:
    Manager() : Client("root/cimv2") {
        for (const char* const name :
             {"QVXZR_DHCPProtocolEndpoint", "QVXZR_DHCPCapabilities",
              "QVXZR_DHCPRemoteServiceAccessPoint", "QVXZR_DHCPSettingData", "QVXZR_ComputerSystem",
              "QVXZR_SPComputerSystem", "QVXZR_IPProtocolEndpoint",
              "QVXZR_IPAssignmentSettingData"}) {
            for (const char* const id : {"1", "2"}) {
                const ObjectPath path = element(name, id);
                instances[name].push_back({path, path.keys});
            }
        }
        for (const char* const name :
             {"QVXZR_DHCPElementCapabilities", "QVXZR_SAPSAPDependency", "QVXZR_HostedDHCPPoint",
              "QVXZR_DHCPRemoteAccessAvailableToElement", "QVXZR_DHCPRemoteHostedAccessPoint",
              "QVXZR_DHCPElementSettingData", "QVXZR_DHCPOrderedComponent"}) {
            for (const char* const id : {"1", "2"}) {
                const ObjectPath path{
                    "",
                    "root/cimv2",
                    name,
                    {{"Antecedent", reference(element("QVXZR_IPProtocolEndpoint", id))},
                     {"Dependent", reference(element("QVXZR_DHCPProtocolEndpoint", id))}}};
                instances[name].push_back({path, path.keys});
            }
        }
    }

    Response enumerateNames(const ObjectPath& path) override {
        Response response{"EnumerateInstanceNames", {}, std::nullopt, {}, {}};
        for (const Instance& each : instances[path.className]) {
            response.paths.emplace_back(each.path);
        }
        return response;
    }
    Response enumerate(const ObjectPath& path) override {
        Response response{"EnumerateInstances", {}, std::nullopt, {}, {}};
        if (silent.contains(path.className)) {
            throw Failure(ExitStatus::notLoaded, "no response");
        }
        if (const auto failing = failures.find(path.className); failing != failures.end()) {
            response.status = failing->second;
            return response;
        }
        for (const Instance& each : instances[path.className]) {
            response.instances.emplace_back(each);
        }
        return response;
    }
    Response get(const ObjectPath& path) override {
        if (path.className == silentGet) {
            throw Failure(ExitStatus::notLoaded, "no response");
        }
        Response response{"GetInstance", {}, std::nullopt, {}, {}};
        for (const Instance& each : instances[path.className]) {
            if (alwaysTheFirst.contains(path.className) || each.path == path) {
                response.instances.emplace_back(each);
                return response;
            }
        }
        response.status = {CMPI_RC_ERR_NOT_FOUND, ""};
        return response;
    }
    Response referenceNames(const ObjectPath& path,
                            const cimom::AssociationRequest& /*request*/) override {
        Response response{"ReferenceNames", referencesStatus, std::nullopt, {}, {}};
        for (const auto& [name, all] : instances) {
            for (const Instance& each : all) {
                const bool isEnd = std::any_of(
                    each.path.keys.begin(), each.path.keys.end(),
                    [&path](const cimom::NamedValue& key) { return key.value == reference(path); });
                if (isEnd || (each.path.keys.size() > 1 && unfiltered)) {
                    response.paths.emplace_back(each.path);
                }
            }
        }
        return response;
    }

    std::map<std::string, std::vector<Instance>> instances;
    std::map<std::string, cimom::Status> failures;
    std::set<std::string> alwaysTheFirst;  ///< classes of which any path gets the first
    std::set<std::string> silent;          ///< classes whose enumeration has no response
    std::string silentGet;                 ///< a class whose instances cannot be asked for
    bool unfiltered = false;               ///< every association refers to everything
    cimom::Status referencesStatus;

    // Not needed for this.
    [[nodiscard]] ClassLookup classes() override {
        return ClassLookup([](std::string_view) { return nullptr; });
    }
    [[nodiscard]] Failure failure(const Response& /*response*/,
                                  const ObjectPath& /*asked*/) const override {
        return {ExitStatus::notDone, ""};
    }
    [[nodiscard]] std::vector<ClassEntry> servedClasses() override { return {}; }
    [[nodiscard]] bool mayServe(std::string_view /*className*/) const override { return true; }
    [[nodiscard]] std::optional<std::string> dataDir() const override { return std::nullopt; }
    Response modify(const Instance& /*instance*/,
                    const std::vector<std::string>& /*properties*/) override {
        return {};
    }
    Response associatorNames(const ObjectPath& /*path*/,
                             const cimom::AssociationRequest& /*request*/) override {
        return {};
    }
    Response associators(const ObjectPath& /*path*/,
                         const cimom::AssociationRequest& /*request*/) override {
        return {};
    }
    Response references(const ObjectPath& /*path*/,
                        const cimom::AssociationRequest& /*request*/) override {
        return {};
    }
};

/// The findings that are not good.
std::vector<Finding> wrongFindings(Manager& manager) {
    std::vector<Finding> findings = serverFindings(manager);
    std::erase_if(findings,
                  [](const Finding& each) { return each.verdict == Finding::Verdict::good; });
    return findings;
}

auto finding(const std::string& what, const std::string& detail, const std::string& remedy) {
    return AllOf(Field(&Finding::verdict, Finding::Verdict::bad), Field(&Finding::what, what),
                 Field(&Finding::detail, detail), Field(&Finding::remedy, HasSubstr(remedy)));
}

TEST(ServerFindings, OfAGoodManagerEveryClassIsGood) {
    Manager manager;
    const std::vector<Finding> findings = serverFindings(manager);
    EXPECT_THAT(findings, SizeIs(15));
    EXPECT_THAT(findings, Each(AllOf(Field(&Finding::verdict, Finding::Verdict::good),
                                     Field(&Finding::detail, "2 instances"))));
}

TEST(ServerFindings, TellTheirSteps) {
    Manager manager;
    std::vector<std::string> steps;
    static_cast<void>(serverFindings(
        manager, [&steps](const std::string& doing, std::size_t number, std::size_t total) {
            steps.push_back(doing + ' ' + std::to_string(number) + '/' + std::to_string(total));
        }));
    EXPECT_THAT(steps, SizeIs(30));
    EXPECT_EQ(steps.front(), "asking for QVXZR_DHCPProtocolEndpoint 1/30");
    EXPECT_EQ(steps.back(), "following QVXZR_IPAssignmentSettingData 30/30");
}

TEST(ServerFindings, TellOfClassesThatFailAlikeAtOnce) {
    Manager manager;
    const cimom::Status notLoaded{CMPI_RC_ERR_NOT_FOUND, "Provider not loadable"};
    manager.failures = {
        {"QVXZR_DHCPProtocolEndpoint", notLoaded},
        {"QVXZR_DHCPCapabilities", notLoaded},
        {"QVXZR_DHCPSettingData", {CMPI_RC_ERR_NOT_SUPPORTED, "CIM_ERR_NOT_SUPPORTED: blocked"}}};
    const std::vector<Finding> findings = wrongFindings(manager);
    EXPECT_THAT(findings, Contains(finding("QVXZR_DHCPProtocolEndpoint, QVXZR_DHCPCapabilities",
                                           "CIM_ERR_NOT_FOUND: Provider not loadable",
                                           "the library is not in a directory")));
    EXPECT_THAT(findings, Contains(finding("QVXZR_DHCPSettingData",
                                           "CIM_ERR_NOT_SUPPORTED: blocked", "is disabled")));
}

TEST(ServerFindings, TellWhatAStatusComesFrom) {
    const auto remedyFor = [](CMPIrc code) {
        Manager manager;
        manager.failures = {{"QVXZR_DHCPSettingData", {code, ""}}};
        return wrongFindings(manager).at(0).remedy;
    };
    EXPECT_THAT(remedyFor(CMPI_RC_ERR_ACCESS_DENIED), HasSubstr("--credentials"));
    EXPECT_THAT(remedyFor(CMPI_RC_ERR_INVALID_NAMESPACE), HasSubstr("--namespace"));
    EXPECT_THAT(remedyFor(CMPI_RC_ERR_INVALID_CLASS), HasSubstr("does not know the class"));
    EXPECT_THAT(remedyFor(CMPI_RC_ERR_FAILED), HasSubstr("the library is not in a directory"));
    EXPECT_THAT(remedyFor(CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED), HasSubstr("LOG_LEVEL=3000"));
}

TEST(ServerFindings, TellThatNoClassHasAProvider) {
    Manager manager;
    manager.instances.clear();
    EXPECT_THAT(wrongFindings(manager),
                ElementsAre(finding(
                    "classes", "are known, and none has an instance, not even QVXZR_ComputerSystem",
                    "no provider is registered")));
}

TEST(ServerFindings, TellThatNeighboursAreMissing) {
    Manager manager;
    manager.instances.erase("QVXZR_ComputerSystem");
    manager.instances.erase("QVXZR_IPProtocolEndpoint");
    const std::vector<Finding> findings = wrongFindings(manager);
    EXPECT_THAT(findings,
                Contains(finding("QVXZR_ComputerSystem", "no instance, and every machine has one",
                                 "register the neighbours")));
    EXPECT_THAT(findings, Contains(finding("QVXZR_SAPSAPDependency",
                                           "Antecedent leads to QVXZR_IPProtocolEndpoint."
                                           "InstanceID=\"1\": CIM_ERR_NOT_FOUND (and 1 response "
                                           "like it)",
                                           "register the neighbours")));
}

TEST(ServerFindings, AClassWithoutInstancesIsWorthALook) {
    Manager manager;
    manager.instances.erase("QVXZR_DHCPCapabilities");
    EXPECT_THAT(wrongFindings(manager),
                ElementsAre(AllOf(Field(&Finding::verdict, Finding::Verdict::notable),
                                  Field(&Finding::what, "QVXZR_DHCPCapabilities"),
                                  Field(&Finding::detail, "no instance"))));
}

TEST(ServerFindings, TellThatAnotherInstanceIsGiven) {
    Manager manager;
    manager.alwaysTheFirst = {"QVXZR_DHCPRemoteServiceAccessPoint"};
    EXPECT_THAT(wrongFindings(manager),
                ElementsAre(finding("QVXZR_DHCPRemoteServiceAccessPoint",
                                    "GetInstance of QVXZR_DHCPRemoteServiceAccessPoint."
                                    "InstanceID=\"2\" gives another instance (and 1 response "
                                    "like it)",
                                    "without --exact")));
}

TEST(ServerFindings, TellThatAnInstanceIsGivenWhichThereIsNot) {
    Manager manager;
    manager.alwaysTheFirst = {"QVXZR_DHCPSettingData"};
    manager.instances["QVXZR_DHCPSettingData"].pop_back();
    EXPECT_THAT(wrongFindings(manager),
                ElementsAre(finding("QVXZR_DHCPSettingData",
                                    "GetInstance of QVXZR_DHCPSettingData.InstanceID=\"1-none\", "
                                    "which there is not, gives an instance",
                                    "without --exact")));
}

TEST(ServerFindings, TellThatAnAssociationCannotBeGot) {
    Manager manager;
    manager.alwaysTheFirst = {"QVXZR_HostedDHCPPoint"};
    const std::vector<Finding> findings = wrongFindings(manager);
    ASSERT_THAT(findings, SizeIs(1));
    EXPECT_EQ(findings.at(0).what, "QVXZR_HostedDHCPPoint");
    EXPECT_THAT(findings.at(0).detail, HasSubstr("gives another instance"));
}

TEST(ServerFindings, TellOfReferencesToOtherInstances) {
    Manager manager;
    manager.unfiltered = true;
    EXPECT_THAT(wrongFindings(manager),
                Contains(finding("QVXZR_DHCPProtocolEndpoint",
                                 "7 of 14 references to QVXZR_DHCPProtocolEndpoint.InstanceID="
                                 "\"1\" do not name it (and 1 response like it)",
                                 "without --exact")));
}

TEST(ServerFindings, TellThatReferencesFail) {
    Manager manager;
    manager.referencesStatus = {CMPI_RC_ERR_INVALID_CLASS, ""};
    EXPECT_THAT(wrongFindings(manager),
                Contains(finding("QVXZR_DHCPCapabilities",
                                 "ReferenceNames of QVXZR_DHCPCapabilities.InstanceID=\"1\": "
                                 "CIM_ERR_INVALID_CLASS (and 1 response like it)",
                                 "without --exact")));
    manager.referencesStatus = {CMPI_RC_ERR_FAILED, "libOther.so was not found"};
    EXPECT_THAT(wrongFindings(manager),
                Contains(finding("QVXZR_DHCPCapabilities",
                                 "ReferenceNames of QVXZR_DHCPCapabilities.InstanceID=\"1\": "
                                 "CIM_ERR_FAILED: libOther.so was not found (and 1 response like "
                                 "it)",
                                 "the library is not in a directory")));
}

TEST(ServerFindings, TellOfRequestsThatAreNotRespondedTo) {
    Manager manager;
    manager.silent = {"QVXZR_DHCPSettingData", "QVXZR_DHCPOrderedComponent"};
    EXPECT_THAT(wrongFindings(manager),
                ElementsAre(finding("QVXZR_DHCPSettingData, QVXZR_DHCPOrderedComponent",
                                    "no response", "manager's log")));
    manager.silent = {"QVXZR_DHCPProtocolEndpoint"};
    EXPECT_THROW(static_cast<void>(serverFindings(manager)), Failure);
    manager.silent.clear();
    manager.silentGet = "QVXZR_DHCPCapabilities";
    EXPECT_THAT(wrongFindings(manager),
                ElementsAre(finding("QVXZR_DHCPCapabilities", "no response", "manager's log")));
}

TEST(ServerFindings, HostsAndNamespacesInReferencesDoNotCount) {
    Manager manager;
    for (Instance& each : manager.instances["QVXZR_SAPSAPDependency"]) {
        each.properties.clear();
        for (const cimom::NamedValue& key : each.path.keys) {
            ObjectPath end = **std::get_if<std::shared_ptr<const ObjectPath>>(key.value.scalar());
            end.host = "host";
            end.nameSpace.clear();
            each.properties.push_back({key.name, reference(end)});
        }
    }
    EXPECT_THAT(wrongFindings(manager), IsEmpty());
}

}  // namespace
}  // namespace cimdhcp
