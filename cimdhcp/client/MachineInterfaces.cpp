#include "client/MachineInterfaces.h"

#include <algorithm>
#include <cstdint>
#include <iterator>
#include <string_view>
#include <unordered_map>
#include <unordered_set>
#include <utility>
#include <variant>

#include "cimom/ClassDeclaration.h"
#include "cimom/DateTimeText.h"
#include "text/ValueMeaning.h"

namespace cimdhcp {

namespace {

using ZR::NodeLexicon::NodeType;
using ZR::NodeLexicon::Properties;

constexpr std::uint64_t activeInterface = 1;

/// An interface lies in a network, which lies in its computer.
std::string_view systemOf(const ZR::Snapshot& snapshot, ZR::Snapshot::Index interface) {
    const ZR::Snapshot::Index network = snapshot.node(interface).parent;
    const ZR::Snapshot::Index computer =
        network == ZR::Snapshot::none ? network : snapshot.node(network).parent;
    const bool known = computer != ZR::Snapshot::none;
    return known && snapshot.node(computer).description == serviceProcessorSystem
               ? serviceProcessorSystem
               : hostSystem;
}

template <typename Kind>
const Kind* read(const ZR::Snapshot& snapshot, ZR::Snapshot::Index node, Properties id) {
    const ZR::SnapshotProperty* const property = snapshot.find(node, id);
    return property == nullptr ? nullptr : std::get_if<Kind>(&property->value);
}

std::optional<std::uint64_t> numberOf(const ZR::Snapshot& snapshot, ZR::Snapshot::Index node,
                                      Properties id) {
    const auto* const number = read<std::uint64_t>(snapshot, node, id);
    return number == nullptr ? std::nullopt : std::optional(*number);
}

/// A time that no clock reaches is one that never comes.
std::optional<std::int64_t> momentOf(const ZR::Snapshot& snapshot, ZR::Snapshot::Index node,
                                     Properties id) {
    const auto number = numberOf(snapshot, node, id);
    return number
               ? std::optional(static_cast<std::int64_t>(std::min(*number, ZR::NodeLexicon::never)))
               : std::nullopt;
}

std::string textOf(const ZR::Snapshot& snapshot, ZR::Snapshot::Index node, Properties id) {
    const auto* const text = read<std::string>(snapshot, node, id);
    return text == nullptr ? std::string() : *text;
}

std::string text(const cimom::Instance& instance, std::string_view property) {
    return heldText(instance.property(property));
}

/// The key of tables about interfaces: the InstanceID of the interface's setting.
std::string idOf(std::string_view system, const std::string& name) {
    return std::string(system) + '%' + name;
}

std::string_view systemOf(const cimom::Instance& instance) {
    return text(instance, "SystemCreationClassName") == "QVXZR_SPComputerSystem"
               ? serviceProcessorSystem
               : hostSystem;
}

template <typename Kind>
std::optional<Kind> scalarOf(const cimom::Instance& instance, std::string_view property) {
    const cimom::Value* const value = instance.property(property);
    const cimom::Scalar* const scalar = value == nullptr ? nullptr : value->scalar();
    const auto* const held = scalar == nullptr ? nullptr : std::get_if<Kind>(scalar);
    return held == nullptr ? std::nullopt : std::optional(*held);
}

std::optional<std::uint64_t> numberOf(const cimom::Instance& instance, std::string_view property) {
    return scalarOf<std::uint64_t>(instance, property);
}

std::optional<std::int64_t> momentOf(const cimom::Instance& instance, std::string_view property) {
    constexpr std::int64_t second = 1'000'000;
    const auto moment = cimom::parseDateTime(text(instance, property));
    return moment && !moment->interval ? std::optional(moment->microseconds / second)
                                       : std::nullopt;
}

std::vector<std::uint64_t> numbersOf(const cimom::Instance& instance, std::string_view property) {
    std::vector<std::uint64_t> numbers;
    const cimom::Value* const value = instance.property(property);
    const cimom::Array* const array = value == nullptr ? nullptr : value->array();
    if (array == nullptr) {
        return numbers;
    }
    for (const auto& element : *array) {
        if (const auto* const number = std::get_if<std::uint64_t>(&element)) {
            numbers.push_back(*number);
        }
    }
    return numbers;
}

/// The address source that a value of AddressOrigin stands for.
std::optional<std::uint64_t> addressSourceOf(std::optional<std::uint64_t> origin) {
    using Source = ZR::NodeLexicon::AddressSource;
    if (!origin) {
        return std::nullopt;
    }
    for (auto source = static_cast<unsigned int>(Source::DHCP);
         source <= static_cast<unsigned int>(Source::Other); ++source) {
        if (ZR::NodeLexicon::addressOriginOf(source) == *origin) {
            return source;
        }
    }
    return static_cast<std::uint64_t>(Source::Unknown);
}

LeaseOverview leaseOf(const cimom::Instance& instance) {
    LeaseOverview lease;
    lease.family = text(instance, "Family");
    lease.clientState = numberOf(instance, "ClientState");
    lease.address = text(instance, "Address");
    lease.server = text(instance, "ServerAddress");
    lease.obtained = momentOf(instance, "LeaseObtained");
    lease.renews = momentOf(instance, "RenewalTime");
    lease.rebinds = momentOf(instance, "RebindingTime");
    lease.expires = momentOf(instance, "LeaseExpires");
    lease.options = numbersOf(instance, "OptionsReceived");
    lease.clientIdentifier = text(instance, "ClientIdentifier");
    lease.client = text(instance, "ClientName");
    lease.process = numberOf(instance, "Process");
    lease.source = text(instance, "Source");
    lease.clientRuns = scalarOf<bool>(instance, "ClientRuns");
    return lease;
}

LeaseOverview leaseOf(const ZR::Snapshot& snapshot, ZR::Snapshot::Index node) {
    LeaseOverview lease;
    lease.family = textOf(snapshot, node, Properties::Family);
    lease.clientState = numberOf(snapshot, node, Properties::ClientState);
    lease.address = textOf(snapshot, node, Properties::Address);
    lease.server = textOf(snapshot, node, Properties::ServerAddress);
    lease.obtained = momentOf(snapshot, node, Properties::LeaseObtained);
    lease.renews = momentOf(snapshot, node, Properties::RenewalTime);
    lease.rebinds = momentOf(snapshot, node, Properties::RebindingTime);
    lease.expires = momentOf(snapshot, node, Properties::LeaseExpires);
    if (const auto* options = read<ZR::NumberList>(snapshot, node, Properties::OptionsReceived)) {
        lease.options = options->numbers;
    }
    lease.clientIdentifier = textOf(snapshot, node, Properties::ClientIdentifier);
    lease.client = textOf(snapshot, node, Properties::Client);
    lease.process = numberOf(snapshot, node, Properties::Process);
    lease.source = textOf(snapshot, node, Properties::Source);
    if (const auto* const runs = read<bool>(snapshot, node, Properties::ClientRuns)) {
        lease.clientRuns = *runs;
    }
    return lease;
}

/// The interface that an instance is about, as idOf() names it.
std::string idOfEndpoint(const cimom::Instance& endpoint) {
    return idOf(systemOf(endpoint), text(endpoint, "Name"));
}

std::string idOfAccessPoint(const cimom::Instance& point) {
    // Its name is the interface's with the kind of address behind it.
    const std::string name = text(point, "Name");
    return idOf(systemOf(point), name.substr(0, name.rfind('_')));
}

std::string idOfSetting(const cimom::Instance& setting) {
    return text(setting, "InstanceID");
}

std::optional<std::vector<cimom::Instance>> only(
    const std::string& id, const std::optional<std::vector<cimom::Instance>>& instances,
    std::string (*idOfInstance)(const cimom::Instance&)) {
    if (!instances) {
        return std::nullopt;
    }
    std::vector<cimom::Instance> found;
    std::copy_if(instances->begin(), instances->end(), std::back_inserter(found),
                 [&](const cimom::Instance& each) { return idOfInstance(each) == id; });
    return found;
}

}  // namespace

std::optional<InterfaceId> readInterfaceId(const std::string& text) {
    // No system's name has the sign, an interface's may.
    const std::size_t sign = text.find('%');
    if (sign == std::string::npos) {
        return std::nullopt;
    }
    return InterfaceId{text.substr(0, sign), text.substr(sign + 1)};
}

std::vector<InterfaceOverview> interfacesOf(const ZR::Snapshot& snapshot) {
    std::vector<InterfaceOverview> interfaces;
    std::unordered_map<ZR::Snapshot::Index, std::size_t> places;
    for (ZR::Snapshot::Index node = snapshot.first(NodeType::NetworkInterface);
         node != ZR::Snapshot::none; node = snapshot.node(node).nextOfType) {
        InterfaceOverview overview;
        overview.system = systemOf(snapshot, node);
        overview.name = textOf(snapshot, node, Properties::Name);
        if (const auto* const enabled = read<bool>(snapshot, node, Properties::DHCPEnabled)) {
            overview.dhcp = *enabled;
        }
        if (const auto state = numberOf(snapshot, node, Properties::InterfaceState)) {
            overview.active = *state == activeInterface;
        }
        overview.address = textOf(snapshot, node, Properties::IPv4Address);
        overview.addressSource = numberOf(snapshot, node, Properties::AddressSource);
        overview.leases.emplace();
        places[node] = interfaces.size();
        interfaces.push_back(std::move(overview));
    }
    for (ZR::Snapshot::Index node = snapshot.first(NodeType::DHCPLease); node != ZR::Snapshot::none;
         node = snapshot.node(node).nextOfType) {
        const auto place = places.find(snapshot.node(node).parent);
        if (place != places.end()) {
            InterfaceOverview& interface = interfaces[place->second];
            interface.leases->push_back(leaseOf(snapshot, node));
        }
    }
    return interfaces;
}

std::vector<InterfaceOverview> interfacesOf(
    const std::vector<cimom::Instance>& interfaces,
    const std::optional<std::vector<cimom::Instance>>& leases) {
    std::vector<InterfaceOverview> overviews;
    std::unordered_map<std::string, std::size_t> places;  // by idOf()
    for (const cimom::Instance& interface : interfaces) {
        std::string whole = text(interface, "InstanceID");
        auto id = readInterfaceId(whole);
        if (!id) {
            continue;
        }
        InterfaceOverview overview;
        overview.system = std::move(id->system);
        overview.name = std::move(id->name);
        overview.dhcp = scalarOf<bool>(interface, "DHCPEnabled");
        overview.active = scalarOf<bool>(interface, "LinkUp");
        overview.address = text(interface, "IPv4Address");
        overview.addressSource = addressSourceOf(numberOf(interface, "AddressOrigin"));
        if (leases) {
            overview.leases.emplace();
        }
        places.emplace(std::move(whole), overviews.size());
        overviews.push_back(std::move(overview));
    }
    const std::vector<cimom::Instance> nothing;
    for (const cimom::Instance& lease : leases ? *leases : nothing) {
        const auto place = places.find(text(lease, "InterfaceID"));
        if (place != places.end()) {
            overviews[place->second].leases->push_back(leaseOf(lease));
        }
    }
    return overviews;
}

std::vector<ZR::Diagnostic> diagnosticsOf(const std::vector<cimom::Instance>& diagnostics) {
    using Kind = ZR::Diagnostic::Kind;
    std::vector<ZR::Diagnostic> known;
    for (const cimom::Instance& each : diagnostics) {
        const auto kind = numberOf(each, "Kind");
        if (kind && *kind <= static_cast<std::uint64_t>(Kind::Note)) {
            known.emplace_back(text(each, "Description"), static_cast<Kind>(*kind));
        }
    }
    return known;
}

std::vector<InterfaceOverview> interfacesOf(
    const std::vector<cimom::Instance>& settings,
    const std::optional<std::vector<cimom::Instance>>& ipEndpoints,
    const std::vector<std::string>& processors) {
    const std::unordered_set<std::string> processorNames(processors.begin(), processors.end());
    const std::vector<cimom::Instance> nothing;
    std::unordered_map<std::string, std::string> addresses;  // by idOf()
    for (const cimom::Instance& endpoint : ipEndpoints ? *ipEndpoints : nothing) {
        const bool processor = processorNames.contains(text(endpoint, "SystemName"));
        addresses[idOf(processor ? serviceProcessorSystem : hostSystem, text(endpoint, "Name"))] =
            text(endpoint, "IPv4Address");
    }
    std::vector<InterfaceOverview> interfaces;
    for (const cimom::Instance& setting : settings) {
        const std::string whole = text(setting, "InstanceID");
        auto id = readInterfaceId(whole);
        if (!id) {
            continue;
        }
        InterfaceOverview overview;
        overview.system = std::move(id->system);
        overview.name = std::move(id->name);
        if (ipEndpoints) {
            const auto found = addresses.find(whole);
            overview.address = found == addresses.end() ? std::string() : found->second;
        }
        interfaces.push_back(std::move(overview));
    }
    return interfaces;
}

void addServed(const ServedInstances& served, std::vector<InterfaceOverview>& interfaces) {
    // By idOf().
    std::unordered_map<std::string, const cimom::Instance*> endpoints;
    std::unordered_map<std::string, std::vector<std::string>> servers;
    std::unordered_map<std::string, const cimom::Instance*> settings;
    const std::vector<cimom::Instance> nothing;
    for (const cimom::Instance& endpoint : served.endpoints ? *served.endpoints : nothing) {
        endpoints[idOfEndpoint(endpoint)] = &endpoint;
    }
    for (const cimom::Instance& point : served.accessPoints ? *served.accessPoints : nothing) {
        servers[idOfAccessPoint(point)].push_back(text(point, "AccessInfo"));
    }
    for (const cimom::Instance& setting : served.settings ? *served.settings : nothing) {
        settings[idOfSetting(setting)] = &setting;
    }
    for (InterfaceOverview& interface : interfaces) {
        const std::string id = idOf(interface.system, interface.name);
        if (served.endpoints) {
            const auto endpoint = endpoints.find(id);
            const bool there = endpoint != endpoints.end();
            if (there) {
                interface.clientState = numberOf(*endpoint->second, "ClientState");
            }
            if (!interface.leases) {
                interface.dhcp = there;
            }
        }
        if (served.accessPoints) {
            interface.servers = servers[id];
        }
        if (const auto found = settings.find(id); found != settings.end()) {
            interface.configurationName = text(*found->second, "ConfigurationName");
        } else if (served.settings) {
            interface.configurationName.emplace();
        }
    }
}

ServedInstances servedOf(const InterfaceOverview& interface, const ServedInstances& served) {
    const std::string id = idOf(interface.system, interface.name);
    return {only(id, served.endpoints, idOfEndpoint),
            only(id, served.accessPoints, idOfAccessPoint), only(id, served.settings, idOfSetting)};
}

}  // namespace cimdhcp
