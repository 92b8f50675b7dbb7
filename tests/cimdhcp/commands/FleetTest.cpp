#include "commands/Fleet.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <future>
#include <map>
#include <mutex>
#include <set>
#include <stdexcept>

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
    std::atomic<int> now = 0;
    std::atomic<int> most = 0;
    askAll(servers(60), 5, [&](const ServerUrl&) {
        const int mine = ++now;
        for (int before = most; before < mine && !most.compare_exchange_weak(before, mine);) {
        }
        std::this_thread::yield();
        --now;
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

}  // namespace
}  // namespace cimdhcp
