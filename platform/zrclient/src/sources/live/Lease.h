#pragma once

#include <cstdint>
#include <limits>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace ZR::Live {

/// The programs whose traces are read. One source file each.
enum class Client : std::uint8_t { Networkd, Dhclient };

/// One client's claim that an address of a link was leased. A claim proves
/// nothing by itself: files outlive clients, addresses and links.
struct Lease {
    /// An end that never comes.
    static constexpr std::int64_t never = std::numeric_limits<std::int64_t>::max();

    Client client{};
    std::string interfaceName;  ///< empty when the client names links by index
    std::uint32_t ifindex = 0;  ///< 0 when the client names links by name
    std::uint8_t family = 0;    ///< AF_INET or AF_INET6
    std::string address;        ///< canonical text
    std::string server;         ///< canonical text; empty when the client does not keep it
    bool bootp = false;         ///< came by BOOTP, without a DHCP message type
    bool released = false;
    bool clientAlive = false;  ///< the client that made the claim runs now
    /// End in seconds since the epoch; nullopt when the client keeps only a
    /// duration, and takes the claim back itself.
    std::optional<std::int64_t> expires;

    bool operator==(const Lease&) const = default;
};

/// What a program that manages a link says about how it configures it.
struct Management {
    Client client{};
    std::uint32_t ifindex = 0;
    std::optional<bool> dhcp4;  ///< nullopt when its configuration cannot be read
    std::optional<bool> dhcp6;
    std::vector<std::string> staticAddresses;  ///< IPv4, canonical text
    bool linkLocal4 = false;                   ///< takes an address of 169.254/16 (RFC 3927)

    bool operator==(const Management&) const = default;
};

/// A running DHCP client of this network namespace.
struct ClientProcess {
    Client client{};
    std::vector<std::string> interfaces;  ///< empty: every link that can broadcast
    std::string leaseFile;                ///< empty: the client's default
    bool ipv6 = false;                    ///< DHCPv6 in place of DHCPv4
    std::int32_t pid = 0;                 ///< process number; 0 before it is known

    bool operator==(const ClientProcess&) const = default;
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
    std::vector<Management> managements;
    std::vector<ClientProcess> processes;
    std::vector<WatchedPlace> places;  ///< what was read beyond the fixed places
    std::vector<std::string> complaints;

    bool operator==(const ClientFacts&) const = default;
};

}  // namespace ZR::Live
