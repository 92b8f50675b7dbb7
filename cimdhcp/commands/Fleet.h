#pragma once

#include <atomic>
#include <chrono>
#include <cstddef>
#include <functional>
#include <vector>

#include "arguments/Commands.h"
#include "client/ServerUrl.h"
#include "commands/ClientCommands.h"
#include "text/Failure.h"
#include "text/Presentation.h"

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

/// Carries out a command on the servers that the options name: on one that --connect
/// names with the output of this machine, on several with that of FleetOutput. Returns how
/// the program ends. Throws Failure for a fault of the only server, and for what is not
/// the fault of a server.
ExitStatus runRemotely(const CommandLine& line, const Presentation& presentation,
                       const Outputs& outputs, const Style& errorStyle);

}  // namespace cimdhcp
