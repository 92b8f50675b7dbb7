#include "clients/Ipconfig.h"

#include <sys/socket.h>
#include <sys/stat.h>

#include <utility>

#include "formats/AddressText.h"
#include "formats/Files.h"
#include "formats/Numbers.h"
#include "formats/ShellAssignments.h"
#include "kernel/Link.h"

namespace ZR::Live {
namespace {

constexpr std::string_view suffix = ".conf";
constexpr std::string_view noAddress = "0.0.0.0";

std::string addressOrNone(std::string_view text) {
    std::string address = canonicalIPv4(text);
    return address == noAddress ? std::string{} : address;
}

}  // namespace

IpconfigResult parseIpconfig(std::string_view text) {
    const auto variables = parseShellAssignments(text);
    IpconfigResult result;
    result.interfaceName = lastValue(variables, "DEVICE");
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
    for (const std::string& name : listOptionalDirectory(directory, facts.complaints)) {
        struct stat status {};
        std::string path = pathIn(directory, name);
        if (!name.starts_with(ipconfigPrefix) || !name.ends_with(suffix) ||
            ::stat(path.c_str(), &status) != 0) {
            continue;
        }
        IpconfigResult result =
            parseIpconfig(readOptionalFile(path, facts.complaints).value_or(""));
        if (!isInterfaceName(result.interfaceName) || result.address.empty() ||
            result.protocol == IpconfigResult::Protocol::Other) {
            continue;
        }
        const bool endless = result.leaseTime == 0 || result.leaseTime == UINT32_MAX;
        facts.leases.push_back(
            {.client = Client::Ipconfig,
             .interfaceName = std::move(result.interfaceName),
             .family = AF_INET,
             .address = std::move(result.address),
             .server = std::move(result.server),
             .bootp = result.protocol == IpconfigResult::Protocol::Bootp,
             .expires =
                 endless ? Lease::never : status.st_mtim.tv_sec + std::int64_t{result.leaseTime},
             .outlivesEnd = true,
             .origin = std::move(path)});
    }
}

}  // namespace ZR::Live
