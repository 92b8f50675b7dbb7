#include "clients/Udhcpc.h"

#include <sys/socket.h>
#include <sys/stat.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <string>
#include <utility>

#include "formats/AddressText.h"
#include "formats/Files.h"
#include "formats/Numbers.h"
#include "formats/OptionWalk.h"
#include "formats/ShellAssignments.h"
#include "kernel/Link.h"

namespace ZR::Live {
namespace {

constexpr std::string_view defaultInterface = "eth0";
constexpr std::string_view stateSuffix = ".state";

// -a takes its number in the same argument only, where it does no harm as letters.
constexpr std::string_view lettersWithValue = "iPsptTAOrFHVxcl";
constexpr std::array<std::string_view, 12> longWithValue{
    "interface", "client-port",    "script",  "pidfile", "retries",     "timeout",
    "tryagain",  "request-option", "request", "fqdn",    "vendorclass", "hostname"};

bool runsOn(const ClientFacts& facts, std::string_view interface) {
    return std::any_of(
        facts.processes.begin(), facts.processes.end(), [&](const ClientProcess& process) {
            return process.client == Client::Udhcpc && !process.ipv6 && process.serves(interface);
        });
}

}  // namespace

std::optional<ClientProcess> parseUdhcpcArguments(std::span<const std::string_view> arguments) {
    const auto nameOfProgram = [&]() -> std::string_view {
        return arguments.empty()
                   ? std::string_view{}
                   : arguments.front().substr(arguments.front().find_last_of('/') + 1);
    };
    if (nameOfProgram() == "busybox") {
        arguments = arguments.subspan(1);
    }
    const std::string_view name = nameOfProgram();
    if (name != "udhcpc" && name != "udhcpc6") {
        return std::nullopt;
    }
    ClientProcess process{.client = Client::Udhcpc,
                          .interfaces = {std::string{defaultInterface}},
                          .leaseFile = {},
                          .ipv6 = name == "udhcpc6"};
    OptionWalk walk{arguments.subspan(1), lettersWithValue, longWithValue};
    for (CommandOption option; walk.next(option);) {
        if ((option.letter == 'i' || option.longName == "interface") &&
            isInterfaceName(option.value)) {
            process.interfaces.front() = option.value;
        }
    }
    return process;
}

void readUdhcpc(const Roots& roots, ClientFacts& facts) {
    const std::string directory = roots.path(udhcpcStateDirectory);
    for (const std::string& name : listOptionalDirectory(directory, facts.complaints)) {
        std::string_view interface { name };
        if (!interface.starts_with(udhcpcStatePrefix) || !interface.ends_with(stateSuffix) ||
            interface.size() < udhcpcStatePrefix.size() + stateSuffix.size()) {
            continue;
        }
        interface.remove_prefix(udhcpcStatePrefix.size());
        interface.remove_suffix(stateSuffix.size());
        std::string path = pathIn(directory, name);
        struct stat status {};
        if (!isInterfaceName(interface) || ::stat(path.c_str(), &status) != 0) {
            continue;
        }
        const auto text = readOptionalFile(path, facts.complaints);
        const auto variables = parseShellAssignments(text.value_or(""));
        const auto lifetime = parseNumber<std::uint32_t>(lastValue(variables, "lease"));
        std::string address = canonicalIPv4(lastValue(variables, "ip"));
        if (address.empty() || !lifetime) {
            continue;
        }
        facts.leases.push_back({.client = Client::Udhcpc,
                                .interfaceName = std::string{interface},
                                .family = AF_INET,
                                .address = std::move(address),
                                .server = canonicalIPv4(lastValue(variables, "serverid")),
                                .clientAlive = runsOn(facts, interface),
                                .expires = *lifetime == UINT32_MAX
                                               ? Lease::never
                                               : status.st_mtim.tv_sec + std::int64_t{*lifetime},
                                .origin = std::move(path)});
    }
}

}  // namespace ZR::Live
