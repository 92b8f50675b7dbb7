// Many servers at once.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <csignal>
#include <map>
#include <memory>
#include <nlohmann/json.hpp>
#include <thread>

#include "ProgramRun.h"
#include "ServedProgram.h"
#include "kit/RawServer.h"

namespace {

using test::Ended;
using testing::HasSubstr;

class ManyServers : public test::ProgramTest {
  protected:
    /// Starts servers, in which interface "ethN" of server N alone takes its address
    /// by DHCP.
    void serve(std::size_t count, bool exactly = false) {
        for (std::size_t number = 0; number < count; ++number) {
            const std::string name = "eth" + std::to_string(number);
            const std::string file = directory() / ("tree-" + std::to_string(number));
            ZR::Testing::writeFile(
                file, "{\"nodes\": [" +
                          test::computer("Computer", test::dhcpInterface(name, "192.0.2.1")) +
                          "]}");
            servers_.push_back(std::make_unique<test::ServedProgram>(
                program(),
                std::vector<std::string>{exactly ? "--exact" : "--no-header", "--tree", file,
                                         "--data-dir", dataDir(), "serve", "--listen",
                                         "127.0.0.1:0", "--workers", "1", "--io-threads", "1"},
                std::vector<std::string>{"ZR_CONFIG=" + (directory() / "platform.conf"),
                                         "ZR_LOG_SINK=none"}));
        }
    }

    std::string hostsFile(const std::vector<std::string>& urls) const {
        std::string text = "# the fleet\n";
        for (const std::string& url : urls) {
            text += url + '\n';
        }
        ZR::Testing::writeFile(directory() / "hosts", text);
        return directory() / "hosts";
    }

    std::vector<std::unique_ptr<test::ServedProgram>> servers_;
};

TEST_F(ManyServers, SlowAndDeadOnesDelayNoOther) {
    constexpr std::size_t alive = 45;
    serve(alive, true);
    std::vector<std::string> urls;
    for (const auto& server : servers_) {
        urls.push_back(server->url());
    }
    const test::RawServer silent({});
    const test::RawServer slow({"HTTP/1.1 200 OK\r\nContent-Length: 10\r\n\r\n12345"});
    std::vector<std::string> bad;
    for (int number = 0; number < 3; ++number) {
        bad.push_back("http://127.0.0.1:" + std::to_string(test::deadPort()));
    }
    bad.push_back(silent.url());
    bad.push_back(silent.url() + "/again");
    // They stand in front, where they hold threads from the start.
    urls.insert(urls.begin(), bad.begin(), bad.end());

    // Well beyond what the others need, even when built with sanitizers.
    constexpr std::chrono::seconds deadline(10);
    const auto start = std::chrono::steady_clock::now();
    const Ended ended =
        runAs(program(), {"--hosts", hostsFile(urls), "--parallel", "16", "--timeout",
                          std::to_string(deadline.count()), "--format", "json", "show"});
    const auto took = std::chrono::steady_clock::now() - start;
    EXPECT_EQ(ended.status, 4);
    // One deadline, not one after the other.
    EXPECT_LT(took, 2 * deadline);

    std::map<std::string, nlohmann::json> responses;
    std::vector<std::string> order;
    std::istringstream lines(ended.out);
    for (std::string line; std::getline(lines, line);) {
        const auto response = nlohmann::json::parse(line);
        order.push_back(response.at("host"));
        responses[order.back()] = response;
    }
    ASSERT_EQ(responses.size(), 50U);
    for (std::size_t number = 0; number < alive; ++number) {
        const auto& response = responses.at(servers_[number]->url());
        EXPECT_EQ(response.at("status").at("exit"), 0);
        EXPECT_EQ(response.at("result").at("interfaces").at(0).at("interface"),
                  "eth" + std::to_string(number));
    }
    // The silent ones came last: no other server waited for them.
    EXPECT_THAT((std::vector<std::string>{order.end() - 2, order.end()}),
                testing::UnorderedElementsAre(bad[3], bad[4]));
    const std::string refused = ": cannot be reached: Connection refused\n";
    const std::string late = ": no response within 10 s; --timeout gives it longer\n";
    EXPECT_EQ(ended.err,
              "45 servers: cimdhcp: note: the server does not tell CLIENT and EXPIRES\n"
              "cimdhcp: 5 of 50 servers failed:\n  " +
                  bad[0] + refused + "  " + bad[1] + refused + "  " + bad[2] + refused + "  " +
                  bad[3] + late + "  " + bad[4] + late);
    for (const std::string& host : bad) {
        EXPECT_TRUE(responses.at(host).at("result").is_null());
        EXPECT_EQ(responses.at(host).at("status").at("exit"), 3);
    }
}

TEST_F(ManyServers, TextStandsBelowTheServersNames) {
    serve(2, true);
    const Ended ended = runAs(program(), {"--connect", servers_[0]->url(), "--connect",
                                          servers_[1]->url(), "--parallel", "1", "show"});
    const auto table = [this](const std::string& number) {
        return "== " + servers_[std::stoul(number)]->url() +
               "\nINTERFACE  DHCP  STATE  CLIENT  ADDRESS  EXPIRES  SERVERS    CONFIGURATION NAME\n"
               "eth" +
               number + "       on    bound  ?       -        ?        192.0.2.1  -\n\n";
    };
    std::array hosts{servers_[0]->url(), servers_[1]->url()};
    std::sort(hosts.begin(), hosts.end());
    EXPECT_EQ(ended, (Ended{0, table("0") + table("1"),
                            hosts[0] + ", " + hosts[1] +
                                ": cimdhcp: note: the server does not tell CLIENT and EXPIRES\n"}));
    EXPECT_EQ(runAs(program(), {"--connect", servers_[0]->url(), "--connect", servers_[1]->url(),
                                "--parallel", "1", "show", "--count"})
                  .out,
              servers_[0]->url() + "\t1\n" + servers_[1]->url() + "\t1\n");
    // A file with one server is a fleet of one, so that scripts see one form.
    EXPECT_EQ(runAs(program(), {"--hosts", hostsFile({servers_[1]->url()}), "show", "--count"}).out,
              servers_[1]->url() + "\t1\n");
}

TEST_F(ManyServers, AreNamedOnStandardInputToo) {
    serve(2);
    const Ended ended =
        runAs("/bin/sh",
              {"-c", "printf '%s\\n' '" + servers_[0]->url() + "' '" + servers_[1]->url() + "' | " +
                         program() + " --hosts - --parallel 1 names QVXZR_DHCPCapabilities"});
    EXPECT_EQ(ended, (Ended{0,
                            "== " + servers_[0]->url() +
                                "\nroot/cimv2:QVXZR_DHCPCapabilities.InstanceID=\"eth0\"\n\n== " +
                                servers_[1]->url() +
                                "\nroot/cimv2:QVXZR_DHCPCapabilities.InstanceID=\"eth1\"\n\n",
                            ""}));
}

TEST_F(ManyServers, ACimStatusIsAFailureOfItsServer) {
    serve(2);
    const std::string path = "QVXZR_DHCPCapabilities.InstanceID=\"eth1\"";
    const Ended ended = runAs(
        program(), {"--connect", servers_[0]->url(), "--connect", servers_[1]->url(), "get", path});
    EXPECT_EQ(ended.status, 4);
    EXPECT_THAT(ended.out, HasSubstr("== " + servers_[1]->url() + "\nroot/cimv2:" + path));
    EXPECT_EQ(ended.err, "cimdhcp: 1 of 2 servers failed:\n  " + servers_[0]->url() +
                             ": CIM_ERR_NOT_FOUND: there is no " + path +
                             "; \"cimdhcp names QVXZR_DHCPCapabilities\" lists what there is\n");
}

TEST_F(ManyServers, GarbageIsAFailureOfItsServer) {
    serve(1);
    const test::RawServer garbage({std::string("\0\xFF\xFE garbage\r\n\r\n", 14)});
    const test::RawServer html({test::httpResponse("<html><body>It works!</body></html>")});
    const test::RawServer cut({"HTTP/1.1 200 OK\r\nContent-Length: 1000\r\n\r\n<CIM>"});
    const Ended ended =
        runAs(program(),
              {"--hosts", hostsFile({garbage.url(), html.url(), cut.url(), servers_[0]->url()}),
               "show", "--no-header"});
    EXPECT_EQ(ended.status, 4);
    EXPECT_THAT(ended.out, testing::StartsWith(servers_[0]->url() + "\teth0 "));
    EXPECT_THAT(ended.err, HasSubstr("  " + garbage.url() + ": no usable response ("));
    EXPECT_THAT(ended.err,
                HasSubstr("  " + html.url() +
                          ": the response is not CIM-XML: element html where CIM belongs"));
    EXPECT_THAT(ended.err, HasSubstr("  " + cut.url() + ": the response is cut off"));
}

TEST_F(ManyServers, AListThatCannotBeReadIsNotTheFailureOfAServer) {
    EXPECT_EQ(runAs(program(), {"--hosts", hostsFile({"a", "ftp://b"}), "show"}),
              (Ended{3, "",
                     "cimdhcp: " + (directory() / "hosts") +
                         ": line 3: \"ftp://b\": only http:// and https:// are spoken\n"}));
    EXPECT_EQ(runAs(program(), {"--hosts", directory() / "none", "show"}).status, 3);
    EXPECT_EQ(runAs(program(), {"--hosts", hostsFile({}), "show"}).status, 3);
    EXPECT_EQ(runAs(program(), {"--connect", "a", "--connect", "b", "graph", "--svg"}).status, 2);
}

TEST_F(ManyServers, EachIsAskedOnceAndThoseThatFailedCanBeAskedAgain) {
    serve(1);
    const std::string gone = "http://127.0.0.1:1";
    const std::string url = servers_[0]->url();
    std::string shouted = url;
    shouted.replace(0, 4, "HTTP");
    const std::string failed = directory() / "failed";
    const Ended first = runAs(program(), {"--hosts", hostsFile({url, gone, shouted, url}),
                                          "--failed", failed, "--count", "show"});
    EXPECT_EQ(first.status, 4);
    EXPECT_EQ(first.out, url + "\t1\n");
    EXPECT_THAT(first.err, HasSubstr("1 of 2 servers failed"));
    EXPECT_EQ(ZR::Testing::readFile(failed), gone + '\n');
    EXPECT_EQ(runAs(program(), {"--hosts", failed, "--failed", failed, "show"}).status, 4);
    EXPECT_EQ(ZR::Testing::readFile(failed), gone + '\n');
    EXPECT_EQ(runAs(program(), {"--connect", url, "--failed", failed, "show"}).status, 0);
    EXPECT_EQ(ZR::Testing::readFile(failed), "");
    EXPECT_EQ(
        runAs(program(), {"--connect", url, "--failed", directory() / "no/such", "show"}).status,
        3);
}

TEST_F(ManyServers, AnInterruptionEndsItWithASum) {
    serve(1);
    const test::RawServer silent({});
    // While the first result is on its way to the shell and the signal on its way back,
    // its thread may have begun with the next server or not, and the other one with its
    // first.
    std::vector<std::string> urls{servers_[0]->url()};
    for (int number = 0; number < 20; ++number) {
        urls.push_back(silent.url() + "/" + std::to_string(number));
    }
    const std::string hosts = hostsFile(urls);
    // The shell sends the signal as soon as the first result is there.
    const Ended ended = runAs(
        "/bin/bash", {"-c", "coproc " + program() + " --hosts " + hosts +
                                " --parallel 2 --timeout 100 show --count\n"
                                "pid=$COPROC_PID\nread -r first <&${COPROC[0]}\necho \"$first\"\n"
                                "kill -INT $pid\nwait $pid"});
    EXPECT_EQ(ended.status, 130);
    EXPECT_EQ(ended.out, servers_[0]->url() + "\t1\n");
    EXPECT_THAT(ended.err, testing::ContainsRegex(
                               "cimdhcp: interrupted; (18|19|20) of 21 servers were not asked\n"));
}

}  // namespace
