#pragma once

#include <optional>
#include <string>
#include <vector>

#include "cimdhcp/Client.h"
#include "cimom/Cim.h"
#include "cimom/ClassRepository.h"
#include "zrclient/Snapshot.h"

namespace cimdhcp {

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

/// What the provider tells; none for a class that it does not serve.
struct ServedInstances {
    std::optional<std::vector<cimom::Instance>> endpoints;
    std::optional<std::vector<cimom::Instance>> accessPoints;
    std::optional<std::vector<cimom::Instance>> settings;
};

/// The interfaces of a tree in its order, with the state of the interface itself
/// and nothing about DHCP.
[[nodiscard]] std::vector<InterfaceOverview> interfacesOf(const ZR::Snapshot& snapshot);

/// Asks the provider for what it serves. Throws Failure for any other answer than
/// OK and that the class is not served.
[[nodiscard]] ServedInstances askProvider(Client& client);

/// Puts what the provider tells beside the interfaces.
void addServed(const ServedInstances& served, const cimom::ClassRepository& repository,
               std::vector<InterfaceOverview>& interfaces);

}  // namespace cimdhcp
