#include <gtest/gtest.h>

#include <CLI/CLI.hpp>
#include <algorithm>

#include "arguments/OptionGroups.h"

namespace cimdhcp {
namespace {

/// What the options read into a command that had its defaults.
ServeCommand read(std::vector<std::string> arguments) {
    CLI::App app;
    ServeCommand serve;
    addServeOptions(app, serve);
    // The parser takes them from the end.
    std::reverse(arguments.begin(), arguments.end());
    app.parse(arguments);
    return serve;
}

TEST(ServeOptions, LeaveTheDefaultsAlone) {
    EXPECT_EQ(read({}), ServeCommand());
}

TEST(ServeOptions, SayWhereToListenAndWhoMayAsk) {
    ServeCommand serve;
    serve.listen = "[::1]:5989";
    serve.tlsCertificate = "c";
    serve.tlsKey = "k";
    serve.users = "u";
    serve.readOnly = true;
    EXPECT_EQ(read({"--listen", "[::1]:5989", "--tls-cert", "c", "--tls-key", "k", "--users", "u",
                    "--read-only"}),
              serve);
}

TEST(ServeOptions, EachLimitIsItsOwn) {
    ServeCommand serve;
    serve.limits.headerLine = 1;
    serve.limits.headers = 2;
    serve.limits.body = 3;
    serve.limits.depth = 4;
    serve.limits.connections = 5;
    serve.limits.waiting = 6;
    serve.limits.sessions.sessions = 7;
    serve.limits.result = 8;
    serve.limits.workers = 9;
    serve.limits.stuck = 10;
    serve.limits.ioThreads = 11;
    serve.limits.request = std::chrono::seconds(12);
    serve.limits.response = std::chrono::seconds(13);
    serve.limits.sessions.defaultTimeout = std::chrono::seconds(14);
    serve.limits.sessions.longestTimeout = std::chrono::seconds(15);
    std::vector<std::string> arguments;
    for (const char* option :
         {"--max-header-line", "--max-headers", "--max-body", "--max-depth", "--max-connections",
          "--max-waiting", "--max-enumerations", "--max-result", "--workers", "--max-stuck",
          "--io-threads", "--request-timeout", "--answer-timeout", "--enumeration-timeout",
          "--max-enumeration-timeout"}) {
        arguments.emplace_back(option);
        arguments.push_back(std::to_string(arguments.size() / 2 + 1));
    }
    EXPECT_EQ(read(arguments), serve);
}

TEST(ServeOptions, SayHowListenersAreServed) {
    ServeCommand serve;
    serve.subscriptions = "dir";
    serve.delivery.caCertificates = "ca.pem";
    serve.subscriptionLimits.filters = 1;
    serve.subscriptionLimits.listeners = 2;
    serve.subscriptionLimits.subscriptions = 3;
    serve.delivery.queued = 4;
    serve.delivery.retries = 0;
    serve.delivery.retryInterval = std::chrono::seconds(5);
    serve.delivery.patience = std::chrono::seconds(6);
    serve.delivery.removalTime = std::chrono::seconds(7);
    EXPECT_EQ(read({"--subscriptions",     "dir", "--listener-cacert", "ca.pem",
                    "--max-filters",       "1",   "--max-listeners",   "2",
                    "--max-subscriptions", "3",   "--max-queue",       "4",
                    "--delivery-retries",  "0",   "--retry-interval",  "5",
                    "--listener-timeout",  "6",   "--give-up-after",   "7"}),
              serve);
    for (const char* option :
         {"--max-filters", "--max-listeners", "--max-subscriptions", "--max-queue",
          "--retry-interval", "--listener-timeout", "--give-up-after"}) {
        EXPECT_THROW(static_cast<void>(read({option, "0"})), CLI::ParseError) << option;
        EXPECT_THROW(static_cast<void>(read({option, "-1"})), CLI::ParseError) << option;
    }
}

TEST(ServeOptions, RefuseWhatIsNotANumber) {
    EXPECT_THROW(static_cast<void>(read({"--max-body", "much"})), CLI::ParseError);
    EXPECT_THROW(static_cast<void>(read({"--answer-timeout", "x"})), CLI::ParseError);
}

}  // namespace
}  // namespace cimdhcp
