#include "clients/Ipconfig.h"

#include <sys/stat.h>

#include <utility>

#include "formats/Files.h"
#include "formats/Numbers.h"
#include "formats/ShellAssignments.h"

namespace ZR::Live {
namespace {

constexpr std::string_view suffix = ".conf";

/// 0.0.0.0 stands for no address.
std::optional<IpAddress> addressOrNone(std::string_view text) {
    const auto address = IpAddress::ipv4FromText(text);
    return address && address->isUnspecified() ? std::nullopt : address;
}

}  // namespace

IpconfigResult parseIpconfig(std::string_view text) {
    const auto variables = parseShellAssignments(text);
    IpconfigResult result;
    result.interfaceName = InterfaceName::from(lastValue(variables, "DEVICE"));
    std::string_view protocol = lastValue(variables, "PROTO");
    if (protocol.empty()) {
        protocol = lastValue(variables, "IPV4PROTO");  // so called since klibc 2.0.8
    }
    if (protocol == "dhcp") {
        result.protocol = IpconfigResult::Protocol::Dhcp;
    } else if (protocol == "bootp") {
        result.protocol = IpconfigResult::Protocol::Bootp;
    }
    result.address = addressOrNone(lastValue(variables, "IPV4ADDR"));
    result.server = addressOrNone(lastValue(variables, "ROOTSERVER"));
    result.leaseTime =
        parseNumber<std::uint32_t>(lastValue(variables, "DHCPLEASETIME")).value_or(0);
    return result;
}

void readIpconfig(const Roots& roots, ClientFacts& facts) {
    const std::string directory = roots.path(ipconfigDirectory);
    for (const std::string& name : listOptionalDirectory(directory, facts.diagnostics)) {
        struct stat status {};
        std::string path = pathIn(directory, name);
        if (!name.starts_with(ipconfigPrefix) || !name.ends_with(suffix) ||
            ::stat(path.c_str(), &status) != 0) {
            continue;
        }
        const IpconfigResult result =
            parseIpconfig(readOptionalFile(path, facts.diagnostics).value_or(""));
        if (!result.interfaceName || !result.address ||
            result.protocol == IpconfigResult::Protocol::Other) {
            continue;
        }
        const bool endless = result.leaseTime == 0 || result.leaseTime == UINT32_MAX;
        facts.leases.push_back(
            {.client = Client::Ipconfig,
             .interfaceName = result.interfaceName,
             .address = *result.address,
             .server = result.server,
             .bootp = result.protocol == IpconfigResult::Protocol::Bootp,
             .expires =
                 endless ? Lease::never : status.st_mtim.tv_sec + std::int64_t{result.leaseTime},
             .outlivesEnd = true,
             .origin = std::move(path)});
    }
}

}  // namespace ZR::Live
