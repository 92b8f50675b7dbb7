#pragma once

#include <string_view>

#include "kernel/Link.h"

namespace ZR::Live {

/// Whether a link is a network interface of the tree: something that can carry a
/// machine's own addresses, and not an inner part of another interface or of a
/// tunnel. `addressed`: the link has an address of any family.
[[nodiscard]] bool isNetworkInterface(const Link& link, bool addressed);

/// Whether a link is a port of a link that owns the addresses in its stead.
[[nodiscard]] bool isEnslaved(const Link& link);

/// Whether a link is up and can carry traffic.
[[nodiscard]] bool isActive(const Link& link);

/// What a link is, for people.
[[nodiscard]] std::string_view describe(const Link& link);

}  // namespace ZR::Live
