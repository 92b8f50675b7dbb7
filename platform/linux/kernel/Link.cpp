#include "kernel/Link.h"

#include <linux/if_ether.h>
#include <linux/if_link.h>
#include <linux/netlink.h>
#include <linux/rtnetlink.h>

#include "formats/ValueFormats.h"
#include "kernel/Attributes.h"

namespace ZR::Live {
namespace {

// Headers of kernels before 5.14 lack it.
constexpr std::uint16_t parentDeviceName = 56;

/// The first name among the attributes of a link. The kernel writes it before all else.
std::optional<InterfaceName> nameIn(std::span<const std::byte> attributes) {
    AttributeWalk walk{attributes};
    for (Attribute attribute; walk.next(attribute);) {
        if (attribute.type == IFLA_IFNAME) {
            return InterfaceName::from(textOf(attribute.payload));
        }
    }
    return std::nullopt;
}

bool parseLinkInfo(std::span<const std::byte> payload, Link& link) {
    AttributeWalk walk{payload};
    for (Attribute attribute; walk.next(attribute);) {
        if (attribute.type == IFLA_INFO_KIND) {
            link.kind = textOf(attribute.payload);
        } else if (attribute.type == IFLA_INFO_SLAVE_KIND) {
            link.slaveKind = textOf(attribute.payload);
        }
    }
    return !walk.malformed();
}

bool parseAttribute(const Attribute& attribute, Link& link) {
    switch (attribute.type) {
        case IFLA_IFNAME:
            if (const auto name = InterfaceName::from(textOf(attribute.payload))) {
                link.name = *name;
                return true;
            }
            return false;
        case IFLA_ADDRESS:
            if (attribute.payload.size() == ETH_ALEN) {
                link.hardwareAddress = hexadecimal(attribute.payload, "");
            }
            return true;
        case IFLA_OPERSTATE:
            link.operstate = valueAt<std::uint8_t>(attribute.payload).value_or(0);
            return true;
        case IFLA_CARRIER:
            if (const auto carrier = valueAt<std::uint8_t>(attribute.payload)) {
                link.carrier = *carrier != 0;
            }
            return true;
        case IFLA_MASTER:
            link.master = valueAt<std::uint32_t>(attribute.payload).value_or(0);
            return true;
        case IFLA_LINK_NETNSID:
            link.farNamespace = valueAt<std::int32_t>(attribute.payload);
            return true;
        case IFLA_LINKINFO:
            return parseLinkInfo(attribute.payload, link);
        case parentDeviceName:
            link.hasParentDevice = !textOf(attribute.payload).empty();
            return true;
        default:
            return true;
    }
}

}  // namespace

std::optional<Link> parseLink(std::span<const std::byte> message) {
    const auto header = valueAt<nlmsghdr>(message);
    if (!header || header->nlmsg_type != RTM_NEWLINK || header->nlmsg_len > message.size() ||
        header->nlmsg_len < NLMSG_HDRLEN + sizeof(ifinfomsg)) {
        return std::nullopt;
    }
    const auto body = message.first(header->nlmsg_len).subspan(NLMSG_HDRLEN);
    const auto info = valueAt<ifinfomsg>(body);
    if (!info || info->ifi_index <= 0) {
        return std::nullopt;
    }
    const auto attributes = body.subspan(sizeof(ifinfomsg));
    const auto name = nameIn(attributes);
    if (!name) {
        return std::nullopt;
    }
    Link link{.ifindex = static_cast<std::uint32_t>(info->ifi_index),
              .name = *name,
              .flags = info->ifi_flags,
              .arphrdType = info->ifi_type,
              .kind = {},
              .slaveKind = {},
              .carrier = {}};
    AttributeWalk walk{attributes};
    for (Attribute attribute; walk.next(attribute);) {
        if (!parseAttribute(attribute, link)) {
            return std::nullopt;
        }
    }
    if (walk.malformed()) {
        return std::nullopt;
    }
    return link;
}

}  // namespace ZR::Live
