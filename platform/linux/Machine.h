#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "clients/Lease.h"
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
/// Clients that name links by name do not learn of a new one. A lease whose link is
/// gone is that of the one link that has its address, if the address ends when the
/// lease does, or has no end and the client runs. A client that names no link at all means
/// the one that has its address. What the kernel was given at the start of the system is
/// the only IPv4 address of the machine, if that has no end and nobody else speaks for it.
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
    [[nodiscard]] const std::vector<std::string>& complaints() const {
        return facts_.clients.complaints;
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
    InterfaceView* find(std::string_view name);
    InterfaceView* findByAddress(const Lease& lease, std::int64_t now);
    std::span<const Holder> holders(std::string_view address);

    MachineFacts facts_;
    std::optional<Lease> bootLease_;
    std::vector<InterfaceView> views_;  // by ifindex
    std::vector<std::size_t> byName_;   // positions in views_, by name
    std::vector<Holder> byAddress_;     // by text; made when it is first asked for
};

}  // namespace ZR::Live
