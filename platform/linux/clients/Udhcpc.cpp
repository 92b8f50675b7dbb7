#include "clients/Udhcpc.h"

#include <sys/stat.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <string>
#include <utility>

#include "formats/Files.h"
#include "formats/Numbers.h"
#include "formats/OptionWalk.h"
#include "formats/ShellAssignments.h"

namespace ZR::Live {
namespace {

InterfaceName defaultInterface() {
    return *InterfaceName::from("eth0");
}

constexpr std::string_view stateSuffix = ".state";

// -a takes its number in the same argument only, where it does no harm as letters.
constexpr std::string_view lettersWithValue = "iPsptTAOrFHVxcl";
constexpr std::array<std::string_view, 12> longWithValue{
    "interface", "client-port",    "script",  "pidfile", "retries",     "timeout",
    "tryagain",  "request-option", "request", "fqdn",    "vendorclass", "hostname"};

bool runsOn(const ClientFacts& facts, const InterfaceName& interface) {
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
                          .interfaces = {defaultInterface()},
                          .leaseFile = {},
                          .ipv6 = name == "udhcpc6"};
    OptionWalk walk{arguments.subspan(1), lettersWithValue, longWithValue};
    for (CommandOption option; walk.next(option);) {
        const auto interface = InterfaceName::from(option.value);
        if ((option.letter == 'i' || option.longName == "interface") && interface) {
            process.interfaces.front() = *interface;
        }
    }
    return process;
}

void readUdhcpc(const Roots& roots, ClientFacts& facts) {
    const std::string directory = roots.path(udhcpcStateDirectory);
    for (const std::string& name : listOptionalDirectory(directory, facts.diagnostics)) {
        std::string_view stem{name};
        if (!stem.starts_with(udhcpcStatePrefix) || !stem.ends_with(stateSuffix) ||
            stem.size() < udhcpcStatePrefix.size() + stateSuffix.size()) {
            continue;
        }
        stem.remove_prefix(udhcpcStatePrefix.size());
        stem.remove_suffix(stateSuffix.size());
        const auto interface = InterfaceName::from(stem);
        std::string path = pathIn(directory, name);
        struct stat status {};
        if (!interface || ::stat(path.c_str(), &status) != 0) {
            continue;
        }
        const auto text = readOptionalFile(path, facts.diagnostics);
        const auto variables = parseShellAssignments(text.value_or(""));
        const auto lifetime = parseNumber<std::uint32_t>(lastValue(variables, "lease"));
        const auto address = IpAddress::ipv4FromText(lastValue(variables, "ip"));
        if (!address || !lifetime) {
            continue;
        }
        facts.leases.push_back({.client = Client::Udhcpc,
                                .interfaceName = interface,
                                .address = *address,
                                .server = IpAddress::ipv4FromText(lastValue(variables, "serverid")),
                                .clientAlive = runsOn(facts, *interface),
                                .expires = *lifetime == UINT32_MAX
                                               ? Lease::never
                                               : status.st_mtim.tv_sec + std::int64_t{*lifetime},
                                .origin = std::move(path)});
    }
}

}  // namespace ZR::Live
