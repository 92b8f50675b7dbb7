#pragma once

#include <span>
#include <string_view>

#include "clients/Lease.h"
#include "formats/Roots.h"

namespace ZR::Live {

/// A directory in which traces of a client lie, and how their names begin.
struct ClientPlace {
    std::string_view directory;
    std::string_view namePrefix;
};

/// Who reads the traces of one client, and where.
struct ClientSource {
    void (*read)(const Roots& roots, ClientFacts& facts);
    std::span<const ClientPlace> places;
};

/// All of them, in the order in which they are read and their claims are heard: of two
/// equal claims, the earlier one counts. Processes go first: others ask who runs.
[[nodiscard]] std::span<const ClientSource> clientSources() noexcept;

}  // namespace ZR::Live
