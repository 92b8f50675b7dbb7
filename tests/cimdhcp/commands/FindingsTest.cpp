// What is told of a machine that is not in order, and of what was not read.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "commands/DiagnosticText.h"
#include "commands/check/Findings.h"

namespace cimdhcp {
namespace {

using Verdict = Finding::Verdict;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;
using ZR::Diagnostic;
using Kind = Diagnostic::Kind;

const Finding fine{Finding::Verdict::good, "schema", "9 classes", ""};
const Finding odd{Finding::Verdict::notable, "machine", "no interface", "plug one in"};
const Finding wrong{Finding::Verdict::bad, "library", "is not there", "install it"};

TEST(Findings, AreCountedInTheRightNumber) {
    EXPECT_EQ(counted(0, "class", "classes"), "0 classes");
    EXPECT_EQ(counted(1, "class", "classes"), "1 class");
    EXPECT_EQ(counted(2, "class", "classes"), "2 classes");
}

TEST(Findings, AreAListWithASum) {
    EXPECT_EQ(findingsText({}), "Nothing is wrong.\n");
    EXPECT_EQ(findingsText({fine}), "ok    schema: 9 classes\nNothing is wrong.\n");
    EXPECT_EQ(findingsText({fine, odd}),
              "ok    schema: 9 classes\n"
              "note  machine: no interface\n"
              "      -> plug one in\n"
              "Nothing is wrong; 1 is worth a look.\n");
    EXPECT_EQ(findingsText({wrong, odd, wrong, odd}),
              "BAD   library: is not there\n"
              "      -> install it\n"
              "note  machine: no interface\n"
              "      -> plug one in\n"
              "BAD   library: is not there\n"
              "      -> install it\n"
              "note  machine: no interface\n"
              "      -> plug one in\n"
              "2 things are wrong; 2 are worth a look.\n");
    EXPECT_NE(findingsText({wrong}).find("\n1 thing is wrong.\n"), std::string::npos);
}

TEST(Findings, AreJsonToo) {
    EXPECT_EQ(nlohmann::json::parse(findingsJson({fine, odd, wrong})),
              nlohmann::json::parse(R"({"findings": [
        {"verdict": "good", "what": "schema", "detail": "9 classes", "remedy": ""},
        {"verdict": "notable", "what": "machine", "detail": "no interface",
         "remedy": "plug one in"},
        {"verdict": "bad", "what": "library", "detail": "is not there",
         "remedy": "install it"}]})"));
}

TEST(Findings, OnlyBadOnesAreFailures) {
    EXPECT_TRUE(isGood({}));
    EXPECT_TRUE(isGood({fine, odd}));
    EXPECT_FALSE(isGood({fine, wrong}));
}

constexpr std::int64_t now = 1'000'000;

LeaseOverview client() {
    LeaseOverview lease;
    lease.family = "IPv4";
    lease.client = "dhclient";
    return lease;
}

LeaseOverview lease() {
    LeaseOverview lease = client();
    lease.clientState = 8;
    lease.address = "192.0.2.17";
    lease.renews = now + 1800;
    lease.rebinds = now + 3150;
    lease.expires = now + 3600;
    return lease;
}

InterfaceOverview interface(const std::string& name, std::vector<LeaseOverview> leases) {
    InterfaceOverview interface;
    interface.system = hostSystem;
    interface.name = name;
    interface.dhcp = true;
    interface.active = true;
    interface.address = "";
    interface.leases = std::move(leases);
    return interface;
}

/// The verdict and the text of the one finding.
std::pair<Verdict, std::string> only(const MachineInterfaces& machine, std::int64_t at = now) {
    const auto findings = machineFindings(machine, at);
    if (findings.size() != 1) {
        return {Verdict::good, std::to_string(findings.size()) + " findings"};
    }
    return {findings[0].verdict, findings[0].what + ": " + findings[0].detail};
}

std::string remedyOf(const Diagnostic& diagnostic) {
    const auto findings = machineFindings({{}, {diagnostic}}, now);
    return findings.size() == 1 ? findings[0].remedy : "not one finding";
}

TEST(MachineFindings, AreNoneWhereAllIsWell) {
    InterfaceOverview off = interface("eth1", {});
    off.dhcp = false;
    off.active = false;
    EXPECT_THAT(machineFindings({{interface("eth0", {lease()}), off}, {}}, now), IsEmpty());
    // A client that renews is as it should be.
    EXPECT_THAT(machineFindings({{interface("eth0", {lease()})}, {}}, now + 1900), IsEmpty());
}

TEST(MachineFindings, TellOfAClientThatNoServerResponds) {
    LeaseOverview six = client();
    six.family = "IPv6";
    six.client = "";
    const MachineInterfaces machine{{interface("eth0", {client()}), interface("eth1", {six})}, {}};
    EXPECT_EQ(only(machine),
              std::pair(Verdict::notable,
                        std::string("DHCP server: eth0 (dhclient, IPv4), eth1 (unknown client, "
                                    "IPv6): asks for a lease, and no server has given one; since "
                                    "when is not known")));
    EXPECT_NE(machineFindings(machine, now)[0].remedy, "");
    // Also beside a lease of the other family.
    EXPECT_THAT(machineFindings({{interface("eth0", {lease(), six})}, {}}, now), SizeIs(1));
}

TEST(MachineFindings, TellOfAServerThatDoesNotRespondAnyMore) {
    EXPECT_EQ(only({{interface("eth0", {lease()})}, {}}, now + 3200),
              std::pair(Verdict::notable,
                        std::string("DHCP server: eth0 (dhclient, IPv4): the server of the lease "
                                    "does not respond, and any other is asked")));
}

TEST(MachineFindings, TellOfALinkThatIsDown) {
    InterfaceOverview down = interface("eth0", {client()});
    down.active = false;
    EXPECT_EQ(
        only({{down}, {}}),
        std::pair(Verdict::notable, std::string("link: eth0: DHCP is on, and there is no link")));
}

TEST(MachineFindings, TellOfALeaseThatHasEnded) {
    EXPECT_EQ(only({{interface("eth0", {lease()})}, {}}, now + 3600 + 7200),
              std::pair(Verdict::bad,
                        std::string("lease: eth0 (dhclient, IPv4) of 192.0.2.17, 2 h ago: has "
                                    "ended, and there is no other")));
}

TEST(MachineFindings, TellThatItIsNotKnownWhetherDhcpIsOn) {
    InterfaceOverview hidden = interface("eth0", {});
    hidden.dhcp = std::nullopt;
    EXPECT_EQ(
        only({{hidden}, {}}),
        std::pair(Verdict::notable, std::string("DHCP: eth0: whether DHCP is on is not known")));
}

TEST(MachineFindings, AreOneForManyInterfaces) {
    std::vector<InterfaceOverview> many;
    for (int number = 0; number < 9; ++number) {
        many.push_back(interface("eth" + std::to_string(number), {}));
        many.back().active = false;
    }
    EXPECT_EQ(only({many, {}}).second,
              "link: eth0, eth1, eth2, eth3, and 5 more: DHCP is on, and there is no link");
}

TEST(MachineFindings, TellOfAClientThatIsDead) {
    const Diagnostic diagnostic("eth0: the client of its lease does not run", Kind::ClientGone);
    EXPECT_EQ(only({{}, {diagnostic}}), std::pair(Verdict::bad, "client: " + diagnostic.text));
    EXPECT_THAT(remedyOf(diagnostic), testing::StartsWith("start the client again"));
}

TEST(MachineFindings, TellOfAnAddressWhoseLeaseHasEnded) {
    const Diagnostic diagnostic("eth0: the lease of 192.0.2.17 has ended", Kind::LeaseEnded);
    EXPECT_EQ(only({{}, {diagnostic}}), std::pair(Verdict::bad, "lease: " + diagnostic.text));
    EXPECT_THAT(remedyOf(diagnostic), testing::HasSubstr("ip address del"));
}

TEST(MachineFindings, TellOfAConfigurationThatIsNotApplied) {
    const Diagnostic diagnostic("eth0: /etc/network/interfaces asks for DHCP, and no client runs",
                                Kind::NotApplied);
    EXPECT_EQ(only({{}, {diagnostic}}),
              std::pair(Verdict::notable, "not applied: " + diagnostic.text));
    EXPECT_THAT(remedyOf(diagnostic), testing::HasSubstr("ifup"));
}

TEST(MachineFindings, TellWhatThisUserMayNotRead) {
    const Diagnostic diagnostic("cannot read /var/lib/dhcp: Permission denied", Kind::Denied);
    EXPECT_EQ(only({{}, {diagnostic}}), std::pair(Verdict::notable, "rights: " + diagnostic.text));
    EXPECT_THAT(remedyOf(diagnostic), testing::StartsWith("run as root"));
}

TEST(MachineFindings, TellOfADamagedFile) {
    const Diagnostic diagnostic("/var/lib/dhcp/dhclient.leases:7: a lease without an address",
                                Kind::Damaged);
    EXPECT_EQ(only({{}, {diagnostic}}), std::pair(Verdict::notable, "damaged: " + diagnostic.text));
    EXPECT_THAT(remedyOf(diagnostic), testing::HasSubstr("renewing its lease"));
}

TEST(MachineFindings, TellWhatIsNotBelieved) {
    const Diagnostic diagnostic("process 17 calls itself udhcpc", Kind::Untrusted);
    EXPECT_EQ(only({{}, {diagnostic}}),
              std::pair(Verdict::notable, "not believed: " + diagnostic.text));
    EXPECT_THAT(remedyOf(diagnostic), testing::HasSubstr("chown"));
}

TEST(MachineFindings, TellOfALinkThatLeadsToItself) {
    const Diagnostic loop("cannot read /var/lib/dhcp: Too many levels of symbolic links");
    const Diagnostic other("cannot read /var/lib/dhcp: Input/output error");
    EXPECT_EQ(only({{}, {loop}}), std::pair(Verdict::notable, "live source: " + loop.text));
    EXPECT_THAT(remedyOf(loop), testing::StartsWith("remove the link"));
    EXPECT_THAT(remedyOf(other), Not(testing::StartsWith("remove the link")));
    EXPECT_THAT(machineFindings({{}, {loop, other}}, now), SizeIs(2));
}

TEST(MachineFindings, TellAnyOtherNote) {
    const Diagnostic diagnostic("eth0: a client runs on a bridge port", Kind::Note);
    EXPECT_EQ(only({{}, {diagnostic}}), std::pair(Verdict::notable, "note: " + diagnostic.text));
    EXPECT_EQ(remedyOf(diagnostic), "");
}

TEST(MachineFindings, AreOneForManyLikeDiagnostics) {
    std::vector<Diagnostic> many;
    for (int number = 0; number < 30; ++number) {
        many.emplace_back("record " + std::to_string(number), Kind::Damaged);
    }
    EXPECT_EQ(only({{}, many}).second,
              "damaged: record 0; record 1; record 2; record 3; and 26 more");
}

std::vector<InterfaceOverview> interfaces(int count) {
    std::vector<InterfaceOverview> all(static_cast<std::size_t>(count));
    for (int number = 0; number < count; ++number) {
        all[static_cast<std::size_t>(number)].name = "eth" + std::to_string(number);
    }
    return all;
}

TEST(ShortList, NamesTheFirstOfMany) {
    EXPECT_EQ(shortList({}), "");
    EXPECT_EQ(shortList(std::vector<std::string>{"a"}), "a");
    EXPECT_EQ(shortList(std::vector<std::string>{"a", "b", "c", "d"}), "a, b, c, d");
    EXPECT_EQ(shortList(std::vector<std::string>{"a", "b", "c", "d", "e", "f"}, "; "),
              "a; b; c; d; and 2 more");
}

TEST(Enumeration, HasAnAndBeforeTheLast) {
    EXPECT_EQ(enumeration({}), "");
    EXPECT_EQ(enumeration(std::vector<std::string>{"a"}), "a");
    EXPECT_EQ(enumeration(std::vector<std::string>{"a", "b"}), "a and b");
    EXPECT_EQ(enumeration(std::vector<std::string>{"a", "b", "c"}), "a, b and c");
}

TEST(DiagnosticText, IsOneLineAboutWhatCouldNotBeRead) {
    EXPECT_EQ(diagnosticText({}, {}), "");
    std::vector<Diagnostic> diagnostics{
        Diagnostic("cannot read /a: Permission denied", Kind::Denied)};
    EXPECT_EQ(diagnosticText(diagnostics, {}),
              "cimdhcp: not everything could be read: cannot read /a: Permission denied\n");
    diagnostics.emplace_back("cannot read \nb");
    EXPECT_EQ(diagnosticText(diagnostics, {}),
              "cimdhcp: not everything could be read: cannot read /a: Permission denied; cannot "
              "read \\x0Ab\n");
    EXPECT_EQ(diagnosticText(std::vector(6, Diagnostic("a")), {}),
              "cimdhcp: not everything could be read: a; a; a; a; and 2 more, which are in the "
              "log\n");
}

TEST(DiagnosticText, TellsAllElseAsNotes) {
    const std::vector<Diagnostic> diagnostics{
        Diagnostic("eth0: a bridge port", Kind::Note),
        Diagnostic("a torn record", Kind::Damaged),
        Diagnostic("a strange program", Kind::Untrusted),
        Diagnostic("eth0: asks in a file", Kind::NotApplied),
        Diagnostic("eth0: a lease has ended", Kind::LeaseEnded),
        Diagnostic("eth0: no client runs", Kind::ClientGone),
        Diagnostic("unread")};
    EXPECT_EQ(diagnosticText(diagnostics, interfaces(1)),
              "cimdhcp: not everything could be read: unread\n"
              "cimdhcp: note: a torn record\n"
              "cimdhcp: note: a strange program\n"
              "cimdhcp: note: eth0: asks in a file\n"
              "cimdhcp: note: eth0: a lease has ended\n"
              "cimdhcp: note: eth0: no client runs\n"
              "cimdhcp: note: eth0: a bridge port\n");
}

TEST(DiagnosticLines, AreOneForWhatIsSaidOfSeveralInterfaces) {
    std::vector<Diagnostic> diagnostics;
    for (const char* name : {"eth0", "eth2", "eth1"}) {
        diagnostics.emplace_back(std::string(name) + ": no client runs", Kind::NotApplied);
    }
    diagnostics.emplace_back("eth9: no client runs", Kind::NotApplied);
    diagnostics.emplace_back("eth0: no client runs", Kind::Note);
    EXPECT_THAT(linesOf(Kind::NotApplied, diagnostics, interfaces(3)),
                ElementsAre("eth0, eth2, eth1: no client runs", "eth9: no client runs"));
    // What is not an interface of the machine is part of what is said.
    EXPECT_THAT(linesOf(Kind::Note, diagnostics, {}), ElementsAre("eth0: no client runs"));
    diagnostics.clear();
    for (const InterfaceOverview& each : interfaces(200)) {
        diagnostics.emplace_back(each.name + ": no client runs", Kind::NotApplied);
    }
    EXPECT_THAT(linesOf(Kind::NotApplied, diagnostics, interfaces(200)),
                ElementsAre("eth0, eth1, eth2, eth3, and 196 more: no client runs"));
}

TEST(DiagnosticLines, AreOneForMany) {
    std::vector<Diagnostic> diagnostics;
    for (int number = 1; number <= 4; ++number) {
        diagnostics.emplace_back("line " + std::to_string(number), Kind::Damaged);
    }
    EXPECT_THAT(linesOf(Kind::Damaged, diagnostics, {}),
                ElementsAre("line 1", "line 2", "line 3", "line 4"));
    diagnostics.emplace_back("line 5", Kind::Damaged);
    EXPECT_THAT(linesOf(Kind::Damaged, diagnostics, {}),
                ElementsAre("line 1; line 2; line 3; line 4; and 1 more"));
}

}  // namespace
}  // namespace cimdhcp
