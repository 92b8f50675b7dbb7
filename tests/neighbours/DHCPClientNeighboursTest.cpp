// The CMPI side of the neighbours: their function table on the object manager's own
// broker, and their library behind the object manager.

#include <cmpift.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <optional>
#include <string>
#include <vector>

#include "broker/Broker.h"
#include "broker/Conversion.h"
#include "broker/RequestScope.h"
#include "broker/objects/BrokerRecords.h"
#include "broker/objects/BrokerResult.h"
#include "cimom/ClassRepository.h"
#include "cimom/ObjectManager.h"
#include "cimom/ObjectPathText.h"
#include "cimom/Results.h"
#include "kit/CountedBroker.h"
#include "kit/LogCapture.h"
#include "kit/Tree.h"

CMPI_EXTERN_C CMPIInstanceMI* DHCPClientNeighbours_Create_InstanceMI(const CMPIBroker* broker,
                                                                     const CMPIContext* ctx,
                                                                     CMPIStatus* rc);

namespace {

using test::CountedBroker;
using test::dhcpInterface;
using test::Fault;
using test::Function;
using test::host;
using test::Json;
using test::serviceProcessor;
using test::staticInterface;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ZR::Testing::LogCapture;

using Texts = std::vector<std::string>;
enum class Kind { paths, instances };

cimom::ClassRepository loadSchema() {
    cimom::ClassRepository repository;
    repository.loadDirectory(ZR_SOURCE_DIR "/schema");
    repository.complete();
    return repository;
}

std::string textOf(const cimom::Scalar& scalar) {
    if (const auto* text = std::get_if<std::string>(&scalar)) {
        return *text;
    }
    const auto* number = std::get_if<std::uint64_t>(&scalar);
    return number == nullptr ? "(other)" : std::to_string(*number);
}

std::string textOf(const cimom::Value& value) {
    if (value.isNull()) {
        return "null";
    }
    if (const cimom::Scalar* scalar = value.scalar()) {
        return textOf(*scalar);
    }
    std::string text;
    for (const cimom::Scalar& element : *value.array()) {
        text += "{" + textOf(element) + "}";
    }
    return text;
}

/// The properties of an instance as "Name=value", in their order.
Texts propertiesOf(const cimom::Instance& instance) {
    Texts texts;
    for (const cimom::NamedValue& property : instance.properties) {
        texts.push_back(property.name + "=" + textOf(property.value));
    }
    return texts;
}

class NeighboursTest : public test::TreeTest {
  protected:
    struct Response {
        CMPIrc code = CMPI_RC_OK;
        Texts paths;
        std::vector<cimom::Instance> instances;
        unsigned returnDoneCalls = 0;
        std::string message;
    };

    void SetUp() override {
        TreeTest::SetUp();
        Json eth0 = dhcpInterface("eth0");
        eth0["properties"]["IPv4Address"] = "192.0.2.10";
        setTree({host({eth0, staticInterface("eth1")}), serviceProcessor({})});
    }

    /// Calls a slot of the table: `call(context, result, path)`.
    template <typename Call>
    Response request(Kind kind, const std::string& path, const Call& call) {
        const cimom::broker::RequestScope scope;
        cimom::CollectedObjects<cimom::ObjectPath> paths;
        cimom::CollectedObjects<cimom::Instance> instances;
        cimom::broker::AnyReceiver receiver = &instances;
        if (kind == Kind::paths) {
            receiver = &paths;
        }
        const cimom::broker::BrokerResult handedOver(receiver);
        cimom::broker::Arena& arena = cimom::broker::RequestScope::current().arena();
        const CMPIContext* context = cimom::broker::makeContext(arena, "root/cimv2", "", 0, 1);
        broker_.beginRequest();
        const CMPIObjectPath* record = broker_.standIn(cimom::broker::toRecord(
            arena, &repository_, cimom::parseObjectPath("root/cimv2:" + path)));
        const CMPIStatus status = call(context, broker_.standIn(handedOver.record()), record);
        Response response{status.rc, {}, {}, handedOver.returnDoneCalls(), ""};
        if (status.msg != nullptr) {
            response.message = status.msg->ft->getCharPtr(status.msg, nullptr);
        }
        for (const auto& each : paths.objects) {
            response.paths.push_back(toText(each.value()));
        }
        for (const auto& each : instances.objects) {
            response.instances.push_back(each.value());
        }
        return response;
    }

    Response names(const std::string& path) {
        return request(Kind::paths, path, [this](auto* context, auto* result, auto* record) {
            return table().enumerateInstanceNames(mi_, context, result, record);
        });
    }
    Response instances(const std::string& path) {
        return request(Kind::instances, path, [this](auto* context, auto* result, auto* record) {
            return table().enumerateInstances(mi_, context, result, record, nullptr);
        });
    }
    Response get(const std::string& path, const char** properties = nullptr) {
        return request(Kind::instances, path, [=, this](auto* context, auto* result, auto* record) {
            return table().getInstance(mi_, context, result, record, properties);
        });
    }

    [[nodiscard]] const CMPIInstanceMIFT& table() const { return *mi_->ft; }

    static std::string ofHost(std::string text) {
        for (std::size_t at = text.find('@'); at != std::string::npos; at = text.find('@')) {
            text.replace(at, 1, hostName());
        }
        return text;
    }

    cimom::ClassRepository repository_ = loadSchema();
    cimom::broker::Broker real_{repository_};
    CountedBroker broker_{real_.record()};
    CMPIInstanceMI* mi_ =
        DHCPClientNeighbours_Create_InstanceMI(broker_.record(), nullptr, nullptr);
};

// The table.

TEST_F(NeighboursTest, TableNamesItselfAndHasNoEmptySlot) {
    EXPECT_EQ(table().ftVersion, 200);
    EXPECT_EQ(table().miVersion, 200);
    EXPECT_STREQ(table().miName, "instanceDHCPClientNeighbours");
    EXPECT_TRUE(table().cleanup != nullptr && table().enumerateInstanceNames != nullptr &&
                table().enumerateInstances != nullptr && table().getInstance != nullptr &&
                table().createInstance != nullptr && table().modifyInstance != nullptr &&
                table().deleteInstance != nullptr && table().execQuery != nullptr);
    EXPECT_EQ(table().cleanup(mi_, nullptr, 0).rc, CMPI_RC_OK);
}

TEST_F(NeighboursTest, NothingCanBeChanged) {
    const cimom::broker::RequestScope scope;
    for (const CMPIStatus status :
         {table().createInstance(nullptr, nullptr, nullptr, nullptr, nullptr),
          table().modifyInstance(nullptr, nullptr, nullptr, nullptr, nullptr, nullptr),
          table().deleteInstance(nullptr, nullptr, nullptr, nullptr),
          table().execQuery(nullptr, nullptr, nullptr, nullptr, nullptr, nullptr)}) {
        EXPECT_EQ(status.rc, CMPI_RC_ERR_NOT_SUPPORTED);
        ASSERT_NE(status.msg, nullptr);
        EXPECT_STREQ(status.msg->ft->getCharPtr(status.msg, nullptr), "This provider only reads");
    }
}

// Enumerations.

TEST_F(NeighboursTest, NamesAreWholePathsInTheNamespaceOfTheRequest) {
    Response response = names("QVXZR_ComputerSystem");
    EXPECT_EQ(response.code, CMPI_RC_OK);
    EXPECT_THAT(response.paths,
                ElementsAre(ofHost("root/cimv2:QVXZR_ComputerSystem.CreationClassName="
                                   R"("QVXZR_ComputerSystem",Name="@")")));
    EXPECT_EQ(response.returnDoneCalls, 1U);
    EXPECT_THAT(names("QVXZR_SPComputerSystem").paths,
                ElementsAre("root/cimv2:QVXZR_SPComputerSystem.CreationClassName="
                            R"("QVXZR_SPComputerSystem",Name="BMC:-1")"));
    EXPECT_THAT(names("QVXZR_IPProtocolEndpoint").paths,
                ElementsAre(ofHost("root/cimv2:QVXZR_IPProtocolEndpoint."
                                   R"(SystemCreationClassName="QVXZR_ComputerSystem",)"
                                   R"(SystemName="@",CreationClassName=)"
                                   R"("QVXZR_IPProtocolEndpoint",Name="eth0")")));
    EXPECT_THAT(
        names("QVXZR_IPAssignmentSettingData").paths,
        ElementsAre(R"(root/cimv2:QVXZR_IPAssignmentSettingData.InstanceID="Computer%eth0%dhcp")",
                    R"(root/cimv2:QVXZR_IPAssignmentSettingData.InstanceID="Computer%eth1%dhcp")"));
}

TEST_F(NeighboursTest, InstancesHaveTheirKeysAsPropertiesToo) {
    const Response computers = instances("QVXZR_ComputerSystem");
    ASSERT_EQ(computers.instances.size(), 1U);
    EXPECT_THAT(propertiesOf(computers.instances[0]),
                ElementsAre("CreationClassName=QVXZR_ComputerSystem", "Name=" + hostName(),
                            "ElementName=" + hostName(), "NameFormat=Other", "Dedicated={0}",
                            "EnabledState=null", "RequestedState=null", "EnabledDefault=null",
                            "TransitioningToState=null"));
    EXPECT_EQ(computers.returnDoneCalls, 1U);
    const Response endpoints = instances("QVXZR_IPProtocolEndpoint");
    ASSERT_EQ(endpoints.instances.size(), 1U);
    EXPECT_THAT(
        propertiesOf(endpoints.instances[0]),
        ElementsAre("SystemCreationClassName=QVXZR_ComputerSystem", "SystemName=" + hostName(),
                    "CreationClassName=QVXZR_IPProtocolEndpoint", "Name=eth0", "ElementName=eth0",
                    "NameFormat=NICName", "ProtocolIFType=4096", "IPv4Address=192.0.2.10",
                    "AddressOrigin=4", "EnabledState=null", "RequestedState=null",
                    "EnabledDefault=null", "TransitioningToState=null"));
    const Response assignments = instances("QVXZR_IPAssignmentSettingData");
    ASSERT_EQ(assignments.instances.size(), 2U);
    EXPECT_THAT(
        propertiesOf(assignments.instances[1]),
        ElementsAre("InstanceID=Computer%eth1%dhcp", "ElementName=eth1", "AddressOrigin=4"));
}

TEST_F(NeighboursTest, NameKeyChoosesTheComputer) {
    EXPECT_THAT(names(R"(QVXZR_ComputerSystem.Name="BMC:-1")").paths,
                ElementsAre("root/cimv2:QVXZR_SPComputerSystem.CreationClassName="
                            R"("QVXZR_SPComputerSystem",Name="BMC:-1")"));
    const Response none = names(R"(QVXZR_ComputerSystem.Name="elsewhere")");
    EXPECT_EQ(none.code, CMPI_RC_OK);
    EXPECT_THAT(none.paths, IsEmpty());
    EXPECT_EQ(none.returnDoneCalls, 1U);
}

TEST_F(NeighboursTest, ForeignClassIsInvalidWithoutResultsOrAnEnd) {
    for (const char* name : {"CIM_ComputerSystem", "QVXZR_DHCPSettingData", "No_SuchClass"}) {
        for (const Response& response : {names(name), instances(name), get(name)}) {
            EXPECT_EQ(response.code, CMPI_RC_ERR_INVALID_CLASS) << name;
            EXPECT_EQ(response.message,
                      std::string("This provider does not serve the class ") + name);
            EXPECT_THAT(response.paths, IsEmpty());
            EXPECT_THAT(response.instances, IsEmpty());
            EXPECT_EQ(response.returnDoneCalls, 0U);
        }
    }
}

// Get.

TEST_F(NeighboursTest, GetGivesTheOneInstanceThatAgreesWithEveryKey) {
    const Response response =
        get(R"(QVXZR_IPAssignmentSettingData.InstanceID="Computer%eth1%dhcp")");
    EXPECT_EQ(response.code, CMPI_RC_OK);
    ASSERT_EQ(response.instances.size(), 1U);
    EXPECT_THAT(
        propertiesOf(response.instances[0]),
        ElementsAre("InstanceID=Computer%eth1%dhcp", "ElementName=eth1", "AddressOrigin=4"));
    EXPECT_EQ(response.returnDoneCalls, 1U);
}

TEST_F(NeighboursTest, GetComparesKeyNamesWithoutAndValuesWithCase) {
    EXPECT_EQ(
        get(R"(QVXZR_IPAssignmentSettingData.INSTANCEID="Computer%eth0%dhcp")").instances.size(),
        1U);
    EXPECT_EQ(get(R"(QVXZR_IPAssignmentSettingData.InstanceID="computer%eth0%dhcp")").code,
              CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(NeighboursTest, GetGivesThePropertiesOfTheList) {
    const char* some[] = {"elementname", "NoSuchProperty", nullptr};
    const std::string path = R"(QVXZR_IPAssignmentSettingData.InstanceID="Computer%eth1%dhcp")";
    const Response response = get(path, some);
    ASSERT_EQ(response.instances.size(), 1U);
    // A null stays in place of a default of the schema.
    EXPECT_THAT(propertiesOf(response.instances[0]),
                ElementsAre("ElementName=eth1", "AddressOrigin=null"));
    const char* none[] = {nullptr};
    EXPECT_THAT(propertiesOf(get(path, none).instances.at(0)),
                ElementsAre("ElementName=null", "AddressOrigin=null"));
}

TEST_F(NeighboursTest, GetRefusesKeysThatTheClassDoesNotHave) {
    for (const char* path :
         {"QVXZR_IPAssignmentSettingData.InstanceID=4",
          R"(QVXZR_IPAssignmentSettingData.InstanceID="Computer%eth0%dhcp",More="x")",
          R"(QVXZR_IPAssignmentSettingData.More="x")"}) {
        const Response response = get(path);
        EXPECT_EQ(response.code, CMPI_RC_ERR_INVALID_PARAMETER) << path;
        EXPECT_EQ(response.message,
                  "The path has a key that QVXZR_IPAssignmentSettingData does not have, or one "
                  "that is not a text");
        EXPECT_THAT(response.instances, IsEmpty()) << path;
    }
}

TEST_F(NeighboursTest, GetOfAPathWithoutKeysGivesTheFirst) {
    const Response response = get("QVXZR_IPProtocolEndpoint");
    ASSERT_EQ(response.instances.size(), 1U);
    EXPECT_THAT(propertiesOf(response.instances[0]), testing::Contains("Name=eth0"));
    // Not the first by the key that is there, either.
    EXPECT_EQ(get(R"(QVXZR_IPProtocolEndpoint.Name="eth9")").code, CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(NeighboursTest, MissingObjectIsNotFoundAndLeavesTheResultOpen) {
    const std::string endpoint =
        R"(QVXZR_IPProtocolEndpoint.SystemCreationClassName="QVXZR_ComputerSystem",)"
        R"(CreationClassName="QVXZR_IPProtocolEndpoint",)";
    for (const std::string& path : std::vector<std::string>{
             R"(QVXZR_ComputerSystem.CreationClassName="QVXZR_ComputerSystem",Name="elsewhere")",
             // It is there, but of another class.
             R"(QVXZR_ComputerSystem.CreationClassName="QVXZR_SPComputerSystem",Name="BMC:-1")",
             endpoint + ofHost(R"(SystemName="@",Name="eth1")"),  // it has no address
             endpoint + R"(SystemName="elsewhere",Name="eth0")",
             R"(QVXZR_IPAssignmentSettingData.InstanceID="Computer%eth9%dhcp")"}) {
        const Response response = get(path);
        EXPECT_EQ(response.code, CMPI_RC_ERR_NOT_FOUND) << path;
        EXPECT_EQ(response.message,
                  "There is no such instance of " + path.substr(0, path.find('.')));
        EXPECT_THAT(response.instances, IsEmpty()) << path;
        EXPECT_EQ(response.returnDoneCalls, 0U) << path;
    }
    EXPECT_EQ(get(endpoint + ofHost(R"(SystemName="@",Name="eth0")")).instances.size(), 1U);
}

// A broker that fails.

TEST_F(NeighboursTest, ObjectThatTheBrokerRefusesInAnyPartFailsTheRequest) {
    for (const Function function : {Function::newObjectPath, Function::newString, Function::addKey,
                                    Function::returnObjectPath}) {
        broker_.fail(function, 2, Fault::status);
        const bool oneOnly =
            function != Function::newObjectPath && function != Function::returnObjectPath;
        const Response response =
            names(oneOnly ? "QVXZR_ComputerSystem" : "QVXZR_IPAssignmentSettingData");
        EXPECT_EQ(response.code, CMPI_RC_ERR_FAILED) << nameOf(function);
        EXPECT_EQ(response.paths.size(), oneOnly ? 0U : 1U) << nameOf(function);
        EXPECT_EQ(response.returnDoneCalls, 0U) << nameOf(function);
    }
    for (const Function function :
         {Function::newObjectPath, Function::newInstance, Function::addKey, Function::setProperty,
          Function::newArray, Function::setElementAt, Function::returnInstance}) {
        broker_.fail(function, 1, Fault::status);
        const Response response = instances("QVXZR_ComputerSystem");
        EXPECT_EQ(response.code, CMPI_RC_ERR_FAILED) << nameOf(function);
        EXPECT_THAT(response.instances, IsEmpty()) << nameOf(function);
        EXPECT_EQ(get(ofHost(R"(QVXZR_ComputerSystem.CreationClassName="QVXZR_ComputerSystem",)"
                             R"(Name="@")"))
                      .code,
                  CMPI_RC_ERR_FAILED)
            << nameOf(function);
    }
}

TEST_F(NeighboursTest, EveryCallMayFailAndNoneIsFatal) {
    for (std::size_t i = 0; i < test::functionCount; ++i) {
        const auto function = static_cast<Function>(i);
        for (const Fault fault : {Fault::null, Fault::status, Fault::exception}) {
            if (fault == Fault::null && !test::canReturnNull(function)) {
                continue;
            }
            for (unsigned call = 1;; ++call) {
                broker_.fail(function, call, fault);
                const Response response =
                    get(R"(QVXZR_SPComputerSystem.CreationClassName="QVXZR_SPComputerSystem",)"
                        R"(Name="BMC:-1")");
                if (broker_.calls(function) < call) {
                    break;
                }
                EXPECT_THAT(
                    response.code,
                    ::testing::AnyOf(CMPI_RC_OK, CMPI_RC_ERR_FAILED, CMPI_RC_ERR_NOT_FOUND,
                                     CMPI_RC_ERR_INVALID_PARAMETER, CMPI_RC_ERR_INVALID_CLASS))
                    << nameOf(function) << ' ' << call;
            }
        }
    }
}

TEST_F(NeighboursTest, ExceptionFailsTheRequestAndIsTold) {
    const LogCapture log(6000, 6000);
    broker_.fail(Function::newInstance, 1, Fault::exception);
    EXPECT_EQ(instances("QVXZR_ComputerSystem").code, CMPI_RC_ERR_FAILED);
    const auto lines = log.log();
    ASSERT_EQ(lines.size(), 1U);
    EXPECT_EQ(lines[0].level, 6000);
    EXPECT_EQ(lines[0].category, "ZR.Neighbours");
    EXPECT_EQ(lines[0].file, "neighbours/DHCPClientNeighbours");
    EXPECT_EQ(lines[0].message, "a function of the broker threw");
}

// Behind an object manager.

class NeighboursLibraryTest : public test::TreeTest {
  protected:
    void SetUp() override {
        TreeTest::SetUp();
        setTree({host({dhcpInterface("eth0")}), serviceProcessor({dhcpInterface("bmc0")})});
    }

    static cimom::Configuration configuration() {
        cimom::Configuration result;
        result.schemaDirectories = {ZR_SOURCE_DIR "/schema"};
        result.registrationFiles = {ZR_SOURCE_DIR
                                    "/schema/exact/DHCPClientNeighbours.registration"};
        result.providerDirectories = {ZR_BINARY_DIR "/lib/cmpi"};
        return result;
    }

    cimom::ObjectManager manager_{configuration()};
};

TEST_F(NeighboursLibraryTest, PropertyListRestrictsWhatIsToldAndKeysStayInThePath) {
    const auto path = cimom::parseObjectPath("root/cimv2:QVXZR_IPAssignmentSettingData");
    const auto result =
        manager_.enumerateInstances(path, {Texts{"elementname", "NoSuchProperty"}, ""});
    ASSERT_EQ(result.status.code, CMPI_RC_OK);
    ASSERT_EQ(result.instances.size(), 2U);
    EXPECT_THAT(propertiesOf(result.instances[0].value()), ElementsAre("ElementName=eth0"));
    EXPECT_EQ(toText(result.instances[0]->path),
              R"(root/cimv2:QVXZR_IPAssignmentSettingData.InstanceID="Computer%eth0%dhcp")");
    const auto nothing = manager_.enumerateInstances(path, {Texts{}, ""});
    ASSERT_EQ(nothing.instances.size(), 2U);
    EXPECT_THAT(propertiesOf(nothing.instances[0].value()), IsEmpty());
}

TEST_F(NeighboursLibraryTest, StandardClassReachesHostAndServiceProcessor) {
    const auto result =
        manager_.enumerateInstanceNames(cimom::parseObjectPath("root/cimv2:CIM_ComputerSystem"));
    ASSERT_EQ(result.status.code, CMPI_RC_OK);
    Texts classes;
    for (const auto& path : result.paths) {
        classes.push_back(path.value().className);
    }
    EXPECT_THAT(classes,
                ::testing::UnorderedElementsAre("QVXZR_ComputerSystem", "QVXZR_SPComputerSystem"));
}

TEST_F(NeighboursLibraryTest, MissingObjectIsNotFound) {
    const auto result = manager_.getInstance(
        cimom::parseObjectPath(R"(root/cimv2:QVXZR_SPComputerSystem.)"
                               R"(CreationClassName="QVXZR_SPComputerSystem",Name="x")"));
    EXPECT_EQ(result.status.code, CMPI_RC_ERR_NOT_FOUND);
}

}  // namespace
