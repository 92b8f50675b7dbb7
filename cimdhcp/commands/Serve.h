#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <ostream>
#include <string>
#include <vector>

#include "arguments/Commands.h"
#include "cimom/Forward.h"
#include "commands/Metrics.h"
#include "wbem/Server.h"
#include "wbem/Users.h"

namespace cimdhcp {

/// Where a server listens: "ADDRESS", "ADDRESS:PORT", "IPV6", "[IPV6]:PORT".
struct Listening {
    std::string address;
    std::optional<std::uint16_t> port;

    bool operator==(const Listening&) const = default;
};

/// Throws Failure with ExitStatus::usage, which names the option.
[[nodiscard]] Listening readListening(const std::string& text, const char* option = "--listen");

/// What the command says about listener, certificate, users and limits. Throws Failure and
/// UsersError.
[[nodiscard]] cimom::wbem::ServerSettings settingsOf(const ServeCommand& command);

/// Where the lines of servers go: to the log channel.
[[nodiscard]] cimom::wbem::ServerLog serverLog();

/// Reads certificate, key and users anew, for all the servers of one command, and logs what came of
/// it; `further` gets the users, too. What is wrong with one file keeps nothing else from it.
void renewListeners(const ServeCommand& command, const std::vector<cimom::wbem::Server*>& servers,
                    const std::function<void(std::vector<cimom::wbem::User>)>& further = nullptr);

/// Runs the WBEM server until the process gets SIGTERM or SIGINT; at SIGHUP it reads
/// certificate, key, users and the settings of logging anew. Blocks the three in this thread.
/// Prints one line when the server accepts connections, and another one when it serves metrics,
/// for which `ask` asks the machine; logs the rest. Throws Failure when the server cannot start.
void serve(const ServeCommand& command, cimom::ObjectManager& manager, AskMetrics ask,
           std::ostream& out);

/// Adds a user to the server's users file, or changes role and password. On a
/// terminal the password is asked for twice on `prompts`, without an echo; otherwise
/// it is the first line of standard input. Throws Failure.
void addUser(const UserAddCommand& command, std::ostream& out, std::ostream& prompts);

}  // namespace cimdhcp
