#pragma once

#include <cstdint>
#include <string_view>

namespace ZR::Live {

/// The programs whose state is read. One source file each.
enum class Client : std::uint8_t {
    Networkd,
    NetworkManager,
    Wicked,
    Connman,
    Dhclient,
    Dhcpcd,
    Udhcpc,
    Dhcp6c,
    Ipconfig,
    KernelBoot,
    Netplan,
    Ifupdown,
    Ifcfg,
};

/// The name by which people know a program.
[[nodiscard]] std::string_view nameOf(Client client) noexcept;

}  // namespace ZR::Live
