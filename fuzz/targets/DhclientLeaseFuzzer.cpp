// Lease files of ISC dhclient.
#include "clients/DhclientLease.h"

#include <algorithm>
#include <array>
#include <set>

#include "Input.h"
#include "facts/Lease.h"
#include "support/Texts.h"

namespace {

using ZR::Live::DhclientAddress;
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

std::string timeOf(std::int64_t time) {
    return time == Lease::never ? "never" : "epoch " + std::to_string(time);
}

/// What comes so long after a start.
std::string secondsOf(const char* keyword, std::int64_t start, std::int64_t time) {
    return keyword + (time == Lease::never ? std::string{" 4294967295;"}
                                           : ' ' + std::to_string(time - start) + ';');
}

std::string written4(const DhclientLease& lease) {
    std::string text;
    for (const std::uint16_t code : lease.options) {
        if (code == 54 && lease.server) {
            text += "  option dhcp-server-identifier " + fuzz::textOf(lease.server) + ";\n";
        } else if (code == 61) {
            text += "  option dhcp-client-identifier " + quoted(lease.clientIdentifier) + ";\n";
        } else if (code == 51 && !lease.addresses.empty() && lease.addresses[0].obtained) {
            text += "  option dhcp-lease-time " +
                    std::to_string(lease.addresses[0].expires - *lease.addresses[0].obtained) +
                    ";\n";
        } else {
            text += "  option unknown-" + std::to_string(code) + " 0;\n";
        }
    }
    for (const DhclientAddress& address : lease.addresses) {
        text += "  fixed-address " + fuzz::textOf(address.address) + ";\n  expire " +
                timeOf(address.expires) + ";\n";
        text += address.renews ? "  renew " + timeOf(*address.renews) + ";\n" : "";
        text += address.rebinds ? "  rebind " + timeOf(*address.rebinds) + ";\n" : "";
    }
    return text;
}

std::string written6(const DhclientLease& lease) {
    std::string text;
    for (const std::uint16_t code : lease.options) {
        text += code == 1 ? "  option dhcp6.client-id " + quoted(lease.clientIdentifier) + ";\n"
                          : "  option dhcp6.unknown-" + std::to_string(code) + " 0;\n";
    }
    const bool temporary =
        std::find(lease.options.begin(), lease.options.end(), 3) == lease.options.end();
    for (const DhclientAddress& address : lease.addresses) {
        // As late a start as there can have been.
        std::int64_t start = Lease::never;
        for (const auto& time : {address.renews, address.rebinds}) {
            start = time ? std::min(start, *time - 1) : start;
        }
        text += temporary ? "  ia-ta 0 {\n" : "  ia-na 0 {\n";
        if (start != Lease::never && start != Lease::never - 1) {
            text += "    starts " + std::to_string(start) + ";\n";
        }
        text += address.renews ? secondsOf("    renew", start, *address.renews) : "";
        text += address.rebinds ? secondsOf("    rebind", start, *address.rebinds) : "";
        text += "    iaaddr " + fuzz::textOf(address.address) + " {\n";
        const std::int64_t own = address.obtained.value_or(0);
        text += address.obtained ? "starts " + std::to_string(own) + ';' : "starts x;";
        text += secondsOf("max-life", own, address.expires) + "\n    }\n  }\n";
    }
    return text;
}

/// The block as dhclient would write it.
std::string written(const DhclientLease& lease) {
    std::string text;
    if (lease.ipv6) {
        text += "default-duid " + quoted(lease.clientIdentifier) + ";\nlease6 {\n";
    } else {
        text += "lease {\n";
    }
    text += "  interface " + quoted(std::string(lease.interfaceName.view())) + ";\n";
    text += lease.ipv6 ? written6(lease) : written4(lease);
    return text + (lease.bootp ? "  bootp;\n" : "") + (lease.released ? "  released;\n" : "") +
           "}\n";
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view given = fuzz::text(data, size);
    const auto found = ZR::Live::parseDhclientLeases(given);
    const auto& parsed = found.leases;
    for (const auto& damage : found.damage) {
        fuzz::require(!damage.what.empty(), "damage is something");
        fuzz::require(damage.line >= 1 && damage.line <= 1 + static_cast<std::size_t>(std::count(
                                                                 given.begin(), given.end(), '\n')),
                      "damage is in a line of the file");
    }
    fuzz::require(!found.cutOff || !found.damage.empty(), "a file that was cut off is damaged");
    std::set<std::pair<bool, ZR::Live::InterfaceName>> names;
    std::string text;
    for (const DhclientLease& lease : parsed) {
        fuzz::require(names.emplace(lease.ipv6, lease.interfaceName).second,
                      "an interface has one lease of a protocol");
        fuzz::require(!lease.server || lease.server->isIPv4(), "a server is an IPv4 address");
        fuzz::require(lease.ipv6 || lease.addresses.size() == 1, "IPv4 leases one address");
        for (const auto& address : lease.addresses) {
            fuzz::require(address.address.isIPv4() != lease.ipv6,
                          "what was leased is an address of the protocol");
        }
        text += written(lease);
    }
    const auto again = ZR::Live::parseDhclientLeases(text);
    fuzz::require(again.leases == parsed, "leases survive being written");
    fuzz::require(again.damage.empty(), "what was written is whole");
    return 0;
}
