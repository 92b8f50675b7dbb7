#include "clients/DhclientLease.h"

#include <algorithm>
#include <array>
#include <span>

#include "formats/ValueFormats.h"

namespace ZR::Live {
namespace {

struct Named {
    std::string_view name;
    std::uint16_t code;
};

// dhcp-options(5). Of the last ones some are no part of dhclient: distributions define them
// in its configuration.
constexpr std::array<Named, 119> options{{
    {"subnet-mask", 1},
    {"time-offset", 2},
    {"routers", 3},
    {"time-servers", 4},
    {"ien116-name-servers", 5},
    {"domain-name-servers", 6},
    {"log-servers", 7},
    {"cookie-servers", 8},
    {"lpr-servers", 9},
    {"impress-servers", 10},
    {"resource-location-servers", 11},
    {"host-name", 12},
    {"boot-size", 13},
    {"merit-dump", 14},
    {"domain-name", 15},
    {"swap-server", 16},
    {"root-path", 17},
    {"extensions-path", 18},
    {"ip-forwarding", 19},
    {"non-local-source-routing", 20},
    {"policy-filter", 21},
    {"max-dgram-reassembly", 22},
    {"default-ip-ttl", 23},
    {"path-mtu-aging-timeout", 24},
    {"path-mtu-plateau-table", 25},
    {"interface-mtu", 26},
    {"all-subnets-local", 27},
    {"broadcast-address", 28},
    {"perform-mask-discovery", 29},
    {"mask-supplier", 30},
    {"router-discovery", 31},
    {"router-solicitation-address", 32},
    {"static-routes", 33},
    {"trailer-encapsulation", 34},
    {"arp-cache-timeout", 35},
    {"ieee802-3-encapsulation", 36},
    {"default-tcp-ttl", 37},
    {"tcp-keepalive-interval", 38},
    {"tcp-keepalive-garbage", 39},
    {"nis-domain", 40},
    {"nis-servers", 41},
    {"ntp-servers", 42},
    {"vendor-encapsulated-options", 43},
    {"netbios-name-servers", 44},
    {"netbios-dd-server", 45},
    {"netbios-node-type", 46},
    {"netbios-scope", 47},
    {"font-servers", 48},
    {"x-display-manager", 49},
    {"dhcp-requested-address", 50},
    {"dhcp-lease-time", 51},
    {"dhcp-option-overload", 52},
    {"dhcp-message-type", 53},
    {"dhcp-server-identifier", 54},
    {"dhcp-parameter-request-list", 55},
    {"dhcp-message", 56},
    {"dhcp-max-message-size", 57},
    {"dhcp-renewal-time", 58},
    {"dhcp-rebinding-time", 59},
    {"vendor-class-identifier", 60},
    {"dhcp-client-identifier", 61},
    {"nwip-domain", 62},
    {"nwip-suboptions", 63},
    {"nisplus-domain", 64},
    {"nisplus-servers", 65},
    {"tftp-server-name", 66},
    {"bootfile-name", 67},
    {"mobile-ip-home-agent", 68},
    {"smtp-server", 69},
    {"pop-server", 70},
    {"nntp-server", 71},
    {"www-server", 72},
    {"finger-server", 73},
    {"irc-server", 74},
    {"streettalk-server", 75},
    {"streettalk-directory-assistance-server", 76},
    {"user-class", 77},
    {"slp-directory-agent", 78},
    {"slp-service-scope", 79},
    {"relay-agent-information", 82},
    {"nds-servers", 85},
    {"nds-tree-name", 86},
    {"nds-context", 87},
    {"bcms-controller-names", 88},
    {"bcms-controller-address", 89},
    {"client-last-transaction-time", 91},
    {"associated-ip", 92},
    {"pxe-system-type", 93},
    {"pxe-interface-id", 94},
    {"pxe-client-id", 97},
    {"uap-servers", 98},
    {"pcode", 100},
    {"tcode", 101},
    {"v6-only-preferred", 108},
    {"netinfo-server-address", 112},
    {"netinfo-server-tag", 113},
    {"default-url", 114},
    {"auto-config", 116},
    {"name-service-search", 117},
    {"subnet-selection", 118},
    {"domain-search", 119},
    {"classless-static-routes", 121},
    {"rfc3442-classless-static-routes", 121},
    {"vivco", 124},
    {"vivso", 125},
    {"v4-lost", 137},
    {"capwap-ac-v4", 138},
    {"sip-ua-cs-domains", 141},
    {"ipv4-address-andsf", 142},
    {"tftp-server-address", 150},
    {"v4-portparams", 159},
    {"v4-captive-portal", 160},
    {"loader-configfile", 209},
    {"loader-pathprefix", 210},
    {"loader-reboottime", 211},
    {"option-6rd", 212},
    {"v4-access-domain", 213},
    {"ms-classless-static-routes", 249},
    {"wpad", 252},
}};

// Options that have options of their own: these are written, one by one, as "space.name".
constexpr std::array<Named, 5> spaces{{
    {"nwip.", 63},
    {"fqdn.", 81},
    {"agent.", 82},
    {"vendor-class.", 124},
    {"vendor.", 125},
}};

constexpr std::string_view prefix6 = "dhcp6.";
constexpr std::array<Named, 68> options6{{
    {"client-id", 1},
    {"server-id", 2},
    {"ia-na", 3},
    {"ia-ta", 4},
    {"ia-addr", 5},
    {"oro", 6},
    {"preference", 7},
    {"elapsed-time", 8},
    {"relay-msg", 9},
    {"auth", 11},
    {"unicast", 12},
    {"status-code", 13},
    {"rapid-commit", 14},
    {"user-class", 15},
    {"vendor-class", 16},
    {"vendor-opts", 17},
    {"interface-id", 18},
    {"reconf-msg", 19},
    {"reconf-accept", 20},
    {"sip-servers-names", 21},
    {"sip-servers-addresses", 22},
    {"name-servers", 23},
    {"domain-search", 24},
    {"ia-pd", 25},
    {"ia-prefix", 26},
    {"nis-servers", 27},
    {"nisp-servers", 28},
    {"nis-domain-name", 29},
    {"nisp-domain-name", 30},
    {"sntp-servers", 31},
    {"info-refresh-time", 32},
    {"bcms-server-d", 33},
    {"bcms-server-a", 34},
    {"geoconf-civic", 36},
    {"remote-id", 37},
    {"subscriber-id", 38},
    {"fqdn", 39},
    {"pana-agent", 40},
    {"new-posix-timezone", 41},
    {"new-tzdb-timezone", 42},
    {"ero", 43},
    {"lq-query", 44},
    {"client-data", 45},
    {"clt-time", 46},
    {"lq-relay-data", 47},
    {"lq-client-link", 48},
    {"v6-lost", 51},
    {"capwap-ac-v6", 52},
    {"relay-id", 53},
    {"v6-access-domain", 57},
    {"sip-ua-cs-list", 58},
    {"bootfile-url", 59},
    {"bootfile-param", 60},
    {"client-arch-type", 61},
    {"nii", 62},
    {"aftr-name", 64},
    {"erp-local-domain-name", 65},
    {"rsoo", 66},
    {"rdnss-selection", 74},
    {"client-linklayer-addr", 79},
    {"link-address", 80},
    {"solmax-rt", 82},
    {"inf-max-rt", 83},
    {"dhcpv4-msg", 87},
    {"dhcp4-o-dhcp6-server", 88},
    {"v6-captive-portal", 103},
    {"relay-source-port", 135},
    {"ipv6-address-andsf", 143},
}};

constexpr std::array<Named, 2> spaces6{{
    {"vsio.", 17},
    {"fqdn6", 39},
}};

std::optional<std::uint16_t> codeIn(std::span<const Named> table, std::string_view name) {
    constexpr std::string_view numbered = "unknown-";
    if (name.starts_with(numbered)) {
        return parseNumber<std::uint16_t>(name.substr(numbered.size()));
    }
    const auto found = std::find_if(table.begin(), table.end(),
                                    [&](const Named& known) { return known.name == name; });
    return found == table.end() ? std::nullopt : std::optional{found->code};
}

std::optional<std::uint16_t> codeOfSpace(std::span<const Named> table, std::string_view name) {
    const auto found = std::find_if(table.begin(), table.end(), [&](const Named& known) {
        return name.starts_with(known.name);
    });
    return found == table.end() ? std::nullopt : std::optional{found->code};
}

}  // namespace

std::optional<std::uint16_t> dhclientOptionCode(std::string_view name) noexcept {
    const auto code = codeOfSpace(spaces, name);
    return code ? code : codeIn(options, name);
}

std::optional<std::uint16_t> dhclientOptionCode6(std::string_view name) noexcept {
    return name.starts_with(prefix6) ? codeIn(options6, name.substr(prefix6.size()))
                                     : codeOfSpace(spaces6, name);
}

}  // namespace ZR::Live
