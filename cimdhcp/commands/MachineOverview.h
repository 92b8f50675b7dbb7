#pragma once

#include <optional>
#include <string>
#include <vector>

#include "cimom/Instance.h"
#include "client/ClassLookup.h"
#include "zrclient/Snapshot.h"

namespace cimdhcp {

class Client;

/// One network interface at a glance. Empty texts: not known, or there is none.
struct InterfaceOverview {
    std::string system;  ///< "Computer", or "BMC" for the service processor
    std::string name;
    std::optional<bool> dhcp;  ///< none: the provider does not tell
    std::string state;         ///< in words
    std::string address;
    std::vector<std::string> servers;  ///< addresses
    std::string configurationName;

    bool operator==(const InterfaceOverview&) const = default;
};

struct MachineInterfaces {
    std::vector<InterfaceOverview> interfaces;
    std::vector<std::string> remarks;  ///< on what could not be read of the machine

    bool operator==(const MachineInterfaces&) const = default;
};

/// What the provider tells; none for a class that it does not serve.
struct ServedInstances {
    std::optional<std::vector<cimom::Instance>> endpoints;
    std::optional<std::vector<cimom::Instance>> accessPoints;
    std::optional<std::vector<cimom::Instance>> settings;
};

/// The interfaces of a tree in its order, with the state of the interface itself
/// and nothing about DHCP.
[[nodiscard]] std::vector<InterfaceOverview> interfacesOf(const ZR::Snapshot& snapshot);

/// The interfaces of another machine, of which only that is known which is served:
/// those that have a setting, in their order, with the addresses of their IP
/// endpoints. `processors` are the service processors' names. The state of an
/// interface that does not use DHCP is not known.
[[nodiscard]] std::vector<InterfaceOverview> interfacesOf(
    const std::vector<cimom::Instance>& settings, const std::vector<cimom::Instance>& ipEndpoints,
    const std::vector<std::string>& processors);

/// The instances of a class; none when the class is not served. Throws Failure for
/// any other answer than OK.
[[nodiscard]] std::optional<std::vector<cimom::Instance>> instancesOf(Client& client,
                                                                      const char* className);

/// Asks the provider for what it serves. Throws Failure for any other answer than
/// OK and that the class is not served.
[[nodiscard]] ServedInstances askProvider(Client& client);

/// Puts what the provider tells beside the interfaces.
void addServed(const ServedInstances& served, const ClassLookup& classes,
               std::vector<InterfaceOverview>& interfaces);

}  // namespace cimdhcp
