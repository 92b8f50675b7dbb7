#include "kernel/InterfaceRules.h"

#include <linux/if.h>
#include <linux/if_arp.h>

#include <algorithm>
#include <array>

namespace ZR::Live {
namespace {

template <std::size_t size>
bool contains(const std::array<std::string_view, size>& names, std::string_view name) {
    return std::find(names.begin(), names.end(), name) != names.end();
}

// Virtual links that hold addresses of the machine itself.
constexpr std::array<std::string_view, 7> addressHolders{"bridge",  "bond",   "team", "vlan",
                                                         "macvlan", "ipvlan", "ipoib"};

// Masters that speak for their ports. A vrf does not: its ports keep their own
// addresses, and DHCP on them.
constexpr std::array<std::string_view, 4> speakingMasters{"bond", "bridge", "team", "openvswitch"};

struct Description {
    std::string_view kind;
    std::string_view text;
};
constexpr std::array<Description, 9> descriptions{{
    {"bridge", "Bridge"},
    {"bond", "Bond"},
    {"team", "Team"},
    {"vlan", "VLAN"},
    {"macvlan", "MAC VLAN"},
    {"ipvlan", "IP VLAN"},
    {"veth", "Virtual Ethernet interface"},
    {"ipoib", "InfiniBand interface"},
    {"wwan", "Mobile broadband interface"},
}};

bool isLoopback(const Link& link) {
    return link.arphrdType == ARPHRD_LOOPBACK || (link.flags & IFF_LOOPBACK) != 0;
}

bool isDevice(const Link& link) {
    return link.hasParentDevice || link.kind.empty();
}

/// An end of a virtual cable that is not a port of a switch.
bool isCableEnd(const Link& link) {
    return link.kind == "veth" && link.slaveKind != "bridge" && link.slaveKind != "openvswitch";
}

}  // namespace

void WayOut::add(const Link& link, bool addressed) {
    if (isLoopback(link)) {
        return;
    }
    hasDevice_ = hasDevice_ || isDevice(link);
    hasCable_ = hasCable_ || link.kind == "veth";
    if (isCableEnd(link) && link.farNamespace && (!where_ || (addressed && !addressed_))) {
        where_ = link.farNamespace;
        addressed_ = addressed;
    }
}

bool WayOut::isBy(const Link& link) const {
    return !hasDevice_ && where_ && isCableEnd(link) && link.farNamespace == where_;
}

bool isNetworkInterface(const Link& link, bool addressed) {
    if (isLoopback(link)) {
        return false;
    }
    if (isDevice(link)) {
        return true;
    }
    if (isCableEnd(link)) {
        // The end outside of a container has no address as a rule.
        return addressed;
    }
    // What is left out: tunnels, test devices, vrf, and kinds that are not known here.
    return contains(addressHolders, link.kind);
}

bool isEnslaved(const Link& link) {
    return link.master != 0 && contains(speakingMasters, link.slaveKind);
}

bool isActive(const Link& link) {
    if ((link.flags & IFF_UP) == 0) {
        return false;
    }
    if (link.operstate == IF_OPER_UP) {
        return true;
    }
    // Drivers that never report a state stay at UNKNOWN for ever.
    const bool lowerUp = (link.flags & IFF_LOWER_UP) != 0 || link.carrier.value_or(false);
    return link.operstate == IF_OPER_UNKNOWN && lowerUp;
}

std::string_view describe(const Link& link) {
    const auto* const known =
        std::find_if(descriptions.begin(), descriptions.end(),
                     [&](const Description& entry) { return entry.kind == link.kind; });
    if (known != descriptions.end()) {
        return known->text;
    }
    if (link.wireless) {
        return "Wireless interface";
    }
    switch (link.arphrdType) {
        case ARPHRD_ETHER:
            return "Ethernet interface";
        case ARPHRD_INFINIBAND:
            return "InfiniBand interface";
        default:
            return "Network interface";
    }
}

}  // namespace ZR::Live
