// Many servers asked at once, and what is shown of them.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <future>
#include <map>
#include <mutex>
#include <set>
#include <sstream>
#include <stdexcept>

#include "commands/Fleet.h"
#include "commands/FleetOutput.h"

namespace cimdhcp {
namespace {

std::vector<ServerUrl> servers(std::size_t count) {
    std::vector<ServerUrl> all;
    for (std::size_t number = 0; number < count; ++number) {
        all.push_back(readServerUrl("host-" + std::to_string(number)));
    }
    return all;
}

std::map<std::size_t, Outcome> askAll(const std::vector<ServerUrl>& all, std::size_t parallel,
                                      const AskServer& ask) {
    std::map<std::size_t, Outcome> outcomes;
    const std::atomic<bool> interrupted = false;
    askFleet(
        all, parallel, ask,
        [&outcomes](ServerReport&& report) {
            EXPECT_TRUE(outcomes.emplace(report.server, std::move(report.outcome)).second);
        },
        interrupted);
    return outcomes;
}

TEST(Fleet, EachServerIsAskedOnce) {
    for (const std::size_t parallel : {1U, 3U, 256U}) {
        const auto outcomes = askAll(servers(40), parallel, [](const ServerUrl& server) {
            return Outcome{server.given, "", std::nullopt};
        });
        ASSERT_EQ(outcomes.size(), 40U);
        EXPECT_EQ(outcomes.at(7).text, "host-7");
    }
    EXPECT_TRUE(askAll({}, 4, [](const ServerUrl&) { return Outcome{}; }).empty());
}

TEST(Fleet, AFailureIsThatOfOneServer) {
    const auto outcomes = askAll(servers(3), 2, [](const ServerUrl& server) -> Outcome {
        if (server.given == "host-0") {
            throw Failure(ExitStatus::notDone, "no");
        }
        if (server.given == "host-1") {
            throw std::runtime_error("odd");
        }
        return {"yes", "", std::nullopt};
    });
    EXPECT_STREQ(outcomes.at(0).failure->what(), "no");
    EXPECT_EQ(outcomes.at(0).failure->status(), ExitStatus::notDone);
    EXPECT_STREQ(outcomes.at(1).failure->what(), "odd");
    EXPECT_EQ(outcomes.at(2).text, "yes");
}

TEST(Fleet, ReportsArriveWhileASlowServerIsStillAsked) {
    std::promise<void> allOthers;
    auto others = allOthers.get_future();
    std::size_t seen = 0;
    const std::atomic<bool> interrupted = false;
    std::vector<std::size_t> order;
    askFleet(
        servers(20), 2,
        [&others](const ServerUrl& server) {
            if (server.given == "host-0") {
                others.wait();
            }
            return Outcome{};
        },
        [&](ServerReport&& report) {
            order.push_back(report.server);
            if (++seen == 19) {
                allOthers.set_value();
            }
        },
        interrupted);
    ASSERT_EQ(order.size(), 20U);
    EXPECT_EQ(order.back(), 0U);
}

TEST(Fleet, NoMoreServersAreAskedAtOnceThanWanted) {
    std::atomic<int> atOnce = 0;
    std::atomic<int> most = 0;
    askAll(servers(60), 5, [&](const ServerUrl&) {
        const int mine = ++atOnce;
        for (int before = most; before < mine && !most.compare_exchange_weak(before, mine);) {
        }
        std::this_thread::yield();
        --atOnce;
        return Outcome{};
    });
    EXPECT_LE(most, 5);
}

TEST(Fleet, NoServerIsAskedOnceItIsInterrupted) {
    std::atomic<bool> interrupted = false;
    std::size_t reports = 0;
    askFleet(
        servers(100), 1,
        [&interrupted](const ServerUrl& server) {
            interrupted = server.given == "host-4";
            return Outcome{};
        },
        [&reports](ServerReport&&) { ++reports; }, interrupted);
    EXPECT_EQ(reports, 5U);
}

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
