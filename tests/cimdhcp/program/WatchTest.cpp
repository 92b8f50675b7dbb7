// "watch" while machines change, and "profiles".
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <csignal>

#include "ProgramRun.h"
#include "ServedProgram.h"
#include "kit/RawServer.h"

namespace {

using test::Ended;
using testing::HasSubstr;
using testing::MatchesRegex;

constexpr const char* time = "20..-..-..T..:..:..Z";

class Watch : public test::ProgramTest {
  protected:
    /// "eth0", and in the next tree "eth1" beside it.
    void prepare() const {
        setTree(test::computer("Computer", bound("eth0")));
        ZR::Testing::writeFile(directory() / "next",
                               "{\"nodes\": [" +
                                   test::computer("Computer", bound("eth0") + ',' + bound("eth1")) +
                                   "]}");
    }

    static std::string bound(const std::string& name) {
        return R"({"type": "NetworkInterface", "description": "Ethernet interface", "properties":
            {"Name": ")" +
               name +
               R"(", "DHCPEnabled": true, "AddressSource": 1, "InterfaceState": 1,
            "IPv4Address": "192.0.2.17", "DHCPServerAddresses": ["192.0.2.1"]},
            "children": [{"type": "DHCPLease", "description": "DHCP lease", "properties":
            {"Family": "IPv4", "ClientState": 8, "Address": "192.0.2.17",
            "ServerAddress": "192.0.2.1", "LeaseObtained": 1795320000,
            "LeaseExpires": 253402300799, "Client": "dhclient"}}]})";
    }

    /// Runs the program, puts the next tree in the place of the first one as soon as it
    /// watches, and sends it a signal when it has written a line.
    Ended watch(const std::vector<std::string>& arguments, const std::string& signal,
                const test::Environment& extra = {}) const {
        const std::string script = R"(
            work=$1 signal=$2
            shift 2
            await() {
                tries=0
                until grep -q "$1" "$2"; do
                    tries=$((tries + 1))
                    if [ $tries -gt 600 ]; then
                        kill -KILL $pid
                        return
                    fi
                    sleep 0.05
                done
            }
            # The shell may look into them before its child has opened them.
            : >"$work/watched" >"$work/told"
            "$@" >"$work/watched" 2>"$work/told" &
            pid=$!
            await watching "$work/told"
            mv "$work/next" "$work/tree.json"
            await eth1 "$work/watched"
            kill "-$signal" $pid
            wait $pid
            status=$?
            cat "$work/watched"
            cat "$work/told" >&2
            exit $status)";
        std::vector<std::string> words{"-c", script, "sh", directory().path(), signal, program()};
        words.insert(words.end(), arguments.begin(), arguments.end());
        return runAs("/bin/sh", words, extra);
    }

    test::ServedProgram serve() const {
        return {program(),
                {"--tree", tree(), "--data-dir", dataDir(), "serve", "--listen", "127.0.0.1:0",
                 "--subscriptions", directory() / "subscriptions"},
                {"ZR_CONFIG=" + (directory() / "platform.conf"), "ZR_LOG_SINK=none"}};
    }

    /// The subscriptions, filters and destinations at a server.
    std::string leftAt(const test::ServedProgram& server) const {
        std::string left;
        for (const char* className : {"CIM_IndicationSubscription", "CIM_IndicationFilter",
                                      "CIM_ListenerDestinationCIMXML"}) {
            const Ended ended = runAs(program(), {"--connect", server.url(), "--namespace",
                                                  "root/interop", "names", className});
            EXPECT_EQ(ended.status, 0) << ended.err;
            left += ended.out;
        }
        return left;
    }

    std::vector<std::string> onTree(std::vector<std::string> arguments) const {
        arguments.insert(arguments.begin(), {"--tree", tree(), "--data-dir", dataDir(), "watch"});
        return arguments;
    }
};

TEST_F(Watch, WritesWhatChangesAndEndsWithASignal) {
    for (const char* signal : {"INT", "TERM"}) {
        prepare();
        const Ended ended = watch(onTree({"--poll", "1"}), signal, {{"LC_ALL", "C"}});
        EXPECT_EQ(ended.status, 0);
        EXPECT_THAT(ended.out, MatchesRegex(std::string(time) +
                                            "  eth1  absent -> bound 192.0.2.17 from 192.0.2.1\n"));
        EXPECT_EQ(ended.err, "cimdhcp: watching 1 interface\n");
    }
}

TEST_F(Watch, HasAnArrowWhereTheLocaleHasUtf8) {
    prepare();
    const Ended ended = watch(onTree({"--poll", "1"}), "INT", {{"LC_ALL", "C.UTF-8"}});
    EXPECT_THAT(ended.out, HasSubstr("  eth1  absent \u2192 bound 192.0.2.17 from 192.0.2.1\n"));
}

TEST_F(Watch, IsToldHereWithoutAServer) {
    prepare();
    const Ended ended = watch(onTree({}), "INT", {{"LC_ALL", "C"}});
    EXPECT_EQ(ended.status, 0);
    EXPECT_THAT(ended.out, MatchesRegex(std::string(time) +
                                        "  eth1  absent -> bound 192.0.2.17 from 192.0.2.1\n"));
}

TEST_F(Watch, IsToldByServersAndLeavesNothingAtThem) {
    prepare();
    const test::ServedProgram server = serve();
    const Ended ended = watch({"--connect", server.url(), "watch"}, "INT", {{"LC_ALL", "C"}});
    EXPECT_EQ(ended.status, 0) << ended.err;
    EXPECT_THAT(ended.out, MatchesRegex(std::string(time) +
                                        "  eth1  absent -> bound 192.0.2.17 from 192.0.2.1\n"));
    EXPECT_EQ(leftAt(server), "");
}

TEST_F(Watch, RemovesWhatARunHasLeftThatWasKilled) {
    prepare();
    const test::ServedProgram server = serve();
    const std::vector<std::string> arguments{"--connect", server.url(), "watch"};
    EXPECT_EQ(watch(arguments, "KILL").status, 128 + SIGKILL);
    EXPECT_THAT(leftAt(server), HasSubstr("CIM_InstModification"));
    prepare();
    EXPECT_EQ(watch(arguments, "TERM").status, 0);
    EXPECT_EQ(leftAt(server), "");
}

TEST_F(Watch, NeedsProvidersThatTellOfChanges) {
    prepare();
    std::vector<std::string> arguments = onTree({});
    arguments.insert(arguments.begin(), "--exact");
    const Ended ended = runAs(program(), arguments);
    EXPECT_EQ(ended.status, 3);
    EXPECT_THAT(ended.err, HasSubstr("--poll SECONDS looks again and again"));
}

TEST_F(Watch, AsksServersAgainAndAgain) {
    prepare();
    const test::ServedProgram server = serve();
    const Ended ended = watch(
        {"--connect", server.url(), "watch", "--poll", "1", "--format", "json", "eth1"}, "TERM");
    EXPECT_EQ(ended.status, 0);
    EXPECT_THAT(ended.out, MatchesRegex(std::string("\\{\"time\":\"") + time +
                                        "\",\"interface\":\"eth1\",\"system\":\"Computer\".*\n"));
    EXPECT_EQ(ended.err,
              "cimdhcp: note: there is no interface \"eth1\" yet\n"
              "cimdhcp: watching 0 interfaces\n");
}

TEST_F(Watch, OfOneServerNeedsAResponseToBegin) {
    const std::string url = "http://127.0.0.1:" + std::to_string(test::deadPort());
    const Ended ended = runAs(program(), {"--connect", url, "watch", "--poll", "1"});
    EXPECT_EQ(ended.status, 3);
    EXPECT_EQ(ended.out, "");
    EXPECT_THAT(ended.err, testing::StartsWith("cimdhcp: " + url + ": "));
}

class ProfilesCommand : public Watch {};

TEST_F(ProfilesCommand, TellsWhatAServerAdvertises) {
    prepare();
    const test::ServedProgram server = serve();
    for (const auto& where :
         {std::vector<std::string>{"--tree", tree()}, {"--connect", server.url()}}) {
        std::vector<std::string> arguments = where;
        arguments.emplace_back("profiles");
        EXPECT_EQ(runAs(program(), arguments),
                  (Ended{0,
                         "ORGANIZATION  PROFILE      VERSION  INSTANCES\n"
                         "DMTF          DHCP Client  1.0.4    1\n",
                         ""}));
        arguments.insert(arguments.end(), {"--format", "json"});
        const Ended json = runAs(program(), arguments);
        EXPECT_THAT(json.out, testing::StartsWith("{\n  \"namespace\": \"root/interop\""));
        EXPECT_THAT(json.out, HasSubstr("\"instances\": 1"));
        arguments.back() = "table";
        arguments.emplace_back("--count");
        EXPECT_EQ(runAs(program(), arguments), (Ended{0, "1\n", ""}));
    }
}

}  // namespace
