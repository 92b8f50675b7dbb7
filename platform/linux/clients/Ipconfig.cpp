#include "clients/Ipconfig.h"

#include <sys/stat.h>

#include <cstddef>
#include <string>
#include <vector>

#include "formats/Assignments.h"
#include "formats/Files.h"
#include "formats/Trust.h"
#include "formats/ValueFormats.h"

namespace ZR::Live {
namespace {

constexpr std::string_view suffix = ".conf";

/// 0.0.0.0 stands for no address.
std::optional<IpAddress> addressOrNone(std::string_view text) {
    const auto address = IpAddress::ipv4FromText(text);
    return address && address->isUnspecified() ? std::nullopt : address;
}

/// When the system started, in seconds since the epoch, by the clock of now.
std::optional<std::int64_t> startOfSystem(const Roots& roots,
                                          std::vector<Diagnostic>& diagnostics) {
    constexpr std::string_view key = "\nbtime ";
    const auto text = readOptionalFile(roots.proc + "/stat", diagnostics);
    const std::size_t start = text ? text->find(key) : std::string::npos;
    if (start == std::string::npos) {
        return std::nullopt;
    }
    const std::string_view value = std::string_view{*text}.substr(start + key.size());
    return parseNumber<std::int64_t>(value.substr(0, value.find('\n')));
}

void readResult(const Roots& roots, const std::string& path, ClientFacts& facts) {
    struct stat status {};
    if (!isTrusted(path, {}, facts.diagnostics) || ::stat(path.c_str(), &status) != 0) {
        return;
    }
    const auto text = readOptionalFile(path, facts.diagnostics);
    if (!text) {
        return;
    }
    const IpconfigResult result = parseIpconfig(*text);
    if (!result.interfaceName) {
        facts.diagnostics.emplace_back(path + ": \"DEVICE\" is not the name of an interface",
                                       Diagnostic::Kind::Damaged);
        return;
    }
    if (!result.address || result.protocol == IpconfigResult::Protocol::Other) {
        return;
    }
    // Without the time since the start, the file is as old as the lease.
    std::int64_t obtained = status.st_mtim.tv_sec;
    if (const auto start = result.uptime ? startOfSystem(roots, facts.diagnostics) : std::nullopt) {
        obtained = *start + *result.uptime;
    }
    const bool endless = result.leaseTime == 0 || result.leaseTime == UINT32_MAX;
    facts.leases.push_back({.client = Client::Ipconfig,
                            .interfaceName = result.interfaceName,
                            .address = *result.address,
                            .server = result.server,
                            .bootp = result.protocol == IpconfigResult::Protocol::Bootp,
                            .expires = endless ? Lease::never : obtained + result.leaseTime,
                            .obtained = obtained,
                            .outlivesEnd = true,
                            .origin = path});
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
    result.uptime = parseNumber<std::uint32_t>(lastValue(variables, "UPTIME"));
    return result;
}

void readIpconfig(const Roots& roots, ClientFacts& facts) {
    const std::string directory = roots.path(ipconfigDirectory);
    for (const std::string& name : listOptionalDirectory(directory, facts.diagnostics)) {
        if (name.starts_with(ipconfigPrefix) && name.ends_with(suffix)) {
            readResult(roots, pathIn(directory, name), facts);
        }
    }
}

}  // namespace ZR::Live
