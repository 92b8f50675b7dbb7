#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "facts/Lease.h"
#include "facts/LinkConfiguration.h"
#include "facts/RunningPrograms.h"
#include "formats/IpAddress.h"
#include "kernel/Sockets.h"
#include "kernel/WatchedPlace.h"
#include "zrclient/Diagnostic.h"

namespace ZR::Live {

/// What the kernel was given when it asked for an address at its start (ip=). It does not
/// tell which address that was, nor on which link.
struct BootResponse {
    bool bootp = false;               ///< came by BOOTP, else by DHCP
    std::optional<IpAddress> server;  ///< of the boot files
    std::string origin{};             ///< the file that says so

    bool operator==(const BootResponse&) const = default;
};

/// Everything that the clients' processes and files, and the files of their
/// configuration, say.
struct ClientFacts {
    std::vector<Lease> leases;
    std::vector<LinkConfiguration> managements;     ///< of programs that run now
    std::vector<LinkConfiguration> configurations;  ///< of files that such programs would read
    std::vector<ClientProcess> processes;
    std::vector<ManagerProcess> managers;
    /// Managers that run and could not be asked what they do: their files alone are known.
    std::vector<Client> unheardManagers;
    /// Indexes of the links that NetworkManager's files say it leaves alone.
    std::vector<std::uint32_t> unmanagedLinks;
    /// Clients of which this user may not know whether they run in this network namespace, and
    /// programs that run and are not read by this build.
    std::vector<ClientProcess> hiddenClients;
    bool processesHidden = false;  ///< those of other users, as by hidepid=2 (proc(5))
    ClientSockets sockets;
    std::optional<BootResponse> boot;
    std::vector<WatchedPlace> places;  ///< what was read beyond the fixed places
    std::vector<Diagnostic> diagnostics;

    /// Whether a program that manages links runs for this network namespace. One
    /// whose namespace is hidden is believed: the files that it left are beside ours.
    [[nodiscard]] bool runs(Client client) const noexcept;

    /// Whether such a program runs for other network namespaces alone: the indexes in
    /// its files are then those of other links.
    [[nodiscard]] bool runsElsewhere(Client client) const noexcept;

    bool operator==(const ClientFacts&) const = default;
};

/// The process number of a manager that runs for this network namespace; 0 for none.
[[nodiscard]] std::int32_t pidOfManager(const ClientFacts& facts, Client client);

}  // namespace ZR::Live
