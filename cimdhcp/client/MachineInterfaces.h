#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "cimom/Instance.h"
#include "zrclient/Diagnostic.h"
#include "zrclient/NodeLexicon.h"
#include "zrclient/Snapshot.h"

namespace cimdhcp {

/// The systems that interfaces belong to, as a setting's InstanceID names them.
inline constexpr std::string_view hostSystem = ZR::NodeLexicon::hostDescription;
inline constexpr std::string_view serviceProcessorSystem =
    ZR::NodeLexicon::serviceProcessorDescription;

/// An interface within the machine, as the InstanceID of its setting names it.
struct InterfaceId {
    std::string system;
    std::string name;

    bool operator==(const InterfaceId&) const = default;
};

/// Reads "Computer%eth0". None when the text is not of that form.
[[nodiscard]] std::optional<InterfaceId> readInterfaceId(const std::string& text);

/// A lease of an interface, or a client that asks for one: a DHCPLease node of the tree.
/// Empty texts and lists: not told. Times in seconds since the epoch.
struct LeaseOverview {
    std::string family;                        ///< NodeLexicon::familyIPv4 or familyIPv6
    std::optional<std::uint64_t> clientState;  ///< a NodeLexicon::ClientState
    std::string address;                       ///< empty: the client asks for one
    std::string server;
    std::optional<std::int64_t> obtained;
    std::optional<std::int64_t> renews;
    std::optional<std::int64_t> rebinds;
    std::optional<std::int64_t> expires;  ///< NodeLexicon::never: it has no end
    std::vector<std::uint64_t> options;
    std::string clientIdentifier;
    std::string client;
    std::optional<std::uint64_t> process;
    std::string source;
    std::optional<bool> clientRuns;

    bool operator==(const LeaseOverview&) const = default;
};

/// One network interface at a glance. Of optional parts, none means that it is not known,
/// and an empty one that there is none.
struct InterfaceOverview {
    std::string system;  ///< hostSystem or serviceProcessorSystem
    std::string name;
    std::optional<bool> dhcp;
    std::optional<bool> active;  ///< its link is up, and has a cable
    std::optional<std::string> address;
    std::optional<std::uint64_t> addressSource;        ///< a NodeLexicon::AddressSource
    std::optional<std::uint64_t> clientState;          ///< of the DHCP endpoint
    std::optional<std::vector<LeaseOverview>> leases;  ///< in the tree's order
    std::optional<std::vector<std::string>> servers;   ///< addresses
    std::optional<std::string> configurationName;

    bool operator==(const InterfaceOverview&) const = default;
};

struct MachineInterfaces {
    std::vector<InterfaceOverview> interfaces;
    /// On what could not be read of the machine, or is not as it looks.
    std::vector<ZR::Diagnostic> diagnostics;

    bool operator==(const MachineInterfaces&) const = default;
};

/// What the provider tells; none for a class that it does not serve.
struct ServedInstances {
    std::optional<std::vector<cimom::Instance>> endpoints;
    std::optional<std::vector<cimom::Instance>> accessPoints;
    std::optional<std::vector<cimom::Instance>> settings;

    bool operator==(const ServedInstances&) const = default;
};

/// The interfaces of a tree in its order, with all but what the provider alone tells:
/// servers and configuration names.
[[nodiscard]] std::vector<InterfaceOverview> interfacesOf(const ZR::Snapshot& snapshot);

/// The same of the interfaces and leases that a provider serves; none: it does not serve
/// leases.
[[nodiscard]] std::vector<InterfaceOverview> interfacesOf(
    const std::vector<cimom::Instance>& interfaces,
    const std::optional<std::vector<cimom::Instance>>& leases);

/// The interfaces as far as a provider tells that serves only the classes of the standard:
/// those that have a setting, in their order, with the addresses of their IP endpoints (none:
/// these are not served). `processors` are the names of its service processors. Links and
/// leases are not known.
[[nodiscard]] std::vector<InterfaceOverview> interfacesOf(
    const std::vector<cimom::Instance>& settings,
    const std::optional<std::vector<cimom::Instance>>& ipEndpoints,
    const std::vector<std::string>& processors);

/// Those of the diagnostics that a provider serves that are of a known kind.
[[nodiscard]] std::vector<ZR::Diagnostic> diagnosticsOf(
    const std::vector<cimom::Instance>& diagnostics);

/// Puts what the provider tells beside the interfaces. Whether DHCP is on is taken from it
/// where nothing else tells.
void addServed(const ServedInstances& served, std::vector<InterfaceOverview>& interfaces);

/// What of that is about one interface.
[[nodiscard]] ServedInstances servedOf(const InterfaceOverview& interface,
                                       const ServedInstances& served);

}  // namespace cimdhcp
