// In which order a request takes its steps: what has happened, and what has not, when
// the result is told that it is complete.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "Requests.h"
#include "kit/AssociationMachine.h"
#include "kit/Files.h"
#include "kit/LogCapture.h"

namespace {

using test::Fault;
using test::Function;
using test::Host;
using test::Operation;
using test::Request;
using ::testing::ElementsAre;
using ::testing::SizeIs;
using ZR::Testing::LogCapture;
using ZR::Testing::readFile;
using ZR::Testing::writeFile;

using Names = std::vector<std::string>;

/// The adapters that were built for a request itself, and not as an end of another one,
/// in the order in which they came and, with "~" before the name, went.
Names adapters(const LogCapture& log) {
    Names names;
    Names present;
    for (const auto& line : log.log()) {
        if (!line.file.starts_with("CMPI/")) {
            continue;
        }
        const std::string name = line.file.substr(line.file.find('/') + 1);
        const bool comes = line.function == name && line.message.starts_with("ENTERING");
        const bool goes = line.function == '~' + name && !present.empty() && present.back() == name;
        if (comes) {
            present.push_back(name);
        } else if (goes) {
            present.pop_back();
        }
        if (comes || goes) {
            names.push_back(line.function);
        }
    }
    return names;
}

class OrderTest : public test::MachineTest {
  protected:
    struct Order {
        Names untilEnd;  ///< of the adapters
        Names afterEnd;  ///< those, and what came behind them
        unsigned ends = 0;
    };

    Order orderOf(const Request& request) {
        Order order;
        const LogCapture log;
        host_.counted().watch(Function::returnDone, [&] {
            order.untilEnd = adapters(log);
            ++order.ends;
        });
        test::run(host_, request);
        order.afterEnd = adapters(log);
        return order;
    }

    static std::string adapterOf(const std::string& className) {
        return className == "QVXZR_HostedDHCPPoint"    ? "CMPIDHCPHostedAccessPoint"
               : className == "QVXZR_SAPSAPDependency" ? "CMPISAPSAPDependency"
                                                       : "CMPI" + className.substr(6);
    }

    void expectAdapterOutlivesEnd(const Request& request, const std::string& className) {
        const std::string adapter = adapterOf(className);
        const Order order = orderOf(request);
        EXPECT_EQ(order.ends, 1U) << request;
        EXPECT_THAT(order.untilEnd, ElementsAre(adapter)) << request;
        EXPECT_THAT(order.afterEnd, ElementsAre(adapter, '~' + adapter)) << request;
    }

    Host host_{Host::Neighbours::served, Host::Calls::counted};
};

TEST_F(OrderTest, AdapterOfAnInstanceRequestOutlivesTheEndOfTheResult) {
    const std::string& endpoint = test::elementSources()[0].path;
    for (const Operation operation : {Operation::enumerateNames, Operation::enumerate}) {
        expectAdapterOutlivesEnd({operation, "QVXZR_DHCPProtocolEndpoint"},
                                 "QVXZR_DHCPProtocolEndpoint");
        expectAdapterOutlivesEnd({operation, "QVXZR_DHCPCapabilities"}, "QVXZR_DHCPCapabilities");
    }
    expectAdapterOutlivesEnd({Operation::get, endpoint}, "QVXZR_DHCPProtocolEndpoint");
    expectAdapterOutlivesEnd({Operation::enumerateNames, "QVXZR_HostedDHCPPoint"},
                             "QVXZR_HostedDHCPPoint");
    expectAdapterOutlivesEnd({Operation::enumerateNames, "QVXZR_DHCPElementCapabilities"},
                             "QVXZR_DHCPElementCapabilities");
}

TEST_F(OrderTest, AdapterOfAModificationOutlivesTheEndOfTheResult) {
    expectAdapterOutlivesEnd({Operation::modify, test::elementSources()[2].path},
                             "QVXZR_DHCPSettingData");
}

TEST_F(OrderTest, AdapterOfReferencesOutlivesTheEndOfTheResult) {
    for (const auto& [association, first, second] : test::associationSources()) {
        for (const std::string& source : {first, second}) {
            for (const Operation operation : {Operation::referenceNames, Operation::references}) {
                expectAdapterOutlivesEnd({operation, source, association}, association);
            }
        }
    }
}

TEST_F(OrderTest, AdaptersOfAssociatorsGoOneByOneAndTheResultEndsBehindTheLast) {
    const std::string& endpoint = test::elementSources()[0].path;
    Names expected;
    for (const char* association :
         {"QVXZR_DHCPElementCapabilities", "QVXZR_HostedDHCPPoint",
          "QVXZR_DHCPRemoteHostedAccessPoint", "QVXZR_SAPSAPDependency",
          "QVXZR_DHCPOrderedComponent", "QVXZR_DHCPRemoteAccessAvailableToElement",
          "QVXZR_DHCPElementSettingData"}) {
        expected.push_back(adapterOf(association));
        expected.push_back('~' + adapterOf(association));
    }
    for (const Operation operation : {Operation::associatorNames, Operation::associators}) {
        const Order order = orderOf({operation, endpoint, nullptr});
        EXPECT_EQ(order.ends, 1U);
        EXPECT_EQ(order.untilEnd, expected);
        EXPECT_EQ(order.afterEnd, expected);
    }
}

// Modifications.

class ModificationTest : public OrderTest {
  protected:
    void SetUp() override {
        OrderTest::SetUp();
        writeFile(file_, "CONFIG_NAME=old\n");
    }

    const Request request_{Operation::modify, test::elementSources()[2].path};
    const std::string file_ = dataDirectory() + "ifcfg-eth0";
};

TEST_F(ModificationTest, ResultEndsOnlyAfterTheChange) {
    std::string contentAtEnd;
    host_.counted().watch(Function::returnDone, [&] { contentAtEnd = readFile(file_); });
    EXPECT_EQ(test::run(host_, request_).returnDoneCalls, 1U);
    EXPECT_EQ(contentAtEnd, "CONFIG_NAME=new\n");
}

TEST_F(ModificationTest, ExceptionBeforeTheChangeLeavesTheFileTheStatusAndTheResult) {
    for (const Function function :
         {Function::toString, Function::getKeyCount, Function::getProperty}) {
        const LogCapture log(6000, 6000);
        host_.counted().fail(function, 1, Fault::exception);
        const Host::Response response = test::run(host_, request_);
        EXPECT_EQ(host_.counted().calls(function), 1U) << nameOf(function);
        EXPECT_EQ(response.code, CMPI_RC_OK) << nameOf(function);
        EXPECT_FALSE(response.hasMessage);
        EXPECT_EQ(response.returnDoneCalls, 0U) << nameOf(function);
        EXPECT_EQ(readFile(file_), "CONFIG_NAME=old\n") << nameOf(function);
        for (const auto& lines : {log.log(), log.trace()}) {
            ASSERT_THAT(lines, SizeIs(1)) << nameOf(function);
            EXPECT_EQ(lines[0].level, 6000);
            EXPECT_EQ(lines[0].function, "DHCPClient_ModifyInstance");
            EXPECT_THAT(lines[0].message,
                        ::testing::MatchesRegex("MESSAGE \\[File: DHCPClientProvider, Line: "
                                                "[0-9]+\\]: a function of the broker threw"));
        }
    }
}

TEST_F(ModificationTest, ExceptionAfterTheChangeKeepsIt) {
    host_.counted().fail(Function::returnDone, 1, Fault::exception);
    EXPECT_EQ(test::run(host_, request_).code, CMPI_RC_OK);
    EXPECT_EQ(readFile(file_), "CONFIG_NAME=new\n");
}

TEST_F(ModificationTest, ExceptionDestroysTheAdapterAndTheExitIsMarked) {
    const LogCapture log(0, 6000);
    host_.counted().fail(Function::getProperty, 1, Fault::exception);
    test::run(host_, request_);
    EXPECT_THAT(adapters(log), ElementsAre("CMPIDHCPSettingData", "~CMPIDHCPSettingData"));
    const auto messages = log.logMessages();
    ASSERT_GE(messages.size(), 2U);
    EXPECT_THAT(messages[messages.size() - 2],
                ::testing::StartsWith("EXITING: DHCPClient_ModifyInstance() in "));
}

}  // namespace
