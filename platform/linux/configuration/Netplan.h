#pragma once

#include <string_view>

#include "facts/ClientFacts.h"
#include "formats/Files.h"

namespace ZR::Live {

/// Where netplan writes what it makes of its own files for systemd-networkd. Its own
/// files tell less: in them, an interface may stand for any that fits a pattern.
inline constexpr std::string_view netplanDirectory = "/run/systemd/network";

/// Adds the configuration of each link that netplan has made one for. What it makes
/// for NetworkManager is read with that one's profiles.
void readNetplan(const Roots& roots, ClientFacts& facts);

}  // namespace ZR::Live
