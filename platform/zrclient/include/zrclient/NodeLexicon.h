#pragma once

#include <array>
#include <cstddef>
#include <optional>
#include <string_view>

/// The numbering of node types and properties that the instrumentation tree and
/// its users share. The numbers are fixed; clients pass them, never the texts.
namespace ZR::NodeLexicon {

enum class NodeType : unsigned short {
    NetworkInterface = 29,  ///< one node per network interface
    ComputerSystem = 40,    ///< one node per computer: the host, or its service processor
};

enum class Properties : unsigned short {
    AddressSource = 24,        ///< unsigned int: how the address was obtained; 1 is DHCP
    IPv4Address = 25,          ///< string: the interface's IPv4 address, dotted
    DHCPServerAddresses = 93,  ///< list of strings: addresses of the DHCP servers
    Name = 108,                ///< string: interface name, or a computer's name
    NameMaxLength = 109,       ///< unsigned int: maximum length of the name, in bytes
    InterfaceState = 123,      ///< unsigned int: 1 is active
    DHCPEnabled = 186,         ///< bool: the interface takes its address from DHCP
};

/// Values of Properties::AddressSource.
enum class AddressSource : unsigned int {
    Unknown = 0,
    DHCP = 1,
    BOOTP = 2,
    Static = 3,
    LinkLocal = 4,
    Other = 5,
};

/// The value of AddressOrigin (CIM 2.41) for a value of Properties::AddressSource;
/// 0, which is unknown, for any other number.
constexpr unsigned short addressOriginOf(unsigned int addressSource) noexcept {
    // Unknown, DHCP, BOOTP, static, IPv4 link local, other.
    constexpr std::array<unsigned short, 6> origins{0, 4, 5, 3, 6, 1};
    return addressSource < origins.size() ? origins[addressSource] : origins[0];
}

template <typename Number>
struct Entry {
    Number number;
    std::string_view name;
};

inline constexpr std::array<Entry<NodeType>, 2> nodeTypes{{
    {NodeType::NetworkInterface, "NetworkInterface"},
    {NodeType::ComputerSystem, "ComputerSystem"},
}};

inline constexpr std::array<Entry<Properties>, 7> properties{{
    {Properties::AddressSource, "AddressSource"},
    {Properties::IPv4Address, "IPv4Address"},
    {Properties::DHCPServerAddresses, "DHCPServerAddresses"},
    {Properties::Name, "Name"},
    {Properties::NameMaxLength, "NameMaxLength"},
    {Properties::InterfaceState, "InterfaceState"},
    {Properties::DHCPEnabled, "DHCPEnabled"},
}};

/// The name of a number; empty for a number that the lexicon does not have.
template <typename Number, std::size_t size>
constexpr std::string_view nameIn(const std::array<Entry<Number>, size>& entries, Number number) {
    for (const Entry<Number>& entry : entries) {
        if (entry.number == number) {
            return entry.name;
        }
    }
    return {};
}

/// The number of a name, whose case counts; nothing for any other text.
template <typename Number, std::size_t size>
constexpr std::optional<Number> numberIn(const std::array<Entry<Number>, size>& entries,
                                         std::string_view name) {
    for (const Entry<Number>& entry : entries) {
        if (entry.name == name) {
            return entry.number;
        }
    }
    return std::nullopt;
}

constexpr std::string_view nameOf(NodeType type) {
    return nameIn(nodeTypes, type);
}
constexpr std::string_view nameOf(Properties id) {
    return nameIn(properties, id);
}
constexpr std::optional<NodeType> nodeTypeOf(std::string_view name) {
    return numberIn(nodeTypes, name);
}
constexpr std::optional<Properties> propertyOf(std::string_view name) {
    return numberIn(properties, name);
}

/// The node descriptions by which computers are told apart: any but that of the service
/// processor is the host's.
inline constexpr const char* hostDescription = "Computer";
inline constexpr const char* serviceProcessorDescription = "BMC";

/// The name of the service processor as a computer.
inline constexpr const char* serviceProcessorName = "BMC:-1";

}  // namespace ZR::NodeLexicon
