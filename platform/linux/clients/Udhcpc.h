#pragma once

#include <optional>
#include <span>
#include <string_view>

#include "facts/ClientFacts.h"
#include "formats/Files.h"

namespace ZR::Live {

/// udhcpc itself keeps its lease to itself. An event script can leave it here, as
/// udhcpc.INTERFACE.state with the variables that it was given: ip, serverid, lease; when
/// that was, as obtained (seconds since the epoch); and the names of those that stand for
/// options, as options. docs/sources.md has the script.
inline constexpr std::string_view udhcpcStateDirectory = "/run";
inline constexpr std::string_view udhcpcStatePrefix = "udhcpc.";

/// What a command line says, program name included; also "busybox udhcpc ...".
/// nullopt for another program, and for none at all.
[[nodiscard]] std::optional<ClientProcess> parseUdhcpcArguments(
    std::span<const std::string_view> arguments);

/// Adds the leases that event scripts left. Needs the processes to be in the facts.
void readUdhcpc(const Roots& roots, ClientFacts& facts);

}  // namespace ZR::Live
