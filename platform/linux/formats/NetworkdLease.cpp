#include "formats/NetworkdLease.h"

#include <algorithm>
#include <array>
#include <utility>

#include "formats/ValueFormats.h"
#include "zrcommon/PropertyFile.h"

namespace ZR::Live {
namespace {

/// Of T1 and T2 it is not to be seen whether they came or were worked out.
constexpr std::array<std::pair<std::string_view, std::uint16_t>, 11> optionKeys{{
    {"NETMASK", 1},
    {"ROUTER", 3},
    {"DNS", 6},
    {"HOSTNAME", 12},
    {"DOMAINNAME", 15},
    {"ROOT_PATH", 17},
    {"MTU", 26},
    {"BROADCAST", 28},
    {"NTP", 42},
    {"LIFETIME", 51},
    {"SERVER_ADDRESS", 54},
}};

/// Takes one pair; why it is wrong, empty when it is not.
std::string_view take(const PropertyLine& line, NetworkdLease& lease) {
    constexpr std::string_view notAnAddress = " is not an IPv4 address";
    if (line.key.empty()) {
        return "not of the form KEY=value";
    }
    const auto* const option =
        std::find_if(optionKeys.begin(), optionKeys.end(),
                     [&](const auto& known) { return known.first == line.key; });
    if (option != optionKeys.end() && !line.value.empty()) {
        lease.options.push_back(option->second);
    }
    if (line.key == "ADDRESS") {
        lease.address = IpAddress::ipv4FromText(line.value);
        return lease.address ? std::string_view{} : notAnAddress;
    }
    if (line.key == "SERVER_ADDRESS") {
        lease.server = IpAddress::ipv4FromText(line.value);
        return lease.server ? std::string_view{} : notAnAddress;
    }
    if (line.key == "LIFETIME") {
        lease.lifetime = parseTimeSpan(line.value);
        return lease.lifetime ? std::string_view{} : " is not a time";
    }
    if (line.key == "CLIENTID") {
        lease.clientIdentifier = line.value;
    }
    return {};
}

}  // namespace

NetworkdLease parseNetworkdLease(std::string_view text) {
    NetworkdLease lease;
    for (const PropertyLine& line : parsePropertyLines(text)) {
        const std::string_view reason = take(line, lease);
        if (!reason.empty() && lease.damage.empty()) {
            lease.damage = "line " + std::to_string(line.line) + ": " + line.key;
            lease.damage += reason;
        }
    }
    return lease;
}

}  // namespace ZR::Live
