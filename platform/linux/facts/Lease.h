#pragma once

#include <cstdint>
#include <limits>
#include <optional>
#include <string>
#include <vector>

#include "facts/Client.h"
#include "formats/InterfaceName.h"
#include "formats/IpAddress.h"

namespace ZR::Live {

/// One client's claim that an address of a link was leased. A claim proves
/// nothing by itself: files outlive clients, addresses and links.
struct Lease {
    /// An end that never comes.
    static constexpr std::int64_t never = std::numeric_limits<std::int64_t>::max();

    Client client{};
    /// nullopt when the client names links by index, or none at all.
    std::optional<InterfaceName> interfaceName;
    std::uint32_t ifindex = 0;  ///< 0 when the client names links by name, or none at all
    IpAddress address;
    std::optional<IpAddress> server;  ///< nullopt when the client does not keep it
    bool bootp = false;               ///< came by BOOTP, without a DHCP message type
    bool released = false;
    bool clientAlive = false;  ///< the client that made the claim runs now
    /// End in seconds since the epoch; nullopt when the client keeps only a
    /// duration, and takes the claim back itself.
    std::optional<std::int64_t> expires;
    /// When the server last confirmed the lease, in seconds since the epoch; nullopt when
    /// the client does not keep it.
    std::optional<std::int64_t> obtained{};
    std::optional<std::int64_t> renews{};   ///< T1, likewise
    std::optional<std::int64_t> rebinds{};  ///< T2, likewise
    std::vector<std::uint16_t> options{};   ///< codes of the options that came, in their order
    std::string clientIdentifier{};         ///< as the client's file has it
    std::int32_t pid = 0;                   ///< of the client's process; 0 when not known
    /// The client asked once and ended: after its end, too, the address stays as it is.
    bool outlivesEnd = false;
    std::string origin{};  ///< the file that says so

    bool operator==(const Lease&) const = default;
};

}  // namespace ZR::Live
