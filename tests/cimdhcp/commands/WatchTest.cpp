// What "watch" makes of two looks at a machine, and the lines that it writes.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <sstream>

#include "commands/WatchLog.h"
#include "commands/WatchSubscriptions.h"
#include "commands/WatchedChanges.h"
#include "text/Failure.h"
#include "zrclient/NodeLexicon.h"

namespace cimdhcp {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr std::int64_t present = 1'795'320'000;  // 2026-11-22T04:00:00Z
constexpr std::int64_t hour = 3600;

LeaseOverview leaseOf(const std::string& address) {
    LeaseOverview lease;
    lease.family = address.find(':') == std::string::npos ? "IPv4" : "IPv6";
    lease.clientState = 8;
    lease.address = address;
    lease.server = "192.0.2.1";
    lease.obtained = present - hour;
    lease.renews = present + hour;
    lease.rebinds = present + 2 * hour;
    lease.expires = present + 3 * hour;
    lease.client = "dhclient";
    return lease;
}

InterfaceOverview bound(const std::string& name, std::vector<LeaseOverview> leases) {
    InterfaceOverview interface;
    interface.system = hostSystem;
    interface.name = name;
    interface.dhcp = true;
    interface.active = true;
    interface.address = leases.empty() ? "" : leases.front().address;
    interface.leases = std::move(leases);
    interface.servers.emplace();
    return interface;
}

InterfaceOverview bound(const std::string& name, const std::string& address) {
    return bound(name, std::vector{leaseOf(address)});
}

InterfaceOverview asking(const std::string& name) {
    LeaseOverview lease;
    lease.family = "IPv4";
    lease.clientState = 0;
    lease.client = "dhclient";
    return bound(name, std::vector{lease});
}

InterfaceOverview off(const std::string& name) {
    InterfaceOverview interface = bound(name, std::vector<LeaseOverview>());
    interface.dhcp = false;
    return interface;
}

using Interfaces = std::vector<InterfaceOverview>;

std::vector<std::string> changes(const Interfaces& before, const Interfaces& after,
                                 std::int64_t later = present) {
    std::vector<std::string> texts;
    for (const WatchedChange& change :
         changesBetween(watchedStates(before, present), watchedStates(after, later))) {
        texts.push_back(changeText(change, "->"));
    }
    return texts;
}

TEST(WatchedChanges, OfWhatIsAsItWasThereAreNone) {
    const Interfaces all{bound("eth0", "192.0.2.17"), asking("eth1"), off("eth2")};
    EXPECT_THAT(changes(all, all), IsEmpty());
    EXPECT_THAT(changes(all, all, present + 1), IsEmpty());
}

TEST(WatchedChanges, TellTheLifeOfALease) {
    EXPECT_THAT(changes({off("eth0")}, {asking("eth0")}), ElementsAre("eth0  off -> asking"));
    EXPECT_THAT(changes({asking("eth0")}, {bound("eth0", "192.0.2.17")}),
                ElementsAre("eth0  asking -> bound 192.0.2.17 from 192.0.2.1"));
    EXPECT_THAT(changes({bound("eth0", "192.0.2.17")}, {bound("eth0", "192.0.2.40")}),
                ElementsAre("eth0  bound 192.0.2.17 -> 192.0.2.40 from 192.0.2.1"));
    EXPECT_THAT(changes({bound("eth0", "192.0.2.17")}, {off("eth0")}),
                ElementsAre("eth0  bound 192.0.2.17 -> off"));
}

TEST(WatchedChanges, TellThatALeaseWasRenewedUntilWhen) {
    InterfaceOverview renewed = bound("eth0", "192.0.2.17");
    renewed.leases->front().obtained = present;
    renewed.leases->front().expires = present + 4 * hour;
    EXPECT_THAT(changes({bound("eth0", "192.0.2.17")}, {renewed}),
                ElementsAre("eth0  bound 192.0.2.17, renewed until 2026-11-22T08:00:00Z"));
    renewed.leases->front().expires = static_cast<std::int64_t>(ZR::NodeLexicon::never);
    EXPECT_THAT(changes({bound("eth0", "192.0.2.17")}, {renewed}),
                ElementsAre("eth0  bound 192.0.2.17, renewed, without an end"));
}

TEST(WatchedChanges, TakeNoRoundedTimeForARenewal) {
    InterfaceOverview before = bound("eth0", "192.0.2.17");
    before.leases->front().obtained.reset();
    InterfaceOverview after = before;
    *after.leases->front().expires += 1;
    EXPECT_THAT(changes({before}, {after}), IsEmpty());
    *after.leases->front().expires += 1;
    EXPECT_EQ(changes({before}, {after}).size(), 1U);
    after.leases->front().obtained = present;
    EXPECT_THAT(changes({before}, {after}), IsEmpty()) << "only now is it known";
}

TEST(WatchedChanges, TellOfAnotherServerAndOfAnotherClient) {
    InterfaceOverview after = bound("eth0", "192.0.2.17");
    after.leases->front().server = "192.0.2.2";
    EXPECT_THAT(changes({bound("eth0", "192.0.2.17")}, {after}),
                ElementsAre("eth0  bound 192.0.2.17 from 192.0.2.1 -> from 192.0.2.2"));
    InterfaceOverview before = bound("eth0", "192.0.2.17");
    before.leases->front().server.clear();
    EXPECT_THAT(changes({before}, {after}),
                ElementsAre("eth0  bound 192.0.2.17 -> from 192.0.2.2"));
    after.leases->front().client = "dhcpcd";
    EXPECT_THAT(changes({bound("eth0", "192.0.2.17")}, {after}),
                ElementsAre("eth0  bound 192.0.2.17 by dhclient -> by dhcpcd"));
    after = bound("eth0", "192.0.2.17");
    after.leases->front().server.clear();
    EXPECT_THAT(changes({bound("eth0", "192.0.2.17")}, {after}), IsEmpty());
}

TEST(WatchedChanges, TellOfTheLinkAndOfWhatIsNoLongerKnown) {
    InterfaceOverview down = bound("eth0", "192.0.2.17");
    down.active = false;
    EXPECT_THAT(changes({bound("eth0", "192.0.2.17")}, {down}),
                ElementsAre("eth0  bound 192.0.2.17 -> no link"));
    EXPECT_THAT(changes({down}, {bound("eth0", "192.0.2.17")}),
                ElementsAre("eth0  no link -> bound 192.0.2.17 from 192.0.2.1"));
    InterfaceOverview unknown = off("eth0");
    unknown.dhcp.reset();
    EXPECT_THAT(changes({off("eth0")}, {unknown}), ElementsAre("eth0  off -> ?"));
}

TEST(WatchedChanges, TellOfInterfacesThatComeAndGo) {
    EXPECT_THAT(changes({off("eth0")}, {off("eth0"), asking("eth1")}),
                ElementsAre("eth1  absent -> asking"));
    EXPECT_THAT(changes({bound("eth0", "192.0.2.17"), off("eth1")}, {off("eth1")}),
                ElementsAre("eth0  bound 192.0.2.17 -> absent"));
    InterfaceOverview other = asking("eth0");
    other.system = serviceProcessorSystem;
    EXPECT_THAT(changes({}, {other}), ElementsAre("eth0 (BMC)  absent -> asking"));
}

TEST(WatchedChanges, TellOfEachFamily) {
    const InterfaceOverview four = bound("eth0", "192.0.2.17");
    const InterfaceOverview both =
        bound("eth0", std::vector{leaseOf("192.0.2.17"), leaseOf("2001:db8::1")});
    EXPECT_THAT(changes({four}, {both}),
                ElementsAre("eth0  none -> bound 2001:db8::1 from 192.0.2.1"));
    EXPECT_THAT(changes({both}, {four}), ElementsAre("eth0  bound 2001:db8::1 -> none"));
    EXPECT_THAT(changes({off("eth0")}, {both}),
                ElementsAre("eth0  off -> bound 192.0.2.17 from 192.0.2.1",
                            "eth0  none -> bound 2001:db8::1 from 192.0.2.1"));
    EXPECT_THAT(changes({both}, {off("eth0")}),
                ElementsAre("eth0  bound 192.0.2.17 -> off", "eth0  bound 2001:db8::1 -> off"));
}

TEST(WatchedChanges, CannotSteerATerminal) {
    EXPECT_THAT(changes({}, {bound("eth\x1b", "1\x07")}),
                ElementsAre("eth\\x1B  absent -> bound 1\\x07 from 192.0.2.1"));
}

TEST(WatchedChanges, ComeWithTimeAlone) {
    const Interfaces all{bound("eth0", "192.0.2.17")};
    EXPECT_EQ(nextStates(all, present), present + hour + 3);
    EXPECT_THAT(changes(all, all, present + hour + 2), IsEmpty());
    EXPECT_THAT(changes(all, all, present + hour + 3),
                ElementsAre("eth0  bound 192.0.2.17 -> renewing"));
    EXPECT_THAT(changes(all, all, present + 2 * hour + 3),
                ElementsAre("eth0  bound 192.0.2.17 -> rebinding"));
    EXPECT_EQ(nextStates(all, present + 2 * hour + 3), present + 3 * hour);
    EXPECT_THAT(changes(all, all, present + 3 * hour),
                ElementsAre("eth0  bound 192.0.2.17 -> expired"));
    EXPECT_EQ(nextStates(all, present + 3 * hour), std::nullopt);
}

TEST(WatchedChanges, AreFoundAmongManyInterfaces) {
    Interfaces before;
    Interfaces after;
    for (int number = 0; number < 10'000; ++number) {
        (number % 2 == 0 ? before : after).push_back(off("eth" + std::to_string(number)));
    }
    EXPECT_EQ(changes(before, after).size(), 10'000U);
}

/// A log and what it has written.
struct Written {
    std::ostringstream out;
    std::ostringstream err;
    Outputs outputs{out, err, std::nullopt};

    std::string take() {
        std::string text = out.str();
        out.str("");
        return text;
    }
};

TEST(WatchLog, WritesTheTimeAndTheMachineBeforeEachChange) {
    Written written;
    WatchLog log({}, {"a.example", "b.example"}, {.hosts = true}, written.outputs);
    log.saw(0, {asking("eth0")}, present);
    log.saw(1, {off("eth0")}, present);
    log.announce();
    EXPECT_EQ(written.take(), "");
    EXPECT_EQ(written.err.str(), "cimdhcp: watching 2 interfaces of 2 servers\n");
    log.saw(1, {asking("eth0")}, present + 1);
    EXPECT_EQ(written.take(), "2026-11-22T04:00:01Z  b.example  eth0  off -> asking\n");
}

TEST(WatchLog, WritesAnObjectALine) {
    Written written;
    WatchLog log({}, {"a.example"}, {.json = true, .hosts = true}, written.outputs);
    log.saw(0, {}, present);
    log.saw(0, {bound("eth0", "192.0.2.17")}, present);
    EXPECT_EQ(written.take(),
              R"({"time":"2026-11-22T04:00:00Z","host":"a.example","interface":"eth0",)"
              R"("system":"Computer","family":"IPv4","before":null,)"
              R"("after":{"state":"bound","address":"192.0.2.17","server":"192.0.2.1",)"
              R"("client":"dhclient","expires":"2026-11-22T07:00:00Z"}})"
              "\n");
}

TEST(WatchLog, KeepsToTheInterfacesThatAreNamed) {
    Written written;
    WatchLog log({"eth1", "eth9"}, {"this machine"}, {}, written.outputs);
    log.saw(0, {off("eth0"), off("eth1")}, present);
    log.announce();
    EXPECT_EQ(written.err.str(),
              "cimdhcp: note: there is no interface \"eth9\" yet\n"
              "cimdhcp: watching 1 interface\n");
    log.saw(0, {asking("eth0"), asking("eth1")}, present);
    EXPECT_EQ(written.take(), "2026-11-22T04:00:00Z  eth1  off -> asking\n");
}

TEST(WatchLog, TellsOnceThatAMachineDoesNotRespond) {
    Written written;
    WatchLog log({}, {"a.example"}, {}, written.outputs);
    log.saw(0, {bound("eth0", "192.0.2.17")}, present);
    log.failed(0, "it is asleep");
    log.failed(0, "it is asleep");
    EXPECT_TRUE(log.hasFailed(0));
    log.saw(0, {bound("eth0", "192.0.2.18")}, present);
    EXPECT_FALSE(log.hasFailed(0));
    EXPECT_EQ(written.err.str(),
              "cimdhcp: a.example: it is asleep\ncimdhcp: a.example: it responds again\n");
    EXPECT_EQ(written.take(),
              "2026-11-22T04:00:00Z  eth0  bound 192.0.2.17 -> 192.0.2.18 from 192.0.2.1\n");
}

TEST(WatchLog, WritesWhatTimeAloneChangesOnce) {
    Written written;
    WatchLog log({}, {"this machine"}, {}, written.outputs);
    EXPECT_EQ(log.nextAge(present), std::nullopt);
    log.saw(0, {bound("eth0", "192.0.2.17")}, present);
    ASSERT_EQ(log.nextAge(present + 2 * hour + 3), present + 3 * hour);
    log.age(present + 3 * hour);
    EXPECT_EQ(written.take(), "2026-11-22T07:00:00Z  eth0  bound 192.0.2.17 -> expired\n");
    log.age(present + 3 * hour + 1);
    EXPECT_EQ(written.take(), "");
}

TEST(WatchName, TellsTheProcessesOfTheSameUserAndHost) {
    const WatchName name("alpha", "ada", 71, 900);
    EXPECT_EQ(name.text(), "cimdhcp-watch:alpha:ada:71.900:");
    const auto onlyOther = [](std::uint64_t process, std::uint64_t start) {
        return process == 72 && start == 800;
    };
    const auto mayRemove = [&](const std::string& left) { return name.mayRemove(left, onlyOther); };
    EXPECT_TRUE(mayRemove("cimdhcp-watch:alpha:ada:71.900:listener"));
    EXPECT_TRUE(mayRemove("cimdhcp-watch:alpha:ada:70.900:listener"));
    EXPECT_TRUE(mayRemove("cimdhcp-watch:alpha:ada:72.799:listener")) << "another of that number";
    EXPECT_FALSE(mayRemove("cimdhcp-watch:alpha:ada:72.800:listener")) << "it runs";
    for (const char* other :
         {"", "listener", "cimdhcp-watch:alpha:bob:70.900:listener",
          "cimdhcp-watch:beta:ada:70.900:listener", "cimdhcp-watch:alpha:ada:",
          "cimdhcp-watch:alpha:ada:70", "cimdhcp-watch:alpha:ada:70.900",
          "cimdhcp-watch:alpha:ada:x.900:listener", "cimdhcp-watch:alpha:ada:70.x:listener"}) {
        EXPECT_FALSE(mayRemove(other)) << other;
    }
}

TEST(WatchName, OfThisProcessIsNotThatOfAnother) {
    const std::string name = WatchName().text();
    EXPECT_THAT(name, testing::StartsWith("cimdhcp-watch:"));
    EXPECT_THAT(name, testing::HasSubstr(':' + std::to_string(::getpid()) + '.'));
    EXPECT_THAT(name, testing::Not(testing::EndsWith(".0:")));
}

TEST(WatchLog, EndsWhenNoOneTakesItsLines) {
    Written written;
    WatchLog log({}, {"this machine"}, {}, written.outputs);
    log.saw(0, {off("eth0")}, present);
    written.out.setstate(std::ios::badbit);
    EXPECT_THROW(log.saw(0, {asking("eth0")}, present), Failure);
}

}  // namespace
}  // namespace cimdhcp
