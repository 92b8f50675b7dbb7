#include "clients/DhcpcdCommand.h"

#include <algorithm>
#include <array>
#include <utility>

#include "formats/OptionWalk.h"
#include "zrcommon/Strings.h"

namespace ZR::Live {
namespace {

using Role = DhcpcdTitle::Role;

constexpr std::string_view titlePrefix = "dhcpcd: ";
// "[master]" up to version 9.4.0, "[manager]" since: all links.
constexpr std::array<std::string_view, 2> allLinks{"[manager]", "[master]"};
constexpr std::array<std::pair<std::string_view, Role>, 4> helpers{{
    {"[privileged proxy]", Role::Proxy},
    {"[BPF BOOTP]", Role::Asking},
    {"[BPF ARP]", Role::Defends},
    {"[network proxy]", Role::Listens},
}};

constexpr std::string_view lettersWithValue = "cCeEfFhiIjlmoOQrsStuvWXyzZ";
constexpr std::array<std::string_view, 23> longWithValue{
    "script",         "env",       "config",    "hostname", "vendorclassid",
    "logfile",        "leasetime", "metric",    "option",   "nooption",
    "require",        "request",   "static",    "timeout",  "userclass",
    "vendor",         "whitelist", "blacklist", "reboot",   "allowinterfaces",
    "denyinterfaces", "nohook",    "clientid"};

// Commands to a running dhcpcd, and requests for information: such a process is not a
// client.
constexpr std::string_view commandLetters = "gknNPTUVx";
constexpr std::array<std::string_view, 9> longCommands{"reconfigure", "release",      "rebind",
                                                       "renew",       "printpidfile", "test",
                                                       "dumplease",   "variables",    "exit"};

constexpr std::array<std::pair<char, std::string_view>, 7> longNames{{
    {'4', "ipv4only"},
    {'6', "ipv6only"},
    {'f', "config"},
    {'s', "inform"},
    {'S', "static"},
    {'z', "allowinterfaces"},
    {'Z', "denyinterfaces"},
}};

bool isCommand(const CommandOption& option) {
    return (option.letter != '\0' &&
            commandLetters.find(option.letter) != std::string_view::npos) ||
           std::find(longCommands.begin(), longCommands.end(), option.longName) !=
               longCommands.end();
}

std::string_view longNameOf(const CommandOption& option) {
    const auto* const found =
        std::find_if(longNames.begin(), longNames.end(),
                     [&](const auto& known) { return known.first == option.letter; });
    return found == longNames.end() ? option.longName : found->second;
}

std::optional<InterfaceName> nameIn(std::string_view word) {
    return word.starts_with('[') ? std::nullopt : InterfaceName::from(word);
}

DhcpcdTitle helperTitle(Role role, std::string_view rest) {
    DhcpcdTitle title{.role = role};
    if (role == Role::Listens) {
        title.address = IpAddress::ipv4FromText(nextWord(rest));
        return title;
    }
    title.interface = nameIn(nextWord(rest));
    if (role == Role::Defends) {
        title.address = IpAddress::ipv4FromText(nextWord(rest));
    }
    return title;
}

}  // namespace

std::optional<DhcpcdTitle> parseDhcpcdTitle(std::string_view text) {
    if (!text.starts_with(titlePrefix)) {
        return std::nullopt;
    }
    text.remove_prefix(titlePrefix.size());
    for (const auto& [name, role] : helpers) {
        if (text.starts_with(name)) {
            return helperTitle(role, text.substr(name.size()));
        }
    }
    DhcpcdTitle title{.ipv4 = text.find("[ip4]") != std::string_view::npos,
                      .ipv6 = text.find("[ip6]") != std::string_view::npos};
    const std::string_view subject = nextWord(text);
    title.interface = nameIn(subject);
    if (title.interface || std::find(allLinks.begin(), allLinks.end(), subject) != allLinks.end()) {
        title.role = Role::Main;
    }
    return title;
}

std::optional<DhcpcdCommand> parseDhcpcdCommand(std::span<const std::string_view> arguments) {
    if (arguments.empty()) {
        return std::nullopt;
    }
    DhcpcdCommand command;
    OptionWalk walk{arguments.subspan(1), lettersWithValue, longWithValue};
    for (CommandOption option; walk.next(option);) {
        if (isCommand(option)) {
            return std::nullopt;
        }
        const std::string_view name = longNameOf(option);
        if (!option.isOperand()) {
            if (name == "config") {
                command.configuration = option.value;
            }
            command.settings.take(name, option.value);
        } else if (const auto interface = InterfaceName::from(option.value)) {
            command.interfaces.push_back(*interface);
        }
    }
    return command;
}

}  // namespace ZR::Live
