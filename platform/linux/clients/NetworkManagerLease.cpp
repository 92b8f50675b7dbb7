#include "clients/NetworkManagerLease.h"

#include <sys/socket.h>

#include <algorithm>
#include <cstdint>
#include <string_view>

#include "clients/DhclientLease.h"
#include "formats/ValueFormats.h"

namespace ZR::Live {
namespace {

using Time = std::optional<std::int64_t>;

std::string_view textOf(const NetworkManagerOptions& options, std::string_view name) {
    const auto found = options.find(name);
    return found == options.end() ? std::string_view{} : std::string_view{found->second};
}

Time numberOf(const NetworkManagerOptions& options, std::string_view name) {
    return parseNumber<std::int64_t>(textOf(options, name));
}

/// A time that lies some seconds after another one; nullopt where one of both is missing,
/// never for the number that means so.
Time after(const Time& start, const Time& seconds) {
    if (!start || !seconds || *seconds < 0 || *start < 0 || *start > Lease::never - UINT32_MAX) {
        return std::nullopt;
    }
    return *seconds >= UINT32_MAX ? Lease::never : *start + *seconds;
}

/// The code of an option: they have the names of dhclient, with other signs between words.
std::optional<std::uint16_t> codeOf4(std::string name) {
    if (name == "dhcp_client_identifier") {
        return std::nullopt;  // what the client sent
    }
    std::replace(name.begin(), name.end(), '_', '-');
    return dhclientOptionCode(name);
}
std::optional<std::uint16_t> codeOf6(std::string name) {
    constexpr std::string_view prefix = "dhcp6_";
    constexpr std::uint16_t association = 3;  // IA_NA
    constexpr std::uint16_t hostName = 39;
    if (name == "iaid") {
        return association;
    }
    if (name == "fqdn_fqdn") {
        return hostName;
    }
    if (!name.starts_with(prefix)) {
        return std::nullopt;
    }
    std::replace(name.begin(), name.end(), '_', '-');
    name[prefix.size() - 1] = '.';
    return dhclientOptionCode6(name);
}

void addCodes(const NetworkManagerOptions& options,
              std::optional<std::uint16_t> (*codeOf)(std::string name), Lease& lease) {
    for (const auto& [name, value] : options) {
        if (const auto code = codeOf(name)) {
            lease.options.push_back(*code);
        }
    }
    std::sort(lease.options.begin(), lease.options.end());
    lease.options.erase(std::unique(lease.options.begin(), lease.options.end()),
                        lease.options.end());
}

}  // namespace

std::optional<Lease> networkManagerLease4(const NetworkManagerOptions& options) {
    const auto address = IpAddress::ipv4FromText(textOf(options, "ip_address"));
    if (!address) {
        return std::nullopt;
    }
    // It names no end of a lease for ever. One that cannot be read is over.
    const bool endless = !options.contains("expiry");
    Lease lease{.client = Client::NetworkManager,
                .interfaceName = {},
                .address = *address,
                .server = IpAddress::ipv4FromText(textOf(options, "dhcp_server_identifier")),
                .expires = endless ? Lease::never : numberOf(options, "expiry").value_or(0),
                .clientIdentifier = std::string{textOf(options, "dhcp_client_identifier")}};
    const Time length = numberOf(options, "dhcp_lease_time");
    if (!endless && length && *length > 0 && *length<UINT32_MAX&& * lease.expires> * length) {
        lease.obtained = *lease.expires - *length;
        lease.renews = after(lease.obtained, numberOf(options, "dhcp_renewal_time"));
        lease.rebinds = after(lease.obtained, numberOf(options, "dhcp_rebinding_time"));
    }
    addCodes(options, codeOf4, lease);
    return lease;
}

std::optional<Lease> networkManagerLease6(const NetworkManagerOptions& options) {
    const auto address = IpAddress::fromText(AF_INET6, textOf(options, "ip6_address"));
    if (!address) {
        return std::nullopt;
    }
    const Time start = numberOf(options, "starts");
    Lease lease{.client = Client::NetworkManager,
                .interfaceName = {},
                .address = *address,
                .server = {},
                // Its own client keeps no times, and takes the address away when it ends.
                .expires = after(numberOf(options, "life_starts"), numberOf(options, "max_life")),
                .obtained = start,
                .renews = after(start, numberOf(options, "renew")),
                .rebinds = after(start, numberOf(options, "rebind")),
                .clientIdentifier = std::string{textOf(options, "dhcp6_client_id")}};
    addCodes(options, codeOf6, lease);
    return lease;
}

}  // namespace ZR::Live
