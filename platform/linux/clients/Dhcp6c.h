#pragma once

#include <optional>
#include <span>
#include <string_view>

#include "facts/RunningPrograms.h"

namespace ZR::Live {

/// What a command line of dhcp6c says, program name included. It keeps no addresses in
/// files, so that this is all there is. nullopt for none at all.
[[nodiscard]] std::optional<ClientProcess> parseDhcp6cArguments(
    std::span<const std::string_view> arguments);

}  // namespace ZR::Live
