// ifcfg files, which are shell fragments.
#include "configuration/ConfigurationFiles.h"

#include "Input.h"
#include "formats/Assignments.h"
#include "support/Texts.h"

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view text = fuzz::text(data, size);
    const auto assignments = ZR::Live::parseShellAssignments(text);
    std::string again;
    for (const auto& assignment : assignments) {
        again += fuzz::shellLine(assignment.name, assignment.value);
    }
    fuzz::require(ZR::Live::parseShellAssignments(again) == assignments,
                  "assignments survive being written");

    const auto file = ZR::Live::parseIfcfg(text);
    again = fuzz::shellLine("DEVICE", file.device) + fuzz::shellLine("HWADDR", file.hardware) +
            fuzz::shellLine("BOOTPROTO", file.bootProtocol) +
            fuzz::shellLine("DHCPV6C", file.dhcp6 ? "YES" : "no");
    for (const auto& address : file.addresses) {
        fuzz::require(address.isIPv4(), "a fixed address is one of IPv4");
        again += fuzz::shellLine("IPADDR_x", fuzz::textOf(address) + "/24");
    }
    fuzz::require(ZR::Live::parseIfcfg(again) == file, "settings survive being written");
    fuzz::require(!ZR::Live::isIfcfgName(std::string(text) + ".bak"),
                  "left-over files do not count");
    return 0;
}
