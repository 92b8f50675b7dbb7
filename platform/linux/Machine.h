#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "facts/ClientFacts.h"
#include "ipmi/ServiceProcessor.h"
#include "kernel/Address.h"
#include "kernel/Link.h"

namespace ZR::Live {

/// Everything that was read of the machine.
struct MachineFacts {
    std::string hostName;  ///< empty when the machine does not tell it
    std::vector<Link> links;
    std::vector<Address> addresses;
    ClientFacts clients;
    std::optional<ServiceProcessor> serviceProcessor = std::nullopt;

    bool operator==(const MachineFacts&) const = default;
};

/// The facts that concern one interface. Borrows them.
struct InterfaceView {
    const Link* link = nullptr;
    std::span<const Address> addresses;  ///< of all families, in the kernel's order
    std::vector<const Lease*> leases;    ///< live ones of IPv4, those of running clients first
    std::vector<const Lease*> leases6;   ///< live ones of IPv6, likewise
    const Lease* formerLease = nullptr;  ///< one whose address outlived its end
    const LinkConfiguration* management = nullptr;     ///< of the program that manages it
    const LinkConfiguration* configuration = nullptr;  ///< of a file, where no program does
    bool enslaved = false;
    std::vector<const ClientProcess*> processes;  ///< DHCP clients that run on the link
    const PortSocket* socket = nullptr;      ///< a DHCP client's, bound to an address of the link
    const PortSocket* openSocket = nullptr;  ///< one of all links, beside one that hears this link
    const Address* address = nullptr;        ///< the one that was decided on
};

/// All facts arranged by interface, in the order of their indexes.
///
/// A lease is live when its link exists, it was not released, its end lies in the
/// future, and the kernel has its address on that very link. The last of these
/// removes every stale claim: files outlive all else.
///
/// A client that names links by name does not notice when a link is renamed. Three kinds
/// of leases are therefore found by their address:
/// - A lease that names a link which does not exist belongs to the link that has its
///   address, if exactly one has it, and if the address ends when the lease does. An
///   address without an end counts only while the client runs.
/// - A lease that names no link belongs to the link that has its address, if exactly one
///   has it.
/// - The lease of the kernel's own start (ip=) does not tell its address: it belongs to
///   the only IPv4 address of the machine, if that has no end and if no client, manager
///   or configuration is known for its link.
class Machine {
  public:
    /// `now`: seconds since the epoch.
    Machine(MachineFacts facts, std::int64_t now);
    Machine(const Machine&) = delete;  // the views point into the facts
    Machine& operator=(const Machine&) = delete;
    ~Machine() = default;

    [[nodiscard]] std::span<const InterfaceView> interfaces() const { return views_; }
    [[nodiscard]] const std::string& hostName() const { return facts_.hostName; }
    [[nodiscard]] const std::optional<ServiceProcessor>& serviceProcessor() const {
        return facts_.serviceProcessor;
    }
    [[nodiscard]] const std::vector<Diagnostic>& diagnostics() const {
        return facts_.clients.diagnostics;
    }

  private:
    /// Which interface has an address.
    struct Holder {
        const Address* address = nullptr;
        InterfaceView* view = nullptr;
    };

    void collectLeases(std::int64_t now);
    void collectClients();
    void collectSockets();
    void collectBootLease();
    InterfaceView* find(std::uint32_t ifindex);
    InterfaceView* find(const InterfaceName& name);
    InterfaceView* findByAddress(const Lease& lease, std::int64_t now);
    std::span<const Holder> holders(const IpAddress& address);

    MachineFacts facts_;
    std::optional<Lease> bootLease_;
    std::vector<InterfaceView> views_;  // by ifindex
    std::vector<std::size_t> byName_;   // positions in views_, by name
    std::vector<Holder> byAddress_;     // by address; made when it is first asked for
};

}  // namespace ZR::Live
