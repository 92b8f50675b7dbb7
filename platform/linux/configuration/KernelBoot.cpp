#include "configuration/ConfigurationFiles.h"

#include <algorithm>
#include <string>
#include <utility>

#include "formats/Files.h"
#include "zrcommon/Strings.h"

namespace ZR::Live {
namespace {

constexpr std::string_view protocolKey = "PROTO:";
constexpr std::string_view serverKey = "bootserver ";

}  // namespace

std::optional<BootResponse> parseKernelBoot(std::string_view text) {
    // The first line is "#DHCP", or "#PROTO: DHCP" of other versions.
    if (!text.starts_with('#')) {
        return std::nullopt;
    }
    text.remove_prefix(1);
    std::string_view protocol = trim(text.substr(0, text.find('\n')));
    if (protocol.starts_with(protocolKey)) {
        protocol = trim(protocol.substr(protocolKey.size()));
    }
    if (protocol != "DHCP" && protocol != "BOOTP") {
        return std::nullopt;
    }
    BootResponse response{.bootp = protocol == "BOOTP", .server = {}, .origin = {}};
    while (!text.empty()) {
        const std::size_t end = std::min(text.find('\n'), text.size());
        const std::string_view line = text.substr(0, end);
        if (line.starts_with(serverKey)) {
            response.server = IpAddress::ipv4FromText(trim(line.substr(serverKey.size())));
        }
        text.remove_prefix(std::min(end + 1, text.size()));
    }
    return response;
}

void readKernelBoot(const Roots& roots, ClientFacts& facts) {
    // Of this thread: namespaces belong to threads, not to processes.
    std::string path = roots.proc + "/thread-self/net/pnp";
    const auto text = readOptionalFile(path, facts.diagnostics);
    facts.boot = parseKernelBoot(text.value_or(""));
    if (facts.boot) {
        facts.boot->origin = std::move(path);
    }
}

}  // namespace ZR::Live
