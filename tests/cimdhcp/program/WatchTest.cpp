// "watch" while machines change, and "profiles".
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <csignal>
#include <set>
#include <sstream>

#include "ProgramRun.h"
#include "ServedProgram.h"
#include "kit/RawServer.h"

namespace {

using test::Ended;
using testing::Contains;
using testing::HasSubstr;
using testing::MatchesRegex;

constexpr const char* time = "20..-..-..T..:..:..Z";

class Watch : public test::ProgramTest {
  protected:
    /// "eth0", and in the next tree "eth1" beside it.
    void prepare() const {
        setTree(test::computer("Computer", interfaces(1)));
        writeTree("next", 2);
    }
    /// A tree of so many interfaces, from "eth0" on.
    void writeTree(const std::string& name, int count) const {
        ZR::Testing::writeFile(
            directory() / name,
            "{\"nodes\": [" + test::computer("Computer", interfaces(count)) + "]}");
    }
    static std::string interfaces(int count) {
        std::string all;
        for (int number = 0; number < count; ++number) {
            all += (number == 0 ? "" : ",") + bound("eth" + std::to_string(number));
        }
        return all;
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

    /// Puts the next tree in the place of the first one, and waits for what is told of that.
    static constexpr const char* next =
        R"(mv "$work/next" "$work/tree.json"; await eth1 "$work/watched")";

    /// Runs the program, does the steps of a shell as soon as it watches, and sends it a signal.
    Ended watch(const std::vector<std::string>& arguments, const std::string& signal,
                const test::Environment& extra = {}, const std::string& steps = next) const {
        const std::string script = R"(
            work=$1 signal=$2 steps=$3
            shift 3
            await() {
                tries=0
                until grep -q "$1" "$2"; do
                    tries=$((tries + 1))
                    if [ $tries -gt 1200 ]; then
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
            eval "$steps"
            kill "-$signal" $pid
            wait $pid
            status=$?
            cat "$work/watched"
            cat "$work/told" >&2
            exit $status)";
        std::vector<std::string> words{"-c",   script, "sh",     directory().path(),
                                       signal, steps,  program()};
        words.insert(words.end(), arguments.begin(), arguments.end());
        return runAs("/bin/sh", words, extra);
    }

    test::ServedProgram serve() const { return serve("tree.json"); }
    /// A server of the machine of a tree.
    test::ServedProgram serve(const std::string& tree) const {
        return {program(),
                {"--tree", directory() / tree, "--data-dir", dataDir(), "serve", "--listen",
                 "127.0.0.1:0", "--subscriptions", directory() / ("subscriptions-" + tree)},
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

/// The lines without their times, each once; `lines` is how many there were.
std::set<std::string> distinct(const std::string& text, std::size_t& lines) {
    std::set<std::string> found;
    std::istringstream stream(text);
    lines = 0;
    for (std::string line; std::getline(stream, line); ++lines) {
        found.insert(line.substr(std::min(line.find(' '), line.size())));
    }
    return found;
}

TEST_F(Watch, OfAThousandInterfacesAtOnceNoneIsLostOrToldTwice) {
    setTree(test::computer("Computer", interfaces(1)));
    writeTree("next", 1000);
    writeTree("last", 1001);
    // What is told twice is so before the last one comes. Making and comparing a thousand takes
    // some seconds without optimization.
    const Ended ended = watch(onTree({}), "INT", {{"LC_ALL", "C"}}, R"(
        mv "$work/next" "$work/tree.json"; await 'eth999 ' "$work/watched"
        mv "$work/last" "$work/tree.json"; await 'eth1000 ' "$work/watched")");
    EXPECT_EQ(ended.status, 0) << ended.err;
    std::size_t lines = 0;
    const std::set<std::string> told = distinct(ended.out, lines);
    EXPECT_EQ(lines, 1000U);
    EXPECT_EQ(told.size(), 1000U);
    EXPECT_THAT(told, Contains("  eth500  absent -> bound 192.0.2.17 from 192.0.2.1"));
}

TEST_F(Watch, IsToldBySeveralServersAtOnceAndLeavesNothingAtThem) {
    writeTree("one.json", 1);
    writeTree("other.json", 1);
    const test::ServedProgram one = serve("one.json");
    const test::ServedProgram other = serve("other.json");
    writeTree("next-one", 60);
    writeTree("next-other", 80);
    writeTree("last-one", 1);
    writeTree("last-other", 79);
    const Ended ended = watch({"--connect", one.url(), "--connect", other.url(), "watch"}, "INT",
                              {{"LC_ALL", "C"}}, R"(
        mv "$work/next-one" "$work/one.json"; mv "$work/next-other" "$work/other.json"
        await 'eth59 ' "$work/watched"; await 'eth79 ' "$work/watched"
        mv "$work/last-one" "$work/one.json"; mv "$work/last-other" "$work/other.json"
        await 'eth59  bound' "$work/watched"; await 'eth79  bound' "$work/watched")");
    EXPECT_EQ(ended.status, 0) << ended.err;
    EXPECT_EQ(ended.err, "cimdhcp: watching 2 interfaces of 2 servers\n");
    std::size_t lines = 0;
    const std::set<std::string> told = distinct(ended.out, lines);
    EXPECT_EQ(lines, 59U + 79U + 59U + 1U);
    EXPECT_EQ(told.size(), lines);
    const std::string bound = " absent -> bound 192.0.2.17 from 192.0.2.1";
    EXPECT_THAT(told, Contains("  " + one.url() + "  eth59 " + bound));
    EXPECT_THAT(told, Contains("  " + other.url() + "  eth79 " + bound));
    EXPECT_THAT(told, Contains("  " + other.url() + "  eth79  bound 192.0.2.17 -> absent"));
    EXPECT_EQ(leftAt(one) + leftAt(other), "");
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
