#pragma once

#include <string>
#include <vector>

/// What the instrumentation tells of the objects at the far ends of the DHCP
/// associations, as plain facts.
namespace ZR::DHCPClientNeighbours {

struct ComputerFacts {
    std::string name;
    bool isServiceProcessor = false;

    bool operator==(const ComputerFacts&) const = default;
};

struct InterfaceFacts {
    std::string name;
    std::string systemName;  ///< name of the computer that it belongs to; empty: not told
    bool ofServiceProcessor = false;
    std::string ipv4Address;         ///< empty: none
    unsigned int addressSource = 0;  ///< NodeLexicon::AddressSource

    bool operator==(const InterfaceFacts&) const = default;
};

/// All computers, in the order of the tree. One without a readable name is left out.
[[nodiscard]] std::vector<ComputerFacts> readComputers();

/// All network interfaces, in the order of the tree. One without a readable name
/// is left out.
[[nodiscard]] std::vector<InterfaceFacts> readInterfaces();

}  // namespace ZR::DHCPClientNeighbours
