#include "clients/Dhcpcd.h"

#include <sys/stat.h>

#include <algorithm>
#include <cstdint>
#include <utility>
#include <variant>

#include "formats/DhcpPacket.h"
#include "formats/Files.h"
#include "formats/OptionWalk.h"

namespace ZR::Live {
namespace {

constexpr std::string_view titlePrefix = "dhcpcd: ";
constexpr std::string_view lettersWithValue = "cCeEfFhiIjlmoOQrsStuvWXyzZ";
constexpr std::array<std::string_view, 24> longWithValue{
    "script",    "env",    "config",          "hostname",       "vendorclassid", "logfile",
    "leasetime", "metric", "option",          "nooption",       "require",       "request",
    "inform",    "static", "timeout",         "userclass",      "vendor",        "whitelist",
    "blacklist", "reboot", "allowinterfaces", "denyinterfaces", "nohook",        "clientid"};

// Commands to a running dhcpcd, and requests for information: such a process is not a
// client.
constexpr std::string_view commandLetters = "gknNPUVx";
constexpr std::array<std::string_view, 8> longCommands{
    "reconfigure", "release", "rebind", "renew", "printpidfile", "dumplease", "variables", "exit"};

bool isCommand(const CommandOption& option) {
    return (option.letter != '\0' &&
            commandLetters.find(option.letter) != std::string_view::npos) ||
           std::find(longCommands.begin(), longCommands.end(), option.longName) !=
               longCommands.end();
}

std::optional<ClientProcess> parseTitle(std::string_view title) {
    title.remove_prefix(titlePrefix.size());
    ClientProcess process{.client = Client::Dhcpcd, .interfaces = {}, .leaseFile = {}};
    const std::string_view subject = title.substr(0, title.find(' '));
    // "[master]" up to version 9.4.0, "[manager]" since: all links.
    if (const auto name = InterfaceName::from(subject); name && !subject.starts_with('[')) {
        process.interfaces.push_back(*name);
    } else if (!subject.starts_with("[manager]") && !subject.starts_with("[master]")) {
        return std::nullopt;
    }
    const bool ipv4 = title.find("[ip4]") != std::string_view::npos;
    const bool ipv6 = title.find("[ip6]") != std::string_view::npos;
    process.ipv6 = ipv6 && !ipv4;
    return process;
}

std::span<const std::byte> bytesOf(const std::string& content) {
    return std::as_bytes(std::span{content});
}

std::int64_t end(std::int64_t start, std::uint32_t lifetime) {
    return lifetime == UINT32_MAX ? Lease::never : start + lifetime;
}

/// One file: the packet, and when it came.
struct LeaseFile {
    std::string path;
    std::int64_t written = 0;  // epoch seconds
    std::vector<InterfaceName> interfaces;
};

class Reader {
  public:
    explicit Reader(ClientFacts& facts) : facts_(facts) {}

    void readFile(const LeaseFile& file, bool ipv6) {
        // The file is rewritten in place: a reading may find half of it. The other half
        // follows at once.
        std::optional<std::string_view> reason;
        for (int attempt = 0; attempt < 2; ++attempt) {
            const auto content = readOptionalFile(file.path, facts_.diagnostics);
            if (!content || content->empty()) {
                return;
            }
            reason = ipv6 ? take6(file, *content) : take4(file, *content);
            if (!reason) {
                return;
            }
        }
        facts_.diagnostics.emplace_back("cannot use " + file.path + ": " + std::string{*reason});
    }

  private:
    std::optional<std::string_view> take4(const LeaseFile& file, const std::string& content) {
        auto parsed = parseDhcpReply(bytesOf(content));
        if (const auto* const reason = std::get_if<std::string_view>(&parsed)) {
            return *reason;
        }
        const auto& reply = std::get<DhcpReply>(parsed);
        // A BOOTP reply has no lease time: the address is for ever (RFC 951). A DHCP reply
        // without one is that to a DHCPINFORM, which gives settings and no address.
        if (reply.address && (reply.leaseTime || reply.bootp)) {
            Lease lease{.client = Client::Dhcpcd,
                        .interfaceName = {},
                        .address = *reply.address,
                        .server = reply.server,
                        .bootp = reply.bootp,
                        .expires = end(file.written, reply.leaseTime.value_or(UINT32_MAX)),
                        .origin = file.path};
            addForEach(file, std::move(lease));
        }
        return std::nullopt;
    }

    std::optional<std::string_view> take6(const LeaseFile& file, const std::string& content) {
        auto parsed = parseDhcp6Reply(bytesOf(content));
        if (const auto* const reason = std::get_if<std::string_view>(&parsed)) {
            return *reason;
        }
        for (const Dhcp6Address& address : std::get<Dhcp6Reply>(parsed).addresses) {
            Lease lease{.client = Client::Dhcpcd,
                        .interfaceName = {},
                        .address = address.address,
                        .server = {},
                        .expires = end(file.written, address.validLifetime),
                        .origin = file.path};
            addForEach(file, std::move(lease));
        }
        return std::nullopt;
    }

    /// The kernel's addresses tell which of the interfaces is meant.
    void addForEach(const LeaseFile& file, Lease&& lease) {
        for (const InterfaceName& interface : file.interfaces) {
            lease.interfaceName = interface;
            lease.clientAlive = runsOn(interface);
            facts_.leases.push_back(lease);
        }
    }

    [[nodiscard]] bool runsOn(const InterfaceName& interface) const {
        return std::any_of(facts_.processes.begin(), facts_.processes.end(),
                           [&](const ClientProcess& process) {
                               return process.client == Client::Dhcpcd && process.serves(interface);
                           });
    }

    ClientFacts& facts_;
};

}  // namespace

std::optional<ClientProcess> parseDhcpcdArguments(std::span<const std::string_view> arguments) {
    if (arguments.empty()) {
        return std::nullopt;
    }
    if (arguments.front().starts_with(titlePrefix)) {
        return parseTitle(arguments.front());
    }
    ClientProcess process{.client = Client::Dhcpcd, .interfaces = {}, .leaseFile = {}};
    OptionWalk walk{arguments.subspan(1), lettersWithValue, longWithValue};
    for (CommandOption option; walk.next(option);) {
        if (isCommand(option)) {
            return std::nullopt;
        }
        const auto name = InterfaceName::from(option.value);
        if (option.isOperand() && name) {
            process.interfaces.push_back(*name);
        } else if (option.letter == '6' || option.longName == "ipv6only") {
            process.ipv6 = true;
        }
    }
    return process;
}

std::vector<InterfaceName> dhcpcdInterfaces(std::string_view stem) {
    std::vector<InterfaceName> interfaces;
    for (std::size_t length = stem.size(); length != 0 && length != std::string_view::npos;
         length = stem.rfind('-', length - 1)) {
        if (const auto name = InterfaceName::from(stem.substr(0, length))) {
            interfaces.push_back(*name);
        }
    }
    return interfaces;
}

void readDhcpcd(const Roots& roots, ClientFacts& facts) {
    Reader reader{facts};
    for (const DhcpcdDirectory& place : dhcpcdDirectories) {
        const std::string directory = roots.path(place.path);
        for (const std::string& name : listOptionalDirectory(directory, facts.diagnostics)) {
            std::string_view stem{name};
            const bool ipv6 = stem.ends_with(".lease6");
            if (!stem.starts_with(place.namePrefix) || (!ipv6 && !stem.ends_with(".lease"))) {
                continue;
            }
            stem.remove_prefix(place.namePrefix.size());
            stem = stem.substr(0, stem.rfind('.'));
            LeaseFile file{.path = pathIn(directory, name), .interfaces = dhcpcdInterfaces(stem)};
            struct stat status {};
            if (::stat(file.path.c_str(), &status) == 0) {  // else it is gone meanwhile
                file.written = status.st_mtim.tv_sec;
                reader.readFile(file, ipv6);
            }
        }
    }
}

}  // namespace ZR::Live
