#include "clients/Udhcpc.h"

#include <sys/stat.h>
#include <sys/types.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "formats/Assignments.h"
#include "formats/Files.h"
#include "formats/OptionWalk.h"
#include "formats/Trust.h"
#include "formats/ValueFormats.h"
#include "zrcommon/Strings.h"

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

/// Under which names a script is given the options that came. Those that it is not told of
/// by name are "opt" and their number.
struct NamedOption {
    std::string_view name;
    std::uint16_t code;
};
constexpr std::array<NamedOption, 39> namedOptions{{
    {"subnet", 1},         {"timezone", 2},         {"router", 3},
    {"timesrv", 4},        {"namesrv", 5},          {"dns", 6},
    {"logsrv", 7},         {"cookiesrv", 8},        {"lprsrv", 9},
    {"hostname", 12},      {"bootsize", 13},        {"domain", 15},
    {"swapsrv", 16},       {"rootpath", 17},        {"ipttl", 23},
    {"mtu", 26},           {"broadcast", 28},       {"routes", 33},
    {"nisdomain", 40},     {"nissrv", 41},          {"ntpsrv", 42},
    {"wins", 44},          {"requestip", 50},       {"lease", 51},
    {"dhcptype", 53},      {"serverid", 54},        {"message", 56},
    {"tftp", 66},          {"bootfile", 67},        {"tzstr", 100},
    {"tzdbstr", 101},      {"search", 119},         {"sipsrv", 120},
    {"staticroutes", 121}, {"vlanid", 132},         {"vlanpriority", 133},
    {"ip6rd", 212},        {"msstaticroutes", 249}, {"wpad", 252},
}};

std::optional<std::uint16_t> codeOf(std::string_view name) {
    constexpr std::string_view numbered = "opt";
    if (name.starts_with(numbered)) {
        return parseNumber<std::uint8_t>(name.substr(numbered.size()));
    }
    const auto* const found =
        std::find_if(namedOptions.begin(), namedOptions.end(),
                     [&](const NamedOption& known) { return known.name == name; });
    return found == namedOptions.end() ? std::nullopt : std::optional{found->code};
}

std::vector<std::uint16_t> codesOf(std::string_view names) {
    std::vector<std::uint16_t> codes;
    while (!names.empty()) {
        const auto code = codeOf(nextWord(names, " \t\n"));
        if (code && std::find(codes.begin(), codes.end(), *code) == codes.end()) {
            codes.push_back(*code);
        }
    }
    return codes;
}

/// The client whose script writes the file of an interface; nullptr when it does not run.
const ClientProcess* clientOf(const ClientFacts& facts, const InterfaceName& interface) {
    const auto found = std::find_if(
        facts.processes.begin(), facts.processes.end(), [&](const ClientProcess& process) {
            return process.client == Client::Udhcpc && !process.ipv6 && process.serves(interface);
        });
    return found == facts.processes.end() ? nullptr : &*found;
}

void readState(const std::string& path, const InterfaceName& interface, ClientFacts& facts) {
    const ClientProcess* const client = clientOf(facts, interface);
    std::vector<uid_t> writers;
    if (client != nullptr) {
        writers.push_back(client->user);
    }
    struct stat status {};
    if (!isTrusted(path, writers, facts.diagnostics) || ::stat(path.c_str(), &status) != 0) {
        return;
    }
    const auto text = readOptionalFile(path, facts.diagnostics);
    if (!text || text->empty()) {
        return;  // an empty file is about to be written
    }
    const auto variables = parseShellAssignments(*text);
    const auto lifetime = parseNumber<std::uint32_t>(lastValue(variables, "lease"));
    const auto address = IpAddress::ipv4FromText(lastValue(variables, "ip"));
    if (!address || !lifetime) {
        facts.diagnostics.emplace_back(path + (address ? ": \"lease\" is not a number of seconds"
                                                       : ": \"ip\" is not an IPv4 address"),
                                       Diagnostic::Kind::Damaged);
        return;
    }
    // Files of older scripts do not tell the time: they are as old as the lease.
    const std::int64_t obtained =
        parseNumber<std::int64_t>(lastValue(variables, "obtained")).value_or(status.st_mtim.tv_sec);
    const bool endless = *lifetime == UINT32_MAX || obtained > Lease::never - UINT32_MAX;
    facts.leases.push_back({.client = Client::Udhcpc,
                            .interfaceName = interface,
                            .address = *address,
                            .server = IpAddress::ipv4FromText(lastValue(variables, "serverid")),
                            .clientAlive = client != nullptr,
                            .expires = endless ? Lease::never : obtained + *lifetime,
                            .obtained = obtained,
                            .options = codesOf(lastValue(variables, "options")),
                            .pid = client == nullptr ? 0 : client->pid,
                            .origin = path});
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
        if (const auto interface = InterfaceName::from(stem)) {
            readState(pathIn(directory, name), *interface, facts);
        }
    }
}

}  // namespace ZR::Live
