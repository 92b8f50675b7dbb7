#pragma once

#include <optional>
#include <span>
#include <string_view>

#include "facts/ClientFacts.h"
#include "formats/Files.h"

namespace ZR::Live {

/// A directory in which files of one program lie, and how their names begin.
struct StatePlace {
    std::string_view directory;
    std::string_view namePrefix;
};

/// What reads one kind of state, and the places where its files lie.
struct StateReader {
    /// Null where the build is without it.
    void (*read)(const Roots& roots, ClientFacts& facts) = nullptr;
    std::span<const StatePlace> places;
    std::optional<Client> client{};  ///< whose state it is; nullopt: that of several
};

/// All of them, in the order in which they are to be called. Of two equal claims, the
/// one that was read first counts. Processes come first: other readers need to know which
/// programs run.
[[nodiscard]] std::span<const StateReader> stateReaders() noexcept;

/// Reads what a row is for. Where the build is without what would read it, a file in one of
/// its places gives a note: the program is or was on this machine.
void readState(const StateReader& reader, const Roots& roots, ClientFacts& facts);

/// Reads the sockets of clients, of which nothing notifies. Whom they are believed to be of
/// depends on the processes in the facts.
void readClientSockets(const Roots& roots, ClientFacts& facts);

}  // namespace ZR::Live
