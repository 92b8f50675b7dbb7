#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "facts/ClientFacts.h"
#include "formats/Files.h"
#include "formats/InterfaceName.h"
#include "formats/IpAddress.h"

namespace ZR::Live {

/// Where connman keeps SERVICE/settings.
inline constexpr std::string_view connmanDirectory = "/var/lib/connman";

/// Its configuration.
inline constexpr std::string_view connmanConfigurationDirectory = "/etc/connman";
inline constexpr std::string_view connmanConfigurationFile = "main.conf";

/// The settings of one service that tell where its address comes from.
struct ConnmanSettings {
    bool dhcp4 = false;
    bool autoConnect = false;              ///< connects as soon as it can
    std::optional<IpAddress> lastAddress;  ///< the last one by DHCP

    bool operator==(const ConnmanSettings&) const = default;
};
[[nodiscard]] ConnmanSettings parseConnmanSettings(std::string_view text);

/// The hardware address in the name of a service of a cable, as Link::hardwareAddress;
/// empty for other services.
[[nodiscard]] std::string connmanHardwareAddress(std::string_view service);

/// The links that a connmand was told on its command line, whose arguments have a NUL each
/// behind them, to take and to leave alone.
[[nodiscard]] NamePatterns connmanLinks(std::string_view commandLine);

/// Adds, while connman runs, the addresses that it got by DHCP, and the links without a cable
/// on which it uses DHCP as soon as they have one: of those its bus lists no service. Its
/// files name neither link nor server, and stay as they are when it ends. Needs the processes
/// to be in the facts.
void readConnman(const Roots& roots, ClientFacts& facts);

}  // namespace ZR::Live
