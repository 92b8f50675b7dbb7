#pragma once

#include <cstdint>
#include <limits>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace ZR::Live {

/// The programs whose traces are read. One source file each.
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

/// One client's claim that an address of a link was leased. A claim proves
/// nothing by itself: files outlive clients, addresses and links.
struct Lease {
    /// An end that never comes.
    static constexpr std::int64_t never = std::numeric_limits<std::int64_t>::max();

    Client client{};
    std::string interfaceName;  ///< empty when the client names links by index, or none at all
    std::uint32_t ifindex = 0;  ///< 0 when the client names links by name, or none at all
    std::uint8_t family = 0;    ///< AF_INET or AF_INET6
    std::string address;        ///< canonical text
    std::string server;         ///< canonical text; empty when the client does not keep it
    bool bootp = false;         ///< came by BOOTP, without a DHCP message type
    bool released = false;
    bool clientAlive = false;  ///< the client that made the claim runs now
    /// End in seconds since the epoch; nullopt when the client keeps only a
    /// duration, and takes the claim back itself.
    std::optional<std::int64_t> expires;
    /// The client asked once and ended: after its end, too, the address stays as it is.
    bool outlivesEnd = false;
    std::string origin{};  ///< the file that says so

    bool operator==(const Lease&) const = default;
};

/// What a program that manages a link, or a configuration file for such a program,
/// says about how the link gets its addresses. It names the link by index or by name.
struct LinkConfiguration {
    Client client{};
    std::uint32_t ifindex = 0;    ///< 0 when it names the link by name
    std::string interfaceName{};  ///< empty when it names the link by index
    std::optional<bool> dhcp4;    ///< nullopt when it does not tell, or cannot be read
    std::optional<bool> dhcp6;
    std::vector<std::string> staticAddresses;  ///< IPv4, canonical text
    bool linkLocal4 = false;                   ///< takes an address of 169.254/16 (RFC 3927)
    bool bootp4 = false;                       ///< asks by BOOTP (RFC 951), without DHCP
    bool other4 = false;                       ///< by another protocol, or shares the link
    std::string origin{};                      ///< the file that says so

    bool operator==(const LinkConfiguration&) const = default;
};

/// A running DHCP client of this network namespace.
struct ClientProcess {
    Client client{};
    std::vector<std::string> interfaces;  ///< empty: every link that can broadcast
    std::string leaseFile;                ///< empty: the client's default
    bool ipv6 = false;                    ///< DHCPv6 in place of DHCPv4
    std::int32_t pid = 0;                 ///< process number; 0 before it is known

    /// Whether it was told to serve this interface, or all.
    [[nodiscard]] bool serves(std::string_view interface) const noexcept;

    bool operator==(const ClientProcess&) const = default;
};

/// A running program that manages links, of this network namespace or another.
struct ManagerProcess {
    enum class Where : std::uint8_t { Here, Elsewhere, Unknown };

    Client client{};
    Where where = Where::Unknown;
    std::int32_t pid = 0;

    bool operator==(const ManagerProcess&) const = default;
};

/// A UDP socket on the port of DHCP clients (68, RFC 2131 section 4.1).
struct PortSocket {
    std::string address;  ///< canonical IPv4 text; empty: of all links
    std::string peer;     ///< the one address that it talks to; empty for none

    bool operator==(const PortSocket&) const = default;
};

/// What the kernel was given when it asked for an address at its start (ip=). It does not
/// tell which address that was, nor on which link.
struct BootAnswer {
    bool bootp = false;  ///< came by BOOTP, else by DHCP
    std::string server;  ///< of the boot files, canonical IPv4 text; empty for none
    std::string origin;  ///< the file that says so

    bool operator==(const BootAnswer&) const = default;
};

/// A directory that was read: all its files, or those of a name prefix.
struct WatchedPlace {
    std::string directory;
    std::string namePrefix;

    bool operator==(const WatchedPlace&) const = default;

    /// Whether changes there are noticed by whoever watches this place.
    [[nodiscard]] bool covers(const WatchedPlace& other) const {
        return directory == other.directory && other.namePrefix.starts_with(namePrefix);
    }
};

/// Everything that the clients' traces say.
struct ClientFacts {
    std::vector<Lease> leases;
    std::vector<LinkConfiguration> managements;     ///< of programs that run now
    std::vector<LinkConfiguration> configurations;  ///< of files that such programs would read
    std::vector<ClientProcess> processes;
    std::vector<ManagerProcess> managers;
    std::vector<PortSocket> sockets;
    std::optional<BootAnswer> boot;
    std::vector<std::uint32_t> packetLinks;  ///< where a packet socket hears IPv4
    std::vector<WatchedPlace> places;        ///< what was read beyond the fixed places
    std::vector<std::string> complaints;

    /// Whether a program that manages links runs for this network namespace. One
    /// whose namespace is hidden is believed: the files that it left are beside ours.
    [[nodiscard]] bool runs(Client client) const noexcept;

    /// Whether the sockets may be all that there is to see of a DHCPv4 client: no program
    /// that could have them was found for this network namespace.
    [[nodiscard]] bool socketsStandAlone() const noexcept;

    /// Whether such a program runs for other network namespaces alone: the indexes in
    /// its files are then those of other links.
    [[nodiscard]] bool runsElsewhere(Client client) const noexcept;

    bool operator==(const ClientFacts&) const = default;
};

}  // namespace ZR::Live
