#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

#include "kernel/Link.h"

namespace ZR::Live {

/// Whether a link is a network interface of the tree: something that can carry a
/// machine's own addresses, and not an inner part of another interface or of a
/// tunnel. `addressed`: the link has an address of any family. See also WayOut; besides,
/// a link on which a DHCP client was told to run always is one.
[[nodiscard]] bool isNetworkInterface(const Link& link, bool addressed);

/// By which cables a network namespace reaches others, as a container does that has no
/// device of its own. Both ends of a cable look alike: the container's, which is an
/// interface, and the host's, which is none. What tells them apart is what else is there.
///
/// A namespace with a device has its way out by that: its cables lead to containers. In one
/// without, the way out is by the cable that has an address, else by the first one; and by
/// all others that lead to where that one leads, as they came from there too. The rest
/// leads to containers within the container.
class WayOut {
  public:
    /// To be called for each link, in the order of their indexes.
    void add(const Link& link, bool addressed);

    /// Whether this is such a cable. To be called when all links were added.
    [[nodiscard]] bool isBy(const Link& link) const;

    /// Whether there are cables and no device, so that it counts where a cable leads.
    /// Likewise.
    [[nodiscard]] bool mayBeByCable() const { return !hasDevice_ && hasCable_; }

  private:
    bool hasDevice_ = false;
    bool hasCable_ = false;
    bool addressed_ = false;  // the cable by which it is known where the way leads
    std::optional<std::int32_t> where_;
};

/// Whether a link is a port of a link that owns the addresses in its stead.
[[nodiscard]] bool isEnslaved(const Link& link);

/// Whether a link is up and can carry traffic.
[[nodiscard]] bool isActive(const Link& link);

/// What a link is, for people.
[[nodiscard]] std::string_view describe(const Link& link);

}  // namespace ZR::Live
