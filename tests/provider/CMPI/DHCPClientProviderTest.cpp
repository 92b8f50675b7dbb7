#include <cmpift.h>
#include <dlfcn.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "DHCPClientProvider.h"
#include "cimom/Instance.h"
#include "kit/Files.h"
#include "kit/Host.h"
#include "kit/LogCapture.h"
#include "kit/Tree.h"

namespace {

using test::dhcpInterface;
using test::Fault;
using test::Function;
using test::Host;
using test::host;
using test::keysOf;
using test::pathOf;
using test::serviceProcessor;
using test::staticInterface;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::SizeIs;
using ZR::Testing::LogCapture;
using ZR::Testing::openDescriptors;

constexpr const char* endpointName = "QVXZR_DHCPProtocolEndpoint";
constexpr const char* settingName = "QVXZR_DHCPSettingData";

/// The entering and exiting lines of the frame in few words.
std::vector<std::string> flow(const LogCapture& log) {
    std::vector<std::string> lines;
    for (const auto& line : log.log()) {
        EXPECT_EQ(line.file, "DHCPClientProvider");
        EXPECT_EQ(line.category, "Merrow.DHCPClientProvider");
        lines.push_back(line.message.substr(0, line.message.find(" in ")));
    }
    return lines;
}

std::string entering(const std::string& function) {
    return "ENTERING: " + function + "()";
}

std::string exiting(const std::string& function) {
    return "EXITING: " + function + "()";
}

class DHCPClientProviderTest : public test::TreeTest {
  protected:
    static std::vector<unsigned short> identifiers(const char* className) {
        std::vector<unsigned short> ids;
        const bool found = ZR::DHCPClientProvider::getClassId(className, "root/cimv2", ids);
        EXPECT_EQ(found, !ids.empty());
        return ids;
    }

    Host host_{Host::Neighbours::absent, Host::Calls::counted};
};

// The function tables and factories.

TEST_F(DHCPClientProviderTest, FactoriesHandOutTheSameRecordEachTimeAndTheBrokerOfTheLastCall) {
    CMPIInstanceMI* first = DHCPClientProvider_Create_InstanceMI(host_.broker(), nullptr, nullptr);
    CMPIInstanceMI* second = DHCPClientProvider_Create_InstanceMI(host_.broker(), nullptr, nullptr);
    EXPECT_EQ(first, second);
    EXPECT_EQ(first->hdl, nullptr);
    const CMPIBroker other{};
    CMPIAssociationMI* association =
        DHCPClientProvider_Create_AssociationMI(&other, nullptr, nullptr);
    EXPECT_EQ(association->hdl, nullptr);
    EXPECT_EQ(ZR::DHCPClientProvider::broker.load(), &other);
    DHCPClientProvider_Create_InstanceMI(host_.broker(), nullptr, nullptr);
    EXPECT_EQ(ZR::DHCPClientProvider::broker.load(), host_.broker());
}

TEST_F(DHCPClientProviderTest, FactoriesDoNotWriteTheStatus) {
    CMPIStatus status{CMPI_RC_ERR_NOT_FOUND, nullptr};
    DHCPClientProvider_Create_InstanceMI(host_.broker(), nullptr, &status);
    DHCPClientProvider_Create_AssociationMI(host_.broker(), nullptr, &status);
    EXPECT_EQ(status.rc, CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(DHCPClientProviderTest, FactoriesTraceTheirEntryAndExit) {
    const LogCapture log;
    DHCPClientProvider_Create_InstanceMI(host_.broker(), nullptr, nullptr);
    DHCPClientProvider_Create_AssociationMI(host_.broker(), nullptr, nullptr);
    EXPECT_THAT(flow(log), ElementsAre(entering("DHCPClientProvider_Create_InstanceMI"),
                                       exiting("DHCPClientProvider_Create_InstanceMI"),
                                       entering("DHCPClientProvider_Create_AssociationMI"),
                                       exiting("DHCPClientProvider_Create_AssociationMI")));
    EXPECT_EQ(log.logMessages(), log.traceMessages());
    EXPECT_THAT(log.log().front().message,
                ::testing::MatchesRegex(".*List:  broker=0x[0-9a-f]+ ctx=0 rc=0"));
    EXPECT_EQ(log.log().front().level, 3000);
}

TEST_F(DHCPClientProviderTest, TablesNameTheirLevelAndThemselvesAndHaveNoEmptySlot) {
    const CMPIInstanceMIFT& instance = host_.instanceTable();
    EXPECT_EQ(instance.ftVersion, 200);
    EXPECT_EQ(instance.miVersion, 200);
    EXPECT_STREQ(instance.miName, "instanceDHCPClientProvider");
    EXPECT_TRUE(instance.cleanup != nullptr && instance.enumerateInstanceNames != nullptr &&
                instance.enumerateInstances != nullptr && instance.getInstance != nullptr &&
                instance.createInstance != nullptr && instance.modifyInstance != nullptr &&
                instance.deleteInstance != nullptr && instance.execQuery != nullptr);
    const CMPIAssociationMIFT& association = host_.associationTable();
    EXPECT_EQ(association.ftVersion, 200);
    EXPECT_EQ(association.miVersion, 200);
    EXPECT_STREQ(association.miName, "associationDHCPClientProvider");
    EXPECT_TRUE(association.cleanup != nullptr && association.associators != nullptr &&
                association.associatorNames != nullptr && association.references != nullptr &&
                association.referenceNames != nullptr);
}

TEST_F(DHCPClientProviderTest, CleanupAnswersOkWhetherTerminatingOrNotAndTracesNothing) {
    const LogCapture log;
    for (const CMPIBoolean terminating : {CMPIBoolean{0}, CMPIBoolean{1}}) {
        const CMPIStatus instance = host_.instanceTable().cleanup(nullptr, nullptr, terminating);
        EXPECT_EQ(instance.rc, CMPI_RC_OK);
        EXPECT_EQ(instance.msg, nullptr);
        const CMPIStatus association =
            host_.associationTable().cleanup(nullptr, nullptr, terminating);
        EXPECT_EQ(association.rc, CMPI_RC_OK);
        EXPECT_EQ(association.msg, nullptr);
    }
    EXPECT_THAT(log.log(), IsEmpty());
}

// From class names to identifiers.

TEST_F(DHCPClientProviderTest, ServedClassNameGivesItsIdentifierWithoutAskingTheBroker) {
    EXPECT_THAT(identifiers(settingName), ElementsAre(85));
    EXPECT_EQ(host_.counted().calls(Function::classPathIsA), 0U);
}

TEST_F(DHCPClientProviderTest, StandardAssociationClassesGiveTheServedOnesUnderThem) {
    EXPECT_THAT(identifiers("CIM_HostedAccessPoint"), ElementsAre(34, 84));
    EXPECT_THAT(identifiers("CIM_ElementCapabilities"), ElementsAre(6));
    EXPECT_THAT(identifiers("CIM_SAPSAPDependency"), ElementsAre(8));
    EXPECT_THAT(identifiers("CIM_OrderedComponent"), ElementsAre(87));
    EXPECT_THAT(identifiers("CIM_RemoteAccessAvailableToElement"), ElementsAre(83));
    EXPECT_THAT(identifiers("CIM_ElementSettingData"), ElementsAre(86));
}

TEST_F(DHCPClientProviderTest, CommonAncestorsGiveSeveralInTheOrderOfTheTable) {
    EXPECT_THAT(identifiers("CIM_Dependency"), ElementsAre(34, 84, 8, 83));
    EXPECT_THAT(identifiers("CIM_HostedDependency"), ElementsAre(34, 84));
    EXPECT_THAT(identifiers("CIM_Component"), ElementsAre(87));
}

TEST_F(DHCPClientProviderTest, ElementClassesAndUnknownNamesGiveNone) {
    EXPECT_THAT(identifiers("CIM_DHCPProtocolEndpoint"), IsEmpty());
    EXPECT_THAT(identifiers("CIM_ManagedElement"), IsEmpty());
    EXPECT_THAT(identifiers("No_SuchClass"), IsEmpty());
}

TEST_F(DHCPClientProviderTest, NoClassNameStandsForAllSeven) {
    EXPECT_THAT(identifiers(nullptr), ElementsAre(6, 34, 84, 8, 87, 83, 86));
    EXPECT_THAT(identifiers(""), ElementsAre(6, 34, 84, 8, 87, 83, 86));
}

TEST_F(DHCPClientProviderTest, IdentifiersAreAppendedAndNullNamespaceIsLegal) {
    std::vector<unsigned short> ids{1};
    EXPECT_TRUE(ZR::DHCPClientProvider::getClassId(settingName, nullptr, ids));
    EXPECT_FALSE(ZR::DHCPClientProvider::getClassId("No_SuchClass", nullptr, ids));
    EXPECT_THAT(ids, ElementsAre(1, 85));
}

TEST_F(DHCPClientProviderTest, ClassIdentificationTracesItsEntryAndExit) {
    for (const char* name : {settingName, "CIM_HostedAccessPoint", "No_SuchClass"}) {
        const LogCapture log;
        identifiers(name);
        EXPECT_THAT(flow(log), ElementsAre(entering("getClassId"), exiting("getClassId"))) << name;
        EXPECT_EQ(log.logMessages(), log.traceMessages());
        EXPECT_THAT(log.log().front().message, HasSubstr(std::string("List:  className=") + name +
                                                         " nameSpace=root/cimv2 classIds=0x"));
        EXPECT_EQ(log.log().front().level, 3000);
    }
}

// Instance operations.

TEST_F(DHCPClientProviderTest, EndpointNamesAreDeliveredAndTheResultIsClosedOnce) {
    setTree({host({dhcpInterface("eth0"), staticInterface("eth1"), dhcpInterface("eth2")})});
    const Host::Response response = host_.enumerateNames(pathOf(endpointName));
    EXPECT_EQ(response.code, CMPI_RC_OK);
    EXPECT_FALSE(response.hasMessage);
    EXPECT_THAT(keysOf(response, "Name"), ElementsAre("eth0", "eth2"));
    EXPECT_EQ(response.returnDoneCalls, 1U);
}

TEST_F(DHCPClientProviderTest, SettingDataIsDeliveredWhollyAndTheResultIsLeftOpen) {
    setTree({host({dhcpInterface("eth0"), staticInterface("eth1")}),
             serviceProcessor({dhcpInterface("bmc0")})});
    const Host::Response response = host_.enumerateNames(pathOf(settingName));
    EXPECT_EQ(response.code, CMPI_RC_OK);
    EXPECT_THAT(keysOf(response, "InstanceID"),
                ElementsAre("Computer%eth0", "Computer%eth1", "BMC%bmc0"));
    EXPECT_EQ(response.returnDoneCalls, 0U);
}

struct EndingCase {
    const char* className;
    unsigned names;
    unsigned instances;
    unsigned get;
};

class ResultEndings : public test::TreeTest, public ::testing::WithParamInterface<EndingCase> {};

TEST_P(ResultEndings, AreUnevenAsClientsKnowThem) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"})})});
    Host host;
    const auto path = pathOf(GetParam().className);
    EXPECT_EQ(host.enumerateNames(path).returnDoneCalls, GetParam().names);
    EXPECT_EQ(host.enumerate(path).returnDoneCalls, GetParam().instances);
    EXPECT_EQ(host.get(path).returnDoneCalls, GetParam().get);
}

INSTANTIATE_TEST_SUITE_P(Elements, ResultEndings,
                         ::testing::Values(EndingCase{endpointName, 1, 1, 1},
                                           EndingCase{"QVXZR_DHCPCapabilities", 1, 1, 1},
                                           EndingCase{"QVXZR_DHCPRemoteServiceAccessPoint", 0, 0,
                                                      0},
                                           EndingCase{settingName, 0, 0, 0}),
                         [](const auto& each) { return std::string(each.param.className); });

TEST_F(DHCPClientProviderTest, UnknownClassIsInvalidWithoutResultsOrAnEnd) {
    for (const char* name : {"CIM_DHCPProtocolEndpoint", "QVXZR_ComputerSystem",
                             "QVXZR_SPComputerSystem", "CIM_ManagedElement"}) {
        for (const Host::Response& response :
             {host_.enumerateNames(pathOf(name)), host_.enumerate(pathOf(name)),
              host_.get(pathOf(name))}) {
            EXPECT_EQ(response.code, CMPI_RC_ERR_INVALID_CLASS) << name;
            EXPECT_FALSE(response.hasMessage);
            EXPECT_THAT(response.paths, IsEmpty());
            EXPECT_THAT(response.instances, IsEmpty());
            EXPECT_EQ(response.returnDoneCalls, 0U);
        }
    }
}

TEST_F(DHCPClientProviderTest, AnyNamespaceIsServedAndKept) {
    setTree({host({dhcpInterface("eth0")})});
    cimom::ObjectPath path = pathOf(endpointName);
    path.nameSpace = "root/elsewhere";
    const Host::Response response = host_.enumerateNames(path);
    ASSERT_THAT(response.paths, SizeIs(1));
    EXPECT_EQ(response.paths[0]->nameSpace, "root/elsewhere");
}

TEST_F(DHCPClientProviderTest, GetYieldsWhatThePathNames) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1")})});
    const Host::Response response = host_.get(pathOf(endpointName, {{"Name", "eth1"}}));
    ASSERT_THAT(response.instances, SizeIs(1));
    EXPECT_EQ(test::textOf(*response.instances[0], "Name"), "eth1");
}

TEST_F(DHCPClientProviderTest, GetOfAMissingObjectIsAnEmptySuccess) {
    setTree({host({dhcpInterface("eth0")})});
    const Host::Response response = host_.get(pathOf(endpointName, {{"Name", "eth9"}}));
    EXPECT_EQ(response.code, CMPI_RC_OK);
    EXPECT_THAT(response.instances, IsEmpty());
    EXPECT_EQ(response.returnDoneCalls, 1U);
}

TEST_F(DHCPClientProviderTest, GetOfHostedPointIsNotSupportedAndBuildsNoAdapter) {
    setTree({host({dhcpInterface("eth0")})});
    const LogCapture log;
    for (const char* name :
         {"QVXZR_HostedDHCPPoint", "QVXZR_SAPSAPDependency", "QVXZR_DHCPElementCapabilities"}) {
        const Host::Response response = host_.get(pathOf(name));
        EXPECT_EQ(response.code, CMPI_RC_ERR_NOT_SUPPORTED) << name;
        EXPECT_EQ(response.returnDoneCalls, 0U);
    }
    for (const auto& line : log.log()) {
        EXPECT_THAT(line.file, ::testing::AnyOf("DHCPClientProvider", "include/Trace"));
    }
}

TEST_F(DHCPClientProviderTest, CreateDeleteAndQueryAreRefusedWhateverTheirArguments) {
    const CMPIInstanceMIFT& table = host_.instanceTable();
    const LogCapture log;
    for (const CMPIStatus status :
         {table.createInstance(nullptr, nullptr, nullptr, nullptr, nullptr),
          table.deleteInstance(nullptr, nullptr, nullptr, nullptr),
          table.execQuery(nullptr, nullptr, nullptr, nullptr, nullptr, nullptr)}) {
        EXPECT_EQ(status.rc, CMPI_RC_ERR_NOT_SUPPORTED);
        EXPECT_EQ(status.msg, nullptr);
    }
    // One METHOD line each, and no marks.
    const auto lines = log.log();
    ASSERT_THAT(lines, SizeIs(3));
    EXPECT_EQ(log.trace().size(), 3U);
    const std::vector<std::string> names{"DHCPClient_CreateInstance", "DHCPClient_DeleteInstance",
                                         "DHCPClient_ExecQuery"};
    for (std::size_t i = 0; i < names.size(); ++i) {
        EXPECT_EQ(lines[i].level, 4000);
        EXPECT_EQ(lines[i].function, names[i]);
        EXPECT_THAT(lines[i].message,
                    ::testing::StartsWith("METHOD: " + names[i] +
                                          "() was invoked in DHCPClientProvider [Line: "));
    }
}

TEST_F(DHCPClientProviderTest, ModifyOfAnotherClassIsNotSupportedAndDoesNotCloseTheResult) {
    for (const char* name :
         {endpointName, "QVXZR_DHCPCapabilities", "QVXZR_HostedDHCPPoint", "CIM_DHCPSettingData"}) {
        const cimom::Instance instance;
        const Host::Response response = host_.modify(pathOf(name), &instance);
        EXPECT_EQ(response.code, CMPI_RC_ERR_NOT_SUPPORTED) << name;
        EXPECT_EQ(response.returnDoneCalls, 0U);
    }
}

TEST_F(DHCPClientProviderTest, ModifyOfAMissingSettingSucceedsAndClosesTheResult) {
    setTree({host({dhcpInterface("eth0")})});
    cimom::Instance instance;
    instance.path = pathOf(settingName);
    const Host::Response response =
        host_.modify(pathOf(settingName, {{"InstanceID", "Computer%eth9"}}), &instance);
    EXPECT_EQ(response.code, CMPI_RC_OK);
    EXPECT_EQ(response.returnDoneCalls, 1U);
}

TEST_F(DHCPClientProviderTest, ModifyThatFailsGivesItsCodeWithoutAMessage) {
    setTree({host({dhcpInterface("eth0")})});
    const Host::Response response =
        host_.modify(pathOf(settingName, {{"InstanceID", "Computer%eth0"}}), nullptr);
    EXPECT_EQ(response.code, CMPI_RC_ERR_FAILED);
    EXPECT_FALSE(response.hasMessage);
    EXPECT_EQ(response.returnDoneCalls, 1U);
}

TEST_F(DHCPClientProviderTest, ModifyTracesThePathAsText) {
    setTree({host({dhcpInterface("eth0")})});
    cimom::Instance instance;
    instance.path = pathOf(settingName);
    const LogCapture log;
    host_.modify(pathOf(settingName, {{"InstanceID", "Computer%eth0"}}), &instance);
    EXPECT_THAT(log.logMessages(),
                ::testing::Contains(::testing::AllOf(HasSubstr("'l_strObjectPath'"),
                                                     HasSubstr("InstanceID=\"Computer%eth0\""))));
}

// Failures.

TEST_F(DHCPClientProviderTest, ExceptionHalfWayLeavesWhatWasDeliveredAndTheStatusOk) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1"), dhcpInterface("eth2")})});
    const LogCapture log(6000, 6000);
    host_.counted().fail(Function::newObjectPath, 2, Fault::exception);
    const Host::Response response = host_.enumerate(pathOf(endpointName));
    EXPECT_EQ(response.code, CMPI_RC_OK);
    EXPECT_FALSE(response.hasMessage);
    ASSERT_THAT(response.instances, SizeIs(1));
    EXPECT_EQ(test::textOf(*response.instances[0], "Name"), "eth0");
    EXPECT_EQ(response.returnDoneCalls, 0U);
    for (const auto& lines : {log.log(), log.trace()}) {
        ASSERT_THAT(lines, SizeIs(1));
        EXPECT_EQ(lines[0].level, 6000);
        EXPECT_EQ(lines[0].function, "DHCPClient_EnumInstances");
        EXPECT_THAT(lines[0].message,
                    ::testing::MatchesRegex("MESSAGE \\[File: DHCPClientProvider, Line: "
                                            "[0-9]+\\]: a function of the broker threw"));
    }
}

TEST_F(DHCPClientProviderTest, ExitIsMarkedAfterAnExceptionToo) {
    setTree({host({dhcpInterface("eth0")})});
    const LogCapture log(4000);
    host_.counted().fail(Function::newObjectPath, 1, Fault::exception);
    host_.enumerateNames(pathOf(endpointName));
    const auto messages = log.logMessages();
    ASSERT_GE(messages.size(), 2U);
    EXPECT_THAT(messages[messages.size() - 2],
                ::testing::StartsWith("EXITING: DHCPClient_EnumInstanceNames() in "
                                      "DHCPClientProvider [Line: "));
    EXPECT_EQ(messages.back(), std::string(78, '='));
}

TEST_F(DHCPClientProviderTest, ObjectThatTheBrokerRefusesIsPassedOverWithOneFailureLine) {
    for (const Fault fault : {Fault::null, Fault::status}) {
        setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1"), dhcpInterface("eth2")})});
        const LogCapture log(6000, 6000);
        host_.counted().fail(Function::newInstance, 2, fault);
        const Host::Response response = host_.enumerate(pathOf(endpointName));
        EXPECT_EQ(response.code, CMPI_RC_OK);
        ASSERT_THAT(response.instances, SizeIs(2));
        EXPECT_EQ(test::textOf(response.instances[0].value(), "Name"), "eth0");
        EXPECT_EQ(test::textOf(response.instances[1].value(), "Name"), "eth2");
        EXPECT_EQ(response.returnDoneCalls, 1U);
        EXPECT_THAT(log.log(), SizeIs(1));
    }
}

TEST_F(DHCPClientProviderTest, RequestsAreFramedByMarksAndTellTheClassIdentifier) {
    const LogCapture log(4000);
    host_.enumerateNames(pathOf("CIM_ManagedElement"));
    const auto lines = log.log();
    ASSERT_THAT(lines, SizeIs(5));
    const std::string separator(78, '=');
    EXPECT_EQ(lines[0].message, separator);
    EXPECT_EQ(lines[0].file, "include/Trace");
    EXPECT_EQ(lines[0].function, "markProviderEntry");
    EXPECT_THAT(lines[1].message, ::testing::StartsWith("ENTERING: DHCPClient_EnumInstanceNames() "
                                                        "in DHCPClientProvider [Line: "));
    EXPECT_THAT(lines[2].message,
                ::testing::MatchesRegex("VARIABLE: 'classId' has Value '255' at line [0-9]+ in "
                                        "DHCPClientProvider"));
    EXPECT_THAT(lines[3].message, ::testing::StartsWith("EXITING: DHCPClient_EnumInstanceNames() "
                                                        "in DHCPClientProvider [Line: "));
    EXPECT_EQ(lines[3].function, "markProviderExit");
    EXPECT_EQ(lines[4].message, separator);
    for (const auto& line : lines) {
        EXPECT_EQ(line.level, 4000);
        EXPECT_EQ(line.category, "Merrow.DHCPClientProvider");
    }
}

// The library as an object manager has it: opened, asked, cleaned up and closed,
// again and again.

class UnloadTest : public test::TreeTest {};

TEST_F(UnloadTest, AThousandLoadsLoseNoDescriptor) {
    setTree({test::host({test::dhcpInterface("eth0")})});
    test::Host host;
    const char* const library = ZR_BINARY_DIR "/lib/cmpi/libDHCPClientProvider.so";
    const std::ptrdiff_t before = openDescriptors();
    for (int load = 0; load < 1000; ++load) {
        void* handle = ::dlopen(library, RTLD_NOW | RTLD_LOCAL);
        ASSERT_NE(handle, nullptr) << ::dlerror();
        using Factory = CMPIInstanceMI* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
        const auto create =
            reinterpret_cast<Factory>(::dlsym(handle, "DHCPClientProvider_Create_InstanceMI"));
        ASSERT_NE(create, nullptr);
        CMPIStatus status{CMPI_RC_OK, nullptr};
        CMPIInstanceMI* mi = create(host.broker(), nullptr, &status);
        // Watching the machine's files and giving that up again costs the kernel
        // milliseconds; a request now and then is enough to lose something.
        if (load % 50 == 0) {
            const test::Host::Response response =
                host.request(test::Host::Kind::paths, test::pathOf("QVXZR_DHCPProtocolEndpoint"),
                             [mi](auto* context, auto* result, auto* path) {
                                 return mi->ft->enumerateInstanceNames(mi, context, result, path);
                             });
            ASSERT_EQ(response.paths.size(), 1U);
        }
        EXPECT_EQ(mi->ft->cleanup(mi, nullptr, 0).rc, CMPI_RC_OK);
        ASSERT_EQ(::dlclose(handle), 0);
    }
    EXPECT_EQ(openDescriptors(), before);
    EXPECT_EQ(::dlopen(library, RTLD_NOW | RTLD_NOLOAD), nullptr) << "the library is still loaded";
}

}  // namespace
