#pragma once

#include <algorithm>
#include <array>
#include <cstddef>
#include <stdexcept>
#include <string_view>

// What the build is without, with commas between: the option ZR_WITHOUT of CMake.
#ifndef ZR_WITHOUT
#define ZR_WITHOUT ""
#endif

namespace ZR::Built {

/// What the build is without, as the option has it.
// NOLINTNEXTLINE(readability-redundant-string-init): empty in most builds only
inline constexpr std::string_view leftOut = ZR_WITHOUT;

/// What a machine is read from, each by the name under which a build can be without it.
inline constexpr std::array<std::string_view, 16> sources{
    "systemd-networkd", "NetworkManager", "wicked", "connman",  "dhclient",
    "dhcpcd",           "udhcpc",         "dhcp6c", "ipconfig", "kernel-ip",
    "netplan",          "ifupdown",       "ifcfg",  "bus",      "service-processor",
    "json-tree"};

/// Whether the build has a source. For constant expressions, in which a name that none of
/// them has does not compile; elsewhere it throws std::invalid_argument.
constexpr bool has(std::string_view source) {
    if (std::find(sources.begin(), sources.end(), source) == sources.end()) {
        throw std::invalid_argument("there is no such source");
    }
    for (std::string_view rest = leftOut; !rest.empty();) {
        const std::size_t end = std::min(rest.find(','), rest.size());
        if (rest.substr(0, end) == source) {
            return false;
        }
        rest.remove_prefix(std::min(end + 1, rest.size()));
    }
    return true;
}

}  // namespace ZR::Built
