// Lease files of ISC dhclient.
#include "clients/DhclientLease.h"

#include <algorithm>
#include <array>
#include <set>

#include "Input.h"
#include "facts/Lease.h"
#include "support/Addresses.h"

namespace {

using ZR::Live::DhclientLease;
using ZR::Live::Lease;

std::string quoted(const std::string& text) {
    std::string result = "\"";
    for (const char letter : text) {
        std::array<char, 5> octal{};
        static_cast<void>(std::snprintf(octal.data(), octal.size(), "\\%03o",
                                        static_cast<unsigned>(static_cast<unsigned char>(letter))));
        result += octal.data();
    }
    return result + '"';
}

/// The start and the lifetime that make an end.
std::string endOf(std::int64_t expires) {
    if (expires == Lease::never) {
        return "max-life 4294967295;";
    }
    const std::int64_t lifetime = std::min<std::int64_t>(expires, UINT32_MAX - 1);
    return "starts " + std::to_string(expires - lifetime) + "; max-life " +
           std::to_string(lifetime) + ';';
}

/// The block as dhclient would write it.
std::string written(const DhclientLease& lease) {
    std::string text = lease.ipv6 ? "lease6 {\n" : "lease {\n";
    text += "  interface " + quoted(std::string(lease.interfaceName.view())) + ";\n";
    for (const auto& address : lease.addresses) {
        if (!lease.ipv6) {
            text += "  fixed-address " + fuzz::textOf(address.address) + ";\n";
            if (address.expires) {
                text += *address.expires == Lease::never
                            ? "  expire never;\n"
                            : "  expire epoch " + std::to_string(*address.expires) + ";\n";
            }
        } else {
            text += "  ia-na 00:00:00:01 {\n    iaaddr " + fuzz::textOf(address.address) +
                    " {\n      " + (address.expires ? endOf(*address.expires) : "") +
                    "\n    }\n  }\n";
        }
    }
    if (lease.server) {
        text += "  option dhcp-server-identifier " + fuzz::textOf(lease.server) + ";\n";
    }
    return text + (lease.bootp ? "  bootp;\n" : "") + (lease.released ? "  released;\n" : "") +
           "}\n";
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const auto parsed = ZR::Live::parseDhclientLeases(fuzz::text(data, size));
    std::set<std::pair<bool, ZR::Live::InterfaceName>> names;
    std::string text;
    for (const DhclientLease& lease : parsed) {
        fuzz::require(names.emplace(lease.ipv6, lease.interfaceName).second,
                      "an interface has one lease of a protocol");
        fuzz::require(!lease.server || lease.server->isIPv4(), "a server is an IPv4 address");
        fuzz::require(lease.ipv6 || lease.addresses.size() <= 1, "IPv4 leases one address");
        for (const auto& address : lease.addresses) {
            fuzz::require(address.address.isIPv4() != lease.ipv6,
                          "what was leased is an address of the protocol");
        }
        text += written(lease);
    }
    fuzz::require(ZR::Live::parseDhclientLeases(text) == parsed, "leases survive being written");
    return 0;
}
