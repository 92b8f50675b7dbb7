#include "formats/OptionNames.h"

#include <algorithm>
#include <array>
#include <span>

namespace ZR::Live {
namespace {

struct OptionName {
    std::string_view name;
    std::uint16_t code;
};
constexpr std::array<OptionName, 37> names4{{
    {"subnet_mask", 1},
    {"time_offset", 2},
    {"routers", 3},
    {"time_servers", 4},
    {"domain_name_servers", 6},
    {"log_servers", 7},
    {"lpr_servers", 9},
    {"host_name", 12},
    {"domain_name", 15},
    {"root_path", 17},
    {"interface_mtu", 26},
    {"broadcast_address", 28},
    {"static_routes", 33},
    {"nis_domain", 40},
    {"nis_servers", 41},
    {"ntp_servers", 42},
    {"vendor_encapsulated_options", 43},
    {"netbios_name_servers", 44},
    {"netbios_dd_server", 45},
    {"netbios_node_type", 46},
    {"netbios_scope", 47},
    {"dhcp_lease_time", 51},
    {"dhcp_option_overload", 52},
    {"dhcp_message_type", 53},
    {"dhcp_server_identifier", 54},
    {"dhcp_message", 56},
    {"dhcp_renewal_time", 58},
    {"dhcp_rebinding_time", 59},
    {"vendor_class_identifier", 60},
    {"tftp_server_name", 66},
    {"bootfile_name", 67},
    {"fqdn", 81},
    {"domain_search", 119},
    {"rfc3442_classless_static_routes", 121},
    {"ms_classless_static_routes", 249},
    {"wpad", 252},
    {"private_proxy_autodiscovery", 252},
}};
constexpr std::array<OptionName, 12> names6{{
    {"dhcp6_client_id", 1},
    {"dhcp6_server_id", 2},
    {"iaid", 3},  // of the association (IA_NA)
    {"dhcp6_preference", 7},
    {"dhcp6_status_code", 13},
    {"dhcp6_rapid_commit", 14},
    {"dhcp6_name_servers", 23},
    {"dhcp6_domain_search", 24},
    {"dhcp6_sntp_servers", 31},
    {"dhcp6_fqdn", 39},
    {"fqdn_fqdn", 39},
    {"dhcp6_ntp_servers", 56},
}};

std::optional<std::uint16_t> find(std::span<const OptionName> names,
                                  std::string_view name) noexcept {
    const auto same = [](char one, char other) {
        return one == other || (one == '_' && other == '-');
    };
    const auto found = std::find_if(names.begin(), names.end(), [&](const OptionName& known) {
        return std::equal(known.name.begin(), known.name.end(), name.begin(), name.end(), same);
    });
    return found == names.end() ? std::nullopt : std::optional{found->code};
}

}  // namespace

std::optional<std::uint16_t> optionCode4(std::string_view name) noexcept {
    return find(names4, name);
}

std::optional<std::uint16_t> optionCode6(std::string_view name) noexcept {
    return find(names6, name);
}

}  // namespace ZR::Live
