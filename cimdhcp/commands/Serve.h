#pragma once

#include <cstdint>
#include <optional>
#include <ostream>
#include <string>

#include "arguments/Commands.h"
#include "cimom/Forward.h"

namespace cimdhcp {

/// Where a server listens: "ADDRESS", "ADDRESS:PORT", "IPV6", "[IPV6]:PORT".
struct Listening {
    std::string address;
    std::optional<std::uint16_t> port;

    bool operator==(const Listening&) const = default;
};

/// Throws Failure with ExitStatus::usage.
[[nodiscard]] Listening readListening(const std::string& text);

/// Runs the WBEM server until the process gets SIGTERM or SIGINT; at SIGHUP it reads
/// certificate, key, users and the settings of logging anew. Blocks the three in this thread.
/// Prints one line when the server accepts connections, and logs the rest. Throws Failure when the
/// server cannot start.
void serve(const ServeCommand& command, cimom::ObjectManager& manager, std::ostream& out);

}  // namespace cimdhcp
