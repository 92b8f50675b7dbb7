#include "clients/DhcpcdSettings.h"

#include <fnmatch.h>

#include <algorithm>
#include <cstddef>

#include "zrcommon/Strings.h"

namespace ZR::Live {
namespace {

void addPatterns(std::string_view list, std::vector<std::string>& patterns) {
    while (!list.empty()) {
        const std::size_t end = std::min(list.find_first_of(" \t,"), list.size());
        if (end != 0) {
            patterns.emplace_back(list.substr(0, end));
        }
        list.remove_prefix(std::min(end + 1, list.size()));
    }
}

bool matchesAny(const std::vector<std::string>& patterns, const InterfaceName& interface) {
    const std::string name{interface.view()};
    return std::any_of(patterns.begin(), patterns.end(), [&](const std::string& pattern) {
        return ::fnmatch(pattern.c_str(), name.c_str(), 0) == 0;
    });
}

}  // namespace

void DhcpcdSettings::take(std::string_view option, std::string_view value) {
    constexpr std::string_view addressSetting = "ip_address=";
    if (option == "ipv4only") {
        ipv4 = true;
        ipv6 = false;
    } else if (option == "ipv6only") {
        ipv4 = false;
        ipv6 = true;
    } else if (option == "ipv4" || option == "noipv4") {
        ipv4 = option == "ipv4";
    } else if (option == "ipv6" || option == "noipv6") {
        ipv6 = option == "ipv6";
    } else if (option == "dhcp" || option == "nodhcp") {
        dhcp4 = option == "dhcp";
    } else if (option == "dhcp6" || option == "nodhcp6") {
        dhcp6 = option == "dhcp6";
    } else if (option == "static" && value.starts_with(addressSetting)) {
        address = IpAddress::ipv4FromText(trim(value.substr(addressSetting.size())));
        isStatic = true;
        inform = false;
    } else if (option == "inform") {
        address = IpAddress::ipv4FromText(trim(value));
        isStatic = false;
        inform = true;
    } else if (option == "allowinterfaces") {
        addPatterns(value, allowed);
    } else if (option == "denyinterfaces") {
        addPatterns(value, denied);
    }
}

bool DhcpcdSettings::admits(const InterfaceName& interface) const {
    return !matchesAny(denied, interface) && (allowed.empty() || matchesAny(allowed, interface));
}

void applyDhcpcdConf(std::string_view text, const InterfaceName& interface,
                     DhcpcdSettings& settings) {
    bool concerns = true;
    while (!text.empty()) {
        const std::size_t end = std::min(text.find('\n'), text.size());
        std::string_view line = trim(text.substr(0, end));
        text.remove_prefix(std::min(end + 1, text.size()));
        if (line.empty() || line.starts_with('#') || line.starts_with(';')) {
            continue;
        }
        const std::string_view option = nextWord(line);
        const std::string_view value = trim(line);
        // Each begins a block, which ends where the next one begins.
        if (option == "interface") {
            concerns = value == interface.view();
        } else if (option == "ssid" || option == "profile") {
            concerns = false;
        } else if (concerns) {
            settings.take(option, value);
        }
    }
}

}  // namespace ZR::Live
