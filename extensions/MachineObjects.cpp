#include "MachineObjects.h"

#include <algorithm>
#include <array>
#include <chrono>
#include <cstdio>
#include <limits>
#include <optional>
#include <string_view>
#include <unordered_map>
#include <unordered_set>
#include <utility>

#include "providerutilities/Classes.h"
#include "zrcommon/SystemName.h"

namespace ZR::DHCPClientExtensions {

using NodeLexicon::NodeType;
using NodeLexicon::Properties;

namespace {

constexpr const char* lease = "QVXZR_DHCPLease";
constexpr const char* interface = "QVXZR_DHCPInterface";
constexpr const char* diagnostic = "QVXZR_DHCPDiagnostic";
constexpr std::uint64_t linkUp = 1;

/// A node of a snapshot, and what it tells.
class Node {
  public:
    Node(const Snapshot& snapshot, Snapshot::Index index) : snapshot_(snapshot), index_(index) {}

    template <typename Kind>
    [[nodiscard]] const Kind* read(Properties id) const {
        const SnapshotProperty* property = snapshot_.find(index_, id);
        return property == nullptr ? nullptr : std::get_if<Kind>(&property->value);
    }

    [[nodiscard]] PropertyContent text(Properties id) const {
        const auto* value = read<std::string>(id);
        return value == nullptr ? PropertyContent() : *value;
    }
    [[nodiscard]] std::string textOrEmpty(Properties id) const {
        const auto* value = read<std::string>(id);
        return value == nullptr ? std::string() : *value;
    }
    [[nodiscard]] PropertyContent truth(Properties id) const {
        const auto* value = read<bool>(id);
        return value == nullptr ? PropertyContent() : *value;
    }
    /// Of a number that the type cannot hold nothing is known.
    template <typename Number>
    [[nodiscard]] PropertyContent number(Properties id) const {
        const auto* value = read<std::uint64_t>(id);
        return value == nullptr || *value > std::numeric_limits<Number>::max() ? PropertyContent()
                                                                               : *value;
    }
    [[nodiscard]] PropertyContent moment(Properties id) const {
        const auto* value = read<std::uint64_t>(id);
        return value == nullptr ? PropertyContent() : dateTimeText(*value);
    }
    [[nodiscard]] PropertyContent codes(Properties id) const {
        const auto* value = read<NumberList>(id);
        if (value == nullptr) {
            return {};
        }
        std::vector<unsigned short> codes;
        for (const std::uint64_t code : value->numbers) {
            if (code <= std::numeric_limits<unsigned short>::max()) {
                codes.push_back(static_cast<unsigned short>(code));
            }
        }
        return codes;
    }

    [[nodiscard]] Node parent() const { return {snapshot_, snapshot_.node(index_).parent}; }
    [[nodiscard]] Snapshot::Index index() const { return index_; }

    /// Of an interface: it lies in a network, which lies in its computer.
    [[nodiscard]] bool isOfServiceProcessor() const {
        Snapshot::Index above = index_;
        for (int level = 0; level < 2 && above != Snapshot::none; ++level) {
            above = snapshot_.node(above).parent;
        }
        return above != Snapshot::none &&
               snapshot_.node(above).description == NodeLexicon::serviceProcessorDescription;
    }
    [[nodiscard]] std::string interfaceId() const {
        std::string id = isOfServiceProcessor() ? NodeLexicon::serviceProcessorDescription
                                                : NodeLexicon::hostDescription;
        return id.append("%").append(textOrEmpty(Properties::Name));
    }

  private:
    const Snapshot& snapshot_;
    Snapshot::Index index_;
};

template <typename Take>
void forEachOf(NodeType type, const Snapshot& snapshot, const Take& take) {
    for (Snapshot::Index index = snapshot.first(type); index != Snapshot::none;
         index = snapshot.node(index).nextOfType) {
        take(Node(snapshot, index));
    }
}

/// Hands over each lease of an interface with its InstanceID.
template <typename Take>
void forEachLease(const Snapshot& snapshot, const Take& take) {
    std::unordered_map<std::string, unsigned> counts;
    forEachOf(NodeType::DHCPLease, snapshot, [&](const Node& node) {
        if (node.parent().index() == Snapshot::none) {
            return;
        }
        std::string id = node.parent().interfaceId();
        id.append("%").append(node.textOrEmpty(Properties::Family));
        id.append("%").append(node.textOrEmpty(Properties::Client));
        const unsigned number = ++counts[id];
        if (number > 1) {
            id.append("%").append(std::to_string(number));
        }
        take(node, std::move(id));
    });
}

ExtensionObject leaseObject(const Node& node, std::string id) {
    return {lease,
            std::move(id),
            {{"ElementName", CMPI_string, node.parent().text(Properties::Name)},
             {"InterfaceID", CMPI_string, node.parent().interfaceId()},
             {"Family", CMPI_string, node.text(Properties::Family)},
             {"ClientState", CMPI_uint16, node.number<std::uint16_t>(Properties::ClientState)},
             {"Address", CMPI_string, node.text(Properties::Address)},
             {"ServerAddress", CMPI_string, node.text(Properties::ServerAddress)},
             {"LeaseObtained", CMPI_dateTime, node.moment(Properties::LeaseObtained)},
             {"RenewalTime", CMPI_dateTime, node.moment(Properties::RenewalTime)},
             {"RebindingTime", CMPI_dateTime, node.moment(Properties::RebindingTime)},
             {"LeaseExpires", CMPI_dateTime, node.moment(Properties::LeaseExpires)},
             {"OptionsReceived", CMPI_uint16A, node.codes(Properties::OptionsReceived)},
             {"ClientIdentifier", CMPI_string, node.text(Properties::ClientIdentifier)},
             {"ClientName", CMPI_string, node.text(Properties::Client)},
             {"Process", CMPI_uint32, node.number<std::uint32_t>(Properties::Process)},
             {"ClientRuns", CMPI_boolean, node.truth(Properties::ClientRuns)},
             {"Source", CMPI_string, node.text(Properties::Source)}}};
}

ExtensionObject interfaceObject(const Node& node) {
    const auto* state = node.read<std::uint64_t>(Properties::InterfaceState);
    const auto* source = node.read<std::uint64_t>(Properties::AddressSource);
    const auto origin = [source] {
        return std::uint64_t{NodeLexicon::addressOriginOf(static_cast<unsigned int>(
            std::min<std::uint64_t>(*source, std::numeric_limits<unsigned int>::max())))};
    };
    return {interface,
            node.interfaceId(),
            {{"ElementName", CMPI_string, node.text(Properties::Name)},
             {"DHCPEnabled", CMPI_boolean, node.truth(Properties::DHCPEnabled)},
             {"LinkUp", CMPI_boolean,
              state == nullptr ? PropertyContent() : PropertyContent(*state == linkUp)},
             {"IPv4Address", CMPI_string, node.text(Properties::IPv4Address)},
             {"AddressOrigin", CMPI_uint16,
              source == nullptr ? PropertyContent() : PropertyContent(origin())}}};
}

/// The name of an interface's endpoint. None: the interface does not use DHCP.
std::optional<ObjectName> endpointOf(const Node& node, const std::string& hostName) {
    const bool* const enabled = node.read<bool>(Properties::DHCPEnabled);
    if (enabled == nullptr || !*enabled) {
        return std::nullopt;
    }
    const bool processor = node.isOfServiceProcessor();
    const std::string system = processor ? NodeLexicon::serviceProcessorName : hostName;
    ObjectName name{Classes::dhcpProtocolEndpoint.name, {}, {}};
    name.keys.emplace_back("SystemCreationClassName",
                           processor ? "QVXZR_SPComputerSystem" : Classes::computerSystem.name);
    if (!system.empty()) {
        name.keys.emplace_back("SystemName", system);
    }
    name.keys.emplace_back("CreationClassName", name.className);
    name.keys.emplace_back("Name", node.textOrEmpty(Properties::Name));
    return name;
}

}  // namespace

std::vector<ExtensionObject> leaseObjects(const Snapshot& snapshot) {
    std::vector<ExtensionObject> objects;
    forEachLease(snapshot, [&objects](const Node& node, std::string id) {
        objects.push_back(leaseObject(node, std::move(id)));
    });
    return objects;
}

std::vector<ExtensionObject> interfaceObjects(const Snapshot& snapshot) {
    std::vector<ExtensionObject> objects;
    forEachOf(NodeType::NetworkInterface, snapshot,
              [&objects](const Node& node) { objects.push_back(interfaceObject(node)); });
    return objects;
}

std::vector<ExtensionObject> diagnosticObjects(const Snapshot& snapshot) {
    std::vector<ExtensionObject> objects;
    std::unordered_set<std::string> known;
    for (const Diagnostic& each : snapshot.diagnostics()) {
        const auto kind = static_cast<std::uint64_t>(each.kind);
        std::string id = std::to_string(kind) + '%' + each.text;
        if (known.insert(id).second) {
            objects.push_back(
                {diagnostic,
                 std::move(id),
                 {{"Description", CMPI_string, each.text}, {"Kind", CMPI_uint16, kind}}});
        }
    }
    return objects;
}

std::vector<ObjectName> endpointNames(const Snapshot& snapshot) {
    const std::string hostName = getSystemName();
    std::vector<ObjectName> names;
    forEachOf(NodeType::NetworkInterface, snapshot, [&](const Node& node) {
        if (auto name = endpointOf(node, hostName)) {
            names.push_back(*std::move(name));
        }
    });
    return names;
}

std::vector<LeaseAndEndpoint> leasesOfEndpoints(const Snapshot& snapshot) {
    const std::string hostName = getSystemName();
    std::vector<LeaseAndEndpoint> pairs;
    forEachLease(snapshot, [&](const Node& node, std::string id) {
        if (auto endpoint = endpointOf(node.parent(), hostName)) {
            pairs.push_back({*std::move(endpoint), {lease, {{"InstanceID", std::move(id)}}, {}}});
        }
    });
    return pairs;
}

std::string dateTimeText(std::uint64_t seconds) {
    const std::chrono::sys_seconds moment{
        std::chrono::seconds(std::min(seconds, NodeLexicon::never))};
    const auto day = std::chrono::floor<std::chrono::days>(moment);
    const std::chrono::year_month_day date(day);
    const std::chrono::hh_mm_ss time(moment - day);
    // With room for any integers, which the compiler takes these for.
    std::array<char, 64> text{};
    static_cast<void>(std::snprintf(
        text.data(), text.size(), "%04d%02u%02u%02d%02d%02d.000000+000",
        static_cast<int>(date.year()), static_cast<unsigned>(date.month()),
        static_cast<unsigned>(date.day()), static_cast<int>(time.hours().count()),
        static_cast<int>(time.minutes().count()), static_cast<int>(time.seconds().count())));
    return text.data();
}

}  // namespace ZR::DHCPClientExtensions
