#pragma once

#include <optional>
#include <string_view>

#include "facts/ClientFacts.h"
#include "formats/IpAddress.h"
#include "formats/Roots.h"

namespace ZR::Live {

/// Where connman keeps SERVICE/settings.
inline constexpr std::string_view connmanDirectory = "/var/lib/connman";

/// The settings of one service that tell where its address comes from.
struct ConnmanSettings {
    bool dhcp4 = false;
    std::optional<IpAddress> lastAddress;  ///< the last one by DHCP

    bool operator==(const ConnmanSettings&) const = default;
};
[[nodiscard]] ConnmanSettings parseConnmanSettings(std::string_view text);

/// Adds the addresses that connman got by DHCP, while it runs: its files stay as they are
/// when it ends. They name neither link nor server. Needs the processes to be in the facts.
void readConnman(const Roots& roots, ClientFacts& facts);

}  // namespace ZR::Live
