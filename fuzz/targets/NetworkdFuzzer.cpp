// The files of systemd-networkd; those of netplan are of the same form.
#include "clients/Networkd.h"

#include <algorithm>

#include "Input.h"
#include "formats/NetworkFile.h"
#include "formats/NetworkdLease.h"
#include "formats/ValueFormats.h"
#include "support/Texts.h"

namespace {

/// In quotes, of which a reader takes one pair off.
std::string line(const char* key, const std::string& value) {
    return std::string(key) + "=\"" + value + "\"\n";
}

std::string spanOf(std::uint64_t seconds) {
    return seconds == ZR::Live::infiniteTime ? "infinity" : std::to_string(seconds);
}

void checkTimeSpan(std::string_view text) {
    if (const auto seconds = ZR::Live::parseTimeSpan(text)) {
        fuzz::require(ZR::Live::parseTimeSpan(spanOf(*seconds)) == seconds,
                      "a time span survives being written");
    }
}

void checkLink(std::string_view text) {
    const auto link = ZR::Live::parseNetworkdLink(text);
    const std::string again =
        line("ADMIN_STATE", link.adminState) + line("NETWORK_FILE", link.networkFile);
    const auto same = ZR::Live::parseNetworkdLink(again);
    fuzz::require(same.adminState == link.adminState && same.networkFile == link.networkFile,
                  "a link survives being written");
}

void checkLease(std::string_view text) {
    const auto lease = ZR::Live::parseNetworkdLease(text);
    for (const auto& address : {lease.address, lease.server}) {
        fuzz::require(!address || address->isIPv4(), "a lease has IPv4 addresses");
    }
    std::string again = "ADDRESS=" + fuzz::textOf(lease.address) +
                        "\nSERVER_ADDRESS=" + fuzz::textOf(lease.server) + '\n';
    if (lease.lifetime) {
        again += "LIFETIME=" + spanOf(*lease.lifetime) + '\n';
    }
    const auto same = ZR::Live::parseNetworkdLease(again);
    fuzz::require(same.address == lease.address && same.server == lease.server &&
                      same.lifetime == lease.lifetime,
                  "a lease survives being written");
}

void checkNetwork(std::string_view text) {
    ZR::Live::NetworkFile file;
    ZR::Live::applyNetworkFile(text, file);
    std::string again = "[Match]\nName=" + file.matchName + "\n[Network]\nDHCP=";
    again += file.dhcp4 ? (file.dhcp6 ? "yes" : "ipv4") : (file.dhcp6 ? "ipv6" : "no");
    again += std::string("\nLinkLocalAddressing=") + (file.linkLocal4 ? "ipv4" : "no") + '\n';
    for (const auto& address : file.addresses) {
        fuzz::require(address.isIPv4(), "a fixed address is one of IPv4");
        again += "[Address]\nAddress=" + fuzz::textOf(address) + "/24\n";
    }
    ZR::Live::NetworkFile back;
    ZR::Live::applyNetworkFile(again, back);
    fuzz::require(back == file, "the settings of a network survive being written");
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view text = fuzz::text(data, size);
    checkTimeSpan(text);
    checkLink(text);
    checkLease(text);
    checkNetwork(text);
    return 0;
}
