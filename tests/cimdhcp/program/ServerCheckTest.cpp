// "cimdhcp --connect URL check", of the program's own server and of one that refuses.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "ProgramRun.h"
#include "ServedProgram.h"
#include "kit/RawServer.h"

namespace {

using test::Ended;
using testing::HasSubstr;
using testing::Not;

class ServerCheck : public test::ProgramTest {
  protected:
    [[nodiscard]] Ended checkServer(const std::vector<std::string>& serve,
                                    const std::vector<std::string>& options = {}) const {
        std::vector<std::string> arguments{"--tree", tree(), "--data-dir", dataDir()};
        arguments.insert(arguments.end(), serve.begin(), serve.end());
        arguments.insert(arguments.end(), {"serve", "--listen", "127.0.0.1:0"});
        const test::ServedProgram server(
            program(), arguments,
            {"ZR_CONFIG=" + (directory() / "platform.conf"), "ZR_LOG_SINK=none"});
        std::vector<std::string> check{"--connect", server.url(), "check"};
        check.insert(check.end(), options.begin(), options.end());
        return runAs(program(), check);
    }
};

TEST_F(ServerCheck, FindsNothingWrongInTheServerOfThisProgram) {
    const Ended ended = checkServer({});
    EXPECT_EQ(ended.status, 0) << ended.out;
    EXPECT_EQ(ended.err, "");
    EXPECT_THAT(ended.out, HasSubstr("ok    QVXZR_DHCPProtocolEndpoint: 1 instance\n"));
    EXPECT_THAT(ended.out, HasSubstr("ok    QVXZR_ComputerSystem: 1 instance\n"));
    EXPECT_THAT(ended.out, Not(HasSubstr("BAD")));
}

TEST_F(ServerCheck, TellsThatNoGatewayIsInFrontOfTheProvider) {
    const Ended ended = checkServer({"--exact"});
    EXPECT_EQ(ended.status, 1);
    EXPECT_EQ(ended.err, "cimdhcp: something is wrong; see the list\n");
    EXPECT_THAT(ended.out, HasSubstr("BAD   QVXZR_SAPSAPDependency: GetInstance of "));
    EXPECT_THAT(ended.out, HasSubstr("-> the exact provider gives this where no gateway is"));
}

TEST_F(ServerCheck, TellsOfANamespaceThatIsNotServed) {
    const Ended ended = checkServer({}, {"--namespace", "root/none"});
    EXPECT_EQ(ended.status, 1);
    EXPECT_THAT(ended.out, HasSubstr("BAD   QVXZR_DHCPProtocolEndpoint, QVXZR_DHCPCapabilities, "));
    EXPECT_THAT(ended.out, HasSubstr(": CIM_ERR_INVALID_NAMESPACE"));
    EXPECT_THAT(ended.out, HasSubstr("1 thing is wrong"));
}

TEST_F(ServerCheck, TellsOfALibraryThatTheServerDoesNotFind) {
    const std::string response =
        test::cimResponse("EnumerateInstances",
                          "<ERROR CODE=\"6\" DESCRIPTION=\"Provider not found or not loadable\"/>");
    const test::RawServer server(std::vector<std::string>(15, response));
    const Ended ended = runAs(program(), {"--format", "json", "--connect", server.url(), "check"});
    EXPECT_EQ(ended.status, 1) << ended.err;
    const auto findings = nlohmann::json::parse(ended.out).at("findings");
    ASSERT_EQ(findings.size(), 1U);
    EXPECT_EQ(findings[0].at("verdict"), "bad");
    EXPECT_EQ(findings[0].at("detail"), "CIM_ERR_NOT_FOUND: Provider not found or not loadable");
    EXPECT_THAT(findings[0].at("remedy"), HasSubstr("providerDirs in sfcb.cfg"));
}

TEST_F(ServerCheck, EndsWithThreeWhenTheServerCannotBeReached) {
    const Ended ended = runAs(
        program(), {"--connect", "http://127.0.0.1:" + std::to_string(test::deadPort()), "check"});
    EXPECT_EQ(ended.status, 3);
    EXPECT_THAT(ended.err, HasSubstr("cannot be reached"));
}

}  // namespace
