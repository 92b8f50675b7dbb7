#pragma once

#include <atomic>
#include <chrono>
#include <cstddef>
#include <functional>
#include <vector>

#include "client/ServerUrl.h"
#include "commands/ClientCommands.h"

namespace cimdhcp {

/// What came of asking one of several servers.
struct ServerReport {
    std::size_t server = 0;  ///< its place in the list
    Outcome outcome;         ///< with the failure when there was one
    std::chrono::duration<double> took{};
};

/// Asks one server; called in threads of its own, for several servers at once. A
/// Failure, and any other exception, is the failure of that server alone.
using AskServer = std::function<Outcome(const ServerUrl&)>;

/// Asks every server, at most `parallel` at the same time, and hands the reports over
/// in this thread as they arrive. No server waits for one that is slow, but for a
/// thread. No further server is asked once `interrupted` is true.
void askFleet(const std::vector<ServerUrl>& servers, std::size_t parallel, const AskServer& ask,
              const std::function<void(ServerReport&&)>& arrived,
              const std::atomic<bool>& interrupted);

}  // namespace cimdhcp
