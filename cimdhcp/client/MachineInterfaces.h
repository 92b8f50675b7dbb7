#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "cimom/Instance.h"
#include "client/ClassLookup.h"
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

/// One network interface at a glance. Empty texts: not known, or there is none.
struct InterfaceOverview {
    std::string system;  ///< hostSystem or serviceProcessorSystem
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

/// The interfaces of another machine, as far as its provider tells: those that have a
/// setting, in their order, with the addresses of their IP endpoints. `processors` are
/// the names of its service processors. The state of an interface that does not use
/// DHCP is not known.
[[nodiscard]] std::vector<InterfaceOverview> interfacesOf(
    const std::vector<cimom::Instance>& settings, const std::vector<cimom::Instance>& ipEndpoints,
    const std::vector<std::string>& processors);

/// Puts what the provider tells beside the interfaces.
void addServed(const ServedInstances& served, const ClassLookup& classes,
               std::vector<InterfaceOverview>& interfaces);

}  // namespace cimdhcp
