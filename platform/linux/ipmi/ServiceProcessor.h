#pragma once

#include <cstdint>
#include <optional>

#include "formats/IpAddress.h"
#include "zrclient/Snapshot.h"

namespace ZR::Live {

/// The connection of a service processor to the network.
struct LanChannel {
    std::uint8_t channel = 0;
    std::optional<std::uint8_t> addressSource;  ///< IPMI's number; nullopt when not told
    std::optional<IpAddress> address;           ///< nullopt for none, or when not told

    bool operator==(const LanChannel&) const = default;
};

/// The computer within the computer.
struct ServiceProcessor {
    std::optional<LanChannel> lan;  ///< nullopt when it has none, or has not told yet

    bool operator==(const ServiceProcessor&) const = default;
};

/// Adds the nodes of a service processor to a machine's tree: a computer, and with a
/// LAN channel its network and one interface, which is named after the channel: IPMI
/// has no name for it, and no driver of the kernel gives this name to a link.
void addServiceProcessor(const ServiceProcessor& processor, SnapshotBuilder& tree);

}  // namespace ZR::Live
