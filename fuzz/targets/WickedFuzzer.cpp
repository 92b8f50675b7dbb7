// Lease files of wicked.
#include "clients/Wicked.h"

#include <sys/socket.h>

#include <algorithm>

#include "Input.h"
#include "support/Texts.h"

namespace {

using ZR::Live::WickedAddress;
using ZR::Live::WickedLease;

std::string element(const std::string& name, const std::string& text) {
    return "<" + name + ">" + text + "</" + name + ">\n";
}

template <typename Number>
std::string numberElement(const char* name, const std::optional<Number>& number) {
    return element(name, number ? std::to_string(*number) : "");
}

std::string written4(const WickedLease& lease) {
    std::string text;
    std::string inner;
    for (const WickedAddress& address : lease.addresses) {
        text += numberElement("acquired", address.acquired);
        inner += numberElement("lease-time", address.lifetime) +
                 element("address", fuzz::textOf(address.address));
    }
    return text + element("ipv4:dhcp", inner + element("server-id", fuzz::textOf(lease.server)));
}

std::string written6(const WickedLease& lease) {
    std::string inner = element("server-address", fuzz::textOf(lease.server));
    for (const WickedAddress& address : lease.addresses) {
        inner += element(
            "ia-na",
            numberElement("acquired", address.acquired) +
                element("ia-address", element("address", fuzz::textOf(address.address) + "/128") +
                                          numberElement("valid-lft", address.lifetime)));
    }
    return element("ipv6:dhcp", inner);
}

/// A file may speak of one family and then of the other; what is written speaks of one.
bool isOfOneFamily(const WickedLease& lease) {
    return lease.family != 0 && (!lease.server || lease.server->family() == lease.family) &&
           std::all_of(
               lease.addresses.begin(), lease.addresses.end(),
               [&](const WickedAddress& each) { return each.address.family() == lease.family; });
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const auto parsed = ZR::Live::parseWickedLease(fuzz::text(data, size));
    const auto* const lease = std::get_if<WickedLease>(&parsed);
    if (lease == nullptr) {
        fuzz::require(!std::get<std::string_view>(parsed).empty(), "a refusal has a reason");
        return 0;
    }
    if (isOfOneFamily(*lease)) {
        const bool six = lease->family == AF_INET6;
        const std::string again =
            element("lease", element("family", six ? "ipv6" : "ipv4") +
                                 element("type", lease->type) + element("state", lease->state) +
                                 (six ? written6(*lease) : written4(*lease)));
        fuzz::require(ZR::Live::parseWickedLease(again) == parsed,
                      "a lease survives being written");
    }
    return 0;
}
