#include "formats/NetworkFile.h"

#include <algorithm>
#include <array>
#include <optional>

#include "formats/Assignments.h"

namespace ZR::Live {
namespace {

/// Whether a value is a spelling of true, of false, or of neither.
std::optional<bool> truth(std::string_view value) {
    std::string lower{value};
    std::transform(lower.begin(), lower.end(), lower.begin(), [](char letter) {
        return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter - 'A' + 'a') : letter;
    });
    constexpr std::array<std::string_view, 6> yes{"1", "yes", "y", "true", "t", "on"};
    constexpr std::array<std::string_view, 6> no{"0", "no", "n", "false", "f", "off"};
    if (std::find(yes.begin(), yes.end(), lower) != yes.end()) {
        return true;
    }
    if (std::find(no.begin(), no.end(), lower) != no.end()) {
        return false;
    }
    return std::nullopt;
}

void applyDhcp(std::string_view value, NetworkFile& settings) {
    if (const auto both = truth(value)) {
        settings.dhcp4 = settings.dhcp6 = *both;
    } else if (value == "both") {
        settings.dhcp4 = settings.dhcp6 = true;
    } else if (value == "none") {
        settings.dhcp4 = settings.dhcp6 = false;
    } else if (value == "ipv4" || value == "v4") {
        settings.dhcp4 = true;
        settings.dhcp6 = false;
    } else if (value == "ipv6" || value == "v6") {
        settings.dhcp4 = false;
        settings.dhcp6 = true;
    }
    // Like networkd, keeps what it had when it does not know a value.
}

void applyAddress(std::string_view section, std::string_view value, NetworkFile& settings) {
    if (value.empty()) {
        if (section == "Network") {
            settings.addresses.clear();
        }
        return;
    }
    if (const auto address = IpAddress::ipv4FromText(value)) {
        settings.addresses.push_back(*address);
    }
}

void applySetting(std::string_view section, std::string_view key, std::string_view value,
                  NetworkFile& settings) {
    if (section == "Match" && key == "Name") {
        settings.matchName = value;
    } else if (key == "Address" && (section == "Network" || section == "Address")) {
        applyAddress(section, value, settings);
    } else if (section != "Network") {
        return;
    } else if (key == "DHCP") {
        applyDhcp(value, settings);
    } else if (key == "LinkLocalAddressing") {
        settings.linkLocal4 = value == "ipv4" || truth(value).value_or(false);
    }
}

}  // namespace

void applyNetworkFile(std::string_view text, NetworkFile& settings) {
    forEachKey(text, [&](std::string_view section, std::string_view key, std::string_view value) {
        applySetting(section, key, value, settings);
    });
}

}  // namespace ZR::Live
