#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>

/// The numbering of node types and properties that the instrumentation tree and
/// its users share. The numbers are fixed; clients pass them, never the texts.
namespace ZR::NodeLexicon {

enum class NodeType : unsigned short {
    NetworkInterface = 29,  ///< one node per network interface
    ComputerSystem = 40,    ///< one node per computer: the host, or its service processor
    DHCPLease = 1000,       ///< below an interface: a lease of it, or a client that asks for one
};

enum class Properties : unsigned short {
    AddressSource = 24,        ///< unsigned int: how the address was obtained; 1 is DHCP
    IPv4Address = 25,          ///< string: the interface's IPv4 address, dotted
    DHCPServerAddresses = 93,  ///< list of strings: addresses of the DHCP servers
    Name = 108,                ///< string: interface name, or a computer's name
    NameMaxLength = 109,       ///< unsigned int: maximum length of the name, in bytes
    InterfaceState = 123,      ///< unsigned int: 1 is active
    DHCPEnabled = 186,         ///< bool: the interface takes its address from DHCP

    // Of DHCPLease nodes. What is not known is absent. Times are unsigned int, in seconds
    // since the epoch.
    Family = 1000,            ///< string: "IPv4" or "IPv6"
    ClientState = 1001,       ///< unsigned int: see ClientState; unknown where nothing tells
    Address = 1002,           ///< string: the address that was leased
    ServerAddress = 1003,     ///< string: the server that leased it
    LeaseObtained = 1004,     ///< when the server last confirmed the lease
    RenewalTime = 1005,       ///< T1 (RFC 2131 section 4.4.5, RFC 8415 section 18.2.4)
    RebindingTime = 1006,     ///< T2 (likewise)
    LeaseExpires = 1007,      ///< `never` for a lease without an end
    OptionsReceived = 1008,   ///< list of unsigned int: codes of the options that came
    ClientIdentifier = 1009,  ///< string: as the client's file has it
    Client = 1010,            ///< string: the program, "dhclient" or "systemd-networkd"
    Process = 1011,           ///< unsigned int: number of the client's process
    Source = 1012,            ///< string: the file or bus that tells it
    ClientRuns = 1013,        ///< bool: the client that holds the lease runs now
};

/// Values of Properties::ClientState: the value map of CIM_DHCPProtocolEndpoint (CIM 2.41),
/// which has none for a client that renews. Such a client is bound.
enum class ClientState : unsigned int {
    Unknown = 0,
    Init = 2,
    Selecting = 3,
    Requesting = 4,
    Rebinding = 5,
    InitReboot = 6,
    Rebooting = 7,
    Bound = 8,
};

/// The LeaseExpires of a lease without an end: the last second of the year 9999, which a
/// CIM datetime can still name.
inline constexpr std::uint64_t never = 253'402'300'799;

/// Values of Properties::Family.
inline constexpr const char* familyIPv4 = "IPv4";
inline constexpr const char* familyIPv6 = "IPv6";

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

inline constexpr std::array<Entry<NodeType>, 3> nodeTypes{{
    {NodeType::NetworkInterface, "NetworkInterface"},
    {NodeType::ComputerSystem, "ComputerSystem"},
    {NodeType::DHCPLease, "DHCPLease"},
}};

inline constexpr std::array<Entry<Properties>, 21> properties{{
    {Properties::AddressSource, "AddressSource"},
    {Properties::IPv4Address, "IPv4Address"},
    {Properties::DHCPServerAddresses, "DHCPServerAddresses"},
    {Properties::Name, "Name"},
    {Properties::NameMaxLength, "NameMaxLength"},
    {Properties::InterfaceState, "InterfaceState"},
    {Properties::DHCPEnabled, "DHCPEnabled"},
    {Properties::Family, "Family"},
    {Properties::ClientState, "ClientState"},
    {Properties::Address, "Address"},
    {Properties::ServerAddress, "ServerAddress"},
    {Properties::LeaseObtained, "LeaseObtained"},
    {Properties::RenewalTime, "RenewalTime"},
    {Properties::RebindingTime, "RebindingTime"},
    {Properties::LeaseExpires, "LeaseExpires"},
    {Properties::OptionsReceived, "OptionsReceived"},
    {Properties::ClientIdentifier, "ClientIdentifier"},
    {Properties::Client, "Client"},
    {Properties::Process, "Process"},
    {Properties::Source, "Source"},
    {Properties::ClientRuns, "ClientRuns"},
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

/// The place of a node type in nodeTypes; nothing for a number that the lexicon does not have.
constexpr std::optional<std::size_t> placeOf(NodeType type) {
    for (std::size_t place = 0; place < nodeTypes.size(); ++place) {
        if (nodeTypes.at(place).number == type) {
            return place;
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
