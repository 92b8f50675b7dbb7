#include "commands/FleetOutput.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <sstream>

namespace cimdhcp {
namespace {

class FleetText : public ::testing::Test {
  protected:
    FleetOutput output(const Presentation& presentation, bool time = false) {
        return {servers_, presentation, time, outputs_, Style{}};
    }
    static ServerReport good(std::size_t server, const std::string& text) {
        return {server, {text, "", std::nullopt}, std::chrono::milliseconds(12)};
    }
    static ServerReport bad(std::size_t server, const std::string& text,
                            const std::string& message) {
        return {server,
                {text, "", Failure(ExitStatus::notDone, message)},
                std::chrono::milliseconds(12)};
    }

    const std::vector<ServerUrl> servers_{readServerUrl("http://a"), readServerUrl("b"),
                                          readServerUrl("c")};
    std::ostringstream out_;
    std::ostringstream err_;
    Outputs outputs_{out_, err_, std::nullopt};
};

TEST_F(FleetText, StandsBelowTheServersNames) {
    FleetOutput shown = output({});
    shown.show(good(1, "X\n1\n"));
    EXPECT_EQ(out_.str(), "== b\nX\n1\n\n");
    shown.show(good(0, "Y\n"));
    EXPECT_EQ(out_.str(), "== b\nX\n1\n\n== http://a\nY\n\n");
    EXPECT_EQ(shown.finish(false), ExitStatus::ok);
    EXPECT_EQ(err_.str(), "");
}

TEST_F(FleetText, WithoutHeadingsTheNameIsOnEachLine) {
    Presentation presentation;
    presentation.style.header = false;
    output(presentation).show(good(1, "eth0  on\neth1  off\n"));
    EXPECT_EQ(out_.str(), "b\teth0  on\nb\teth1  off\n");
    out_.str("");
    Presentation counting;
    counting.count = true;
    output(counting, true).show(good(0, "7\n"));
    EXPECT_EQ(out_.str(), "http://a\t0.012 s\t7\n");
}

TEST_F(FleetText, IsACommentWhereThereAreComments) {
    Presentation presentation;
    presentation.comments = true;
    output(presentation, true).show(good(2, "instance of A {};\n"));
    EXPECT_EQ(out_.str(), "// c (0.012 s)\ninstance of A {};\n");
}

TEST_F(FleetText, JsonIsAnObjectPerServer) {
    Presentation presentation;
    presentation.format = Format::json;
    FleetOutput shown = output(presentation, true);
    shown.show(good(1, "{\n  \"interfaces\": []\n}\n"));
    shown.show(bad(0, "", "no \"answer\""));
    EXPECT_EQ(out_.str(),
              "{\"host\":\"b\",\"status\":{\"exit\":0,\"message\":null},\"seconds\":0.012,"
              "\"result\":{\"interfaces\":[]}}\n"
              "{\"host\":\"http://a\",\"status\":{\"exit\":1,\"message\":\"no \\\"answer\\\"\"},"
              "\"seconds\":0.012,\"result\":null}\n");
}

TEST_F(FleetText, ListsFailuresAtTheEndInTheOrderOfTheServers) {
    FleetOutput shown = output({});
    shown.show(bad(2, "", "late"));
    shown.show(bad(0, "", "dead"));
    shown.show(good(1, "x\n"));
    EXPECT_EQ(out_.str(), "== b\nx\n\n");
    EXPECT_EQ(err_.str(), "");
    EXPECT_EQ(shown.finish(false), ExitStatus::notAllDone);
    EXPECT_EQ(err_.str(), "cimdhcp: 2 of 3 servers failed:\n  http://a: dead\n  c: late\n");
}

TEST_F(FleetText, TellsLikeDiagnosticsOnceAtTheEnd) {
    const auto with = [](std::size_t server, const std::string& diagnostics) {
        ServerReport report = good(server, "x\n");
        report.outcome.diagnostics = diagnostics;
        return report;
    };
    FleetOutput shown = output({});
    shown.show(with(2, "cimdhcp: note: one\ncimdhcp: note: two\n"));
    shown.show(with(0, "cimdhcp: note: two\n"));
    EXPECT_EQ(err_.str(), "");
    EXPECT_EQ(shown.finish(false), ExitStatus::ok);
    EXPECT_EQ(err_.str(), "c: cimdhcp: note: one\nc, http://a: cimdhcp: note: two\n");
}

TEST_F(FleetText, CountsTheServersOfADiagnosticThatManyHave) {
    FleetOutput shown = output({});
    for (int count = 0; count < 5; ++count) {
        ServerReport report = good(0, "x\n");
        report.outcome.diagnostics = "cimdhcp: note: one\n";
        shown.show(std::move(report));
    }
    EXPECT_EQ(shown.finish(false), ExitStatus::ok);
    EXPECT_EQ(err_.str(), "5 servers: cimdhcp: note: one\n");
}

TEST_F(FleetText, TellsHowFarItGotWhenItIsInterrupted) {
    FleetOutput shown = output({});
    shown.show(good(1, "x\n"));
    EXPECT_EQ(shown.finish(true), ExitStatus::interrupted);
    EXPECT_EQ(err_.str(), "cimdhcp: interrupted; 2 of 3 servers were not asked\n");
}

TEST_F(FleetText, ATerminalShowsHowFarItIs) {
    outputs_.errWidth = 80;
    {
        FleetOutput shown = output({});
        shown.show(bad(2, "", "late"));
        EXPECT_THAT(err_.str(), testing::HasSubstr("1 of 3, 1 failed"));
        shown.finish(false);
    }
    EXPECT_THAT(err_.str(), testing::HasSubstr("\r\x1B[Kcimdhcp: 1 of 3 servers failed:\n"));
    EXPECT_THAT(err_.str(), testing::EndsWith("  c: late\n"));
}

}  // namespace
}  // namespace cimdhcp
