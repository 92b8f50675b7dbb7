#include "NeighbourObjects.h"

#include <algorithm>
#include <array>

#include "zrclient/NodeLexicon.h"
#include "zrcommon/Strings.h"

namespace ZR::DHCPClientNeighbours {

namespace {

constexpr const char* computerSystem = "QVXZR_ComputerSystem";
constexpr const char* serviceProcessorSystem = "QVXZR_SPComputerSystem";
constexpr const char* ipProtocolEndpoint = "QVXZR_IPProtocolEndpoint";
constexpr const char* ipAssignmentSettingData = "QVXZR_IPAssignmentSettingData";

// Values of the schema's value maps (CIM 2.41).
constexpr unsigned short notDedicated = 0;
constexpr unsigned short managementController = 28;
constexpr unsigned short protocolIPv4 = 4096;
constexpr unsigned short originDHCP =
    NodeLexicon::addressOriginOf(static_cast<unsigned int>(NodeLexicon::AddressSource::DHCP));

/// What an enabled element may have a state of, and these are not known to have.
void addUnknownStates(NeighbourObject& object) {
    for (const char* name :
         {"EnabledState", "RequestedState", "EnabledDefault", "TransitioningToState"}) {
        object.properties.emplace_back(name, std::monostate{});
    }
}

NeighbourObject computerObject(const ComputerFacts& computer) {
    const char* className = computer.isServiceProcessor ? serviceProcessorSystem : computerSystem;
    const unsigned short dedicated =
        computer.isServiceProcessor ? managementController : notDedicated;
    NeighbourObject object{className,
                           {{"CreationClassName", className}, {"Name", computer.name}},
                           {{"ElementName", computer.name},
                            {"NameFormat", std::string("Other")},
                            {"Dedicated", std::vector<unsigned short>{dedicated}}}};
    addUnknownStates(object);
    return object;
}

NeighbourObject endpointObject(const InterfaceFacts& interface) {
    // The class of the system is the same for the service processor's interfaces:
    // so the association names them.
    NeighbourObject object{
        ipProtocolEndpoint,
        {{"SystemCreationClassName", computerSystem},
         {"SystemName", interface.systemName},
         {"CreationClassName", ipProtocolEndpoint},
         {"Name", interface.name}},
        {{"ElementName", interface.name},
         {"NameFormat", std::string("NICName")},
         {"ProtocolIFType", protocolIPv4},
         {"IPv4Address", interface.ipv4Address},
         {"AddressOrigin", NodeLexicon::addressOriginOf(interface.addressSource)}}};
    addUnknownStates(object);
    return object;
}

NeighbourObject assignmentObject(const InterfaceFacts& interface) {
    const std::string system = interface.ofServiceProcessor
                                   ? NodeLexicon::serviceProcessorDescription
                                   : NodeLexicon::hostDescription;
    return {ipAssignmentSettingData,
            {{"InstanceID", system + "%" + interface.name + "%dhcp"}},
            {{"ElementName", interface.name}, {"AddressOrigin", originDHCP}}};
}

std::vector<NeighbourObject> computers(const std::string& name) {
    std::vector<NeighbourObject> objects;
    for (const ComputerFacts& computer : readComputers()) {
        if (name.empty() ? !computer.isServiceProcessor : computer.name == name) {
            objects.push_back(computerObject(computer));
        }
    }
    return objects;
}

std::vector<NeighbourObject> serviceProcessors(const std::string& /*name*/) {
    std::vector<NeighbourObject> objects;
    for (const ComputerFacts& computer : readComputers()) {
        if (computer.isServiceProcessor) {
            objects.push_back(computerObject(computer));
        }
    }
    return objects;
}

std::vector<NeighbourObject> endpoints(const std::string& /*name*/) {
    std::vector<NeighbourObject> objects;
    for (const InterfaceFacts& interface : readInterfaces()) {
        if (!interface.ipv4Address.empty()) {
            objects.push_back(endpointObject(interface));
        }
    }
    return objects;
}

std::vector<NeighbourObject> assignments(const std::string& /*name*/) {
    std::vector<NeighbourObject> objects;
    for (const InterfaceFacts& interface : readInterfaces()) {
        objects.push_back(assignmentObject(interface));
    }
    return objects;
}

constexpr std::array computerKeys{"CreationClassName", "Name"};
constexpr std::array endpointKeys{"SystemCreationClassName", "SystemName", "CreationClassName",
                                  "Name"};
constexpr std::array assignmentKeys{"InstanceID"};

struct NeighbourClass {
    const char* name;
    std::span<const char* const> keys;
    std::vector<NeighbourObject> (*objects)(const std::string& name);
};

constexpr std::array<NeighbourClass, 4> neighbourClasses{{
    {computerSystem, computerKeys, &computers},
    {serviceProcessorSystem, computerKeys, &serviceProcessors},
    {ipProtocolEndpoint, endpointKeys, &endpoints},
    {ipAssignmentSettingData, assignmentKeys, &assignments},
}};

const NeighbourClass* find(const std::string& className) {
    const auto* found = std::find_if(
        neighbourClasses.begin(), neighbourClasses.end(),
        [&className](const NeighbourClass& entry) { return equalNames(entry.name, className); });
    return found == neighbourClasses.end() ? nullptr : found;
}

}  // namespace

bool isNeighbourClass(const std::string& className) {
    return find(className) != nullptr;
}

std::span<const char* const> keysOf(const std::string& className) {
    const NeighbourClass* entry = find(className);
    return entry == nullptr ? std::span<const char* const>{} : entry->keys;
}

std::vector<NeighbourObject> objectsOf(const std::string& className, const std::string& name) {
    const NeighbourClass* entry = find(className);
    return entry == nullptr ? std::vector<NeighbourObject>{} : entry->objects(name);
}

}  // namespace ZR::DHCPClientNeighbours
