#include "kernel/Address.h"

#include <linux/if_addr.h>
#include <linux/netlink.h>
#include <linux/rtnetlink.h>

#include "formats/AddressText.h"
#include "kernel/Attributes.h"

namespace ZR::Live {
namespace {

// Headers of kernels before 5.18 lack it.
constexpr std::uint16_t addressProtocol = 11;

}  // namespace

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
    Address address{.ifindex = info->ifa_index,
                    .family = info->ifa_family,
                    .text = {},
                    .flags = info->ifa_flags,
                    .scope = info->ifa_scope};
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
                address.flags = valueAt<std::uint32_t>(attribute.payload).value_or(address.flags);
                break;
            case IFA_CACHEINFO:
                if (const auto cache = valueAt<ifa_cacheinfo>(attribute.payload)) {
                    address.validLifetime = cache->ifa_valid;
                    address.preferredLifetime = cache->ifa_prefered;
                }
                break;
            case addressProtocol:
                address.protocol = valueAt<std::uint8_t>(attribute.payload).value_or(0);
                break;
            default:
                break;
        }
    }
    // On a point-to-point link IFA_ADDRESS is the peer; IPv6 often has nothing else.
    auto text = addressText(address.family, own.empty() ? plain : own);
    if (walk.malformed() || !text) {
        return std::nullopt;
    }
    address.text = *std::move(text);
    return address;
}

}  // namespace ZR::Live
