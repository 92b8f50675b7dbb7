#include "kernel/Address.h"

#include <linux/if_addr.h>
#include <linux/netlink.h>
#include <linux/rtnetlink.h>

#include "kernel/Attributes.h"

namespace ZR::Live {

std::optional<Address> parseAddress(std::span<const std::byte> message) {
    const auto header = valueAt<nlmsghdr>(message);
    if (!header || header->nlmsg_type != RTM_NEWADDR || header->nlmsg_len > message.size() ||
        header->nlmsg_len < NLMSG_HDRLEN + sizeof(ifaddrmsg)) {
        return std::nullopt;
    }
    const auto body = message.first(header->nlmsg_len).subspan(NLMSG_HDRLEN);
    const auto info = valueAt<ifaddrmsg>(body);
    if (!info || info->ifa_index == 0) {
        return std::nullopt;
    }
    std::uint32_t flags = info->ifa_flags;
    std::uint32_t validLifetime = Address::infinite;
    std::span<const std::byte> own;
    std::span<const std::byte> plain;
    AttributeWalk walk{body.subspan(sizeof(ifaddrmsg))};
    for (Attribute attribute; walk.next(attribute);) {
        switch (attribute.type) {
            case IFA_LOCAL:
                own = attribute.payload;
                break;
            case IFA_ADDRESS:
                plain = attribute.payload;
                break;
            case IFA_FLAGS:  // all 32 of them, where the header has room for eight
                flags = valueAt<std::uint32_t>(attribute.payload).value_or(flags);
                break;
            case IFA_CACHEINFO:
                if (const auto cache = valueAt<ifa_cacheinfo>(attribute.payload)) {
                    validLifetime = cache->ifa_valid;
                }
                break;
            default:
                break;
        }
    }
    // On a point-to-point link IFA_ADDRESS is the peer; IPv6 often has nothing else.
    const auto ip = IpAddress::fromBytes(info->ifa_family, own.empty() ? plain : own);
    if (walk.malformed() || !ip) {
        return std::nullopt;
    }
    return Address{.ifindex = info->ifa_index,
                   .ip = *ip,
                   .flags = flags,
                   .scope = info->ifa_scope,
                   .validLifetime = validLifetime};
}

}  // namespace ZR::Live
