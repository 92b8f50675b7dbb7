#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string_view>

#include "facts/ClientFacts.h"
#include "formats/Files.h"

namespace ZR::Live {

/// What /proc/PID/status tells of a process (proc(5)).
struct ProcessStatus {
    char state = '\0';               ///< 'Z' and 'X': it has ended
    std::int32_t parent = 0;         ///< process number
    std::uint32_t realUser{};        ///< who started it
    std::uint32_t user{};            ///< effective
    std::uint64_t capabilities = 0;  ///< effective ones, in its own user namespace

    [[nodiscard]] bool hasEnded() const noexcept { return state == 'Z' || state == 'X'; }

    bool operator==(const ProcessStatus&) const = default;
};

/// nullopt where the state or the users are missing.
[[nodiscard]] std::optional<ProcessStatus> parseProcessStatus(std::string_view text);

/// Adds the running DHCP clients, and the programs that manage links. Clients of another
/// network namespace concern other links, possibly of the same names, and are left out.
///
/// A name proves nothing: any user can give it to any program. Only a process of root, or
/// with a capability that the sockets of a client need, can be one; others give a diagnostic.
/// Clients whose network namespace may not be read are the hidden ones, each with a
/// diagnostic. Of any other process nothing but its name is read, and of the kernel's own
/// threads not even that.
///
/// A program that the build does not read is one of the hidden clients, with a note: any link
/// may be its.
void readProcesses(const Roots& roots, ClientFacts& facts);

/// The same, with programs that are not to be read although the build could.
void readProcessesExcept(std::span<const Client> unread, const Roots& roots, ClientFacts& facts);

}  // namespace ZR::Live
