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
    std::vector<const Lease*> ended;     ///< of both; the link still has their addresses
    std::vector<const LinkConfiguration*> managements;     ///< of programs that run now
    std::vector<const LinkConfiguration*> configurations;  ///< of files; they are not facts
    bool enslaved = false;
    /// DHCP clients that have the link, without those whose own word about it stands among
    /// the managements.
    std::vector<const ClientProcess*> processes;
    const PortSocket* socket = nullptr;      ///< a DHCP client's, bound to an address of the link
    const PortSocket* openSocket = nullptr;  ///< one of all links, beside one that hears this link
    /// A client may have the link without being seen: this user may not see all processes,
    /// or not where they run, or one was started under a name that no link has any more.
    bool hidden = false;
    const ClientProcess* strayed = nullptr;  ///< the latter; it may have any such link
    /// A manager that could not be asked, where it may use DHCP on the link without its files
    /// telling so.
    std::optional<Client> unheard{};
    /// Likewise, where an address of IPv6 may be one that DHCPv6 gave it.
    std::optional<Client> unheard6{};
    const Address* address = nullptr;  ///< the one that was decided on

    /// Whether nothing is known of it beside its link, and addresses without an end: what it
    /// is in the tree then follows from these and from `hidden` alone, and it has no leases
    /// and no diagnostics.
    [[nodiscard]] bool isPlain() const;

    /// The first program that runs and takes an address of the link by DHCP of this family;
    /// null for none.
    [[nodiscard]] const LinkConfiguration* dhcpManagement(bool ipv6) const;

    /// The first client of this family that has the link; null for none.
    [[nodiscard]] const ClientProcess* process(bool ipv6) const;

    /// Whether a packet socket hears the link, as that of a client which asks for an address.
    /// nullopt when that is not to be known of the process.
    [[nodiscard]] std::optional<bool> isHeardBy(const ClientProcess& process) const;
};

/// All facts arranged by interface, in the order of their indexes.
///
/// A lease is live when its link exists, it was not released, its end lies in the
/// future, and the kernel has its address on that very link, with an end as such a client
/// sets it (LeaseRules.h). The last of these removes every stale claim: files outlive all
/// else.
///
/// A client that names links by name does not notice when a link is renamed. A process is
/// then known by the index of the link that its packet socket hears. Three kinds of leases
/// are found by their address:
/// - A lease that names a link which does not exist, or has not its address, belongs to the
///   link that has it, if exactly one has it, and if the address ends when the lease does.
///   An address without an end counts only while the client runs.
/// - A lease that names no link belongs to the link that has its address, if exactly one
///   has it.
/// - The lease of the kernel's own start (ip=) does not tell its address: it belongs to
///   the only IPv4 address of the machine, if that has no end and if no client, manager
///   or configuration is known for its link.
///
/// A client that was told to run on named links has them. One of all links has those that
/// it hears, and those of which it holds a lease.
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
    [[nodiscard]] std::int64_t now() const { return now_; }

    /// When all this changes though nothing happens, in seconds since the epoch: a lease
    /// ends, or its client turns to other servers. The kernel tells of the end of an address.
    [[nodiscard]] std::int64_t changesAt() const { return changesAt_; }

    /// The number of a process that manages links; 0 when none runs.
    [[nodiscard]] std::int32_t processOf(Client manager) const;

    /// The link of an index, whether it is an interface or not; null for none.
    [[nodiscard]] const Link* linkOf(std::uint32_t ifindex) const;

  private:
    /// Which interface has an address.
    struct Holder {
        const Address* address = nullptr;
        InterfaceView* view = nullptr;
    };

    void collectInterfaces();
    void collectLeases();
    void collectManagements();
    void collectProcesses();
    void addProcess(const ClientProcess& process, InterfaceView& view) const;
    const ClientProcess* findStrayed();
    void collectHidden();
    void collectUnheard();
    void collectSockets();
    void collectBootLease();
    void findNextChange();
    InterfaceView* find(std::uint32_t ifindex);
    InterfaceView* find(const InterfaceName& name);
    InterfaceView* find(const LinkConfiguration& configuration);
    InterfaceView* findLink(const Lease& lease);
    InterfaceView* findByAddress(const Lease& lease);
    std::span<const Holder> holders(const IpAddress& address);

    MachineFacts facts_;
    std::int64_t now_;
    std::int64_t changesAt_ = Lease::never;
    std::optional<Lease> bootLease_;
    std::vector<InterfaceView> views_;  // by ifindex
    std::vector<std::size_t> byName_;   // positions in views_, by name; made when it pays
    std::size_t walks_ = 0;             // over views_, for want of it
    std::vector<Holder> byAddress_;     // by address; made when it is first asked for
};

}  // namespace ZR::Live
