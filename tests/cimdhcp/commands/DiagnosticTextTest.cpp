#include "commands/DiagnosticText.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace cimdhcp {
namespace {

using testing::ElementsAre;
using ZR::Diagnostic;
using Kind = Diagnostic::Kind;

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
