#pragma once

#include <atomic>
#include <chrono>
#include <cstddef>
#include <functional>
#include <vector>

#include "client/ServerUrl.h"
#include "commands/ClientCommands.h"

namespace cimdhcp {

/// The outcome on one of several servers.
struct ServerReport {
    std::size_t server = 0;  ///< its place in the list
    Outcome outcome;         ///< with the failure when there was one
    std::chrono::duration<double> took{};
};

/// Carries the command out on one server. Called by several threads at once; an
/// exception is the failure of that server alone.
using AskServer = std::function<Outcome(const ServerUrl&)>;

/// Asks every server, at most `parallel` at the same time, and hands the reports over
/// in this thread as they arrive. A slow server delays no other one, but keeps one of the
/// `parallel` threads. No further server is asked once `interrupted` is true.
void askFleet(const std::vector<ServerUrl>& servers, std::size_t parallel, const AskServer& ask,
              const std::function<void(ServerReport&&)>& arrived,
              const std::atomic<bool>& interrupted);

}  // namespace cimdhcp
