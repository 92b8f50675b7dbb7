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

NeighbourObject computerObject(const ComputerFacts& computer) {
    const char* className = computer.isServiceProcessor ? serviceProcessorSystem : computerSystem;
    const unsigned short dedicated =
        computer.isServiceProcessor ? managementController : notDedicated;
    return {className,
            {{"CreationClassName", className}, {"Name", computer.name}},
            {{"ElementName", computer.name},
             {"NameFormat", std::string("Other")},
             {"Dedicated", std::vector<unsigned short>{dedicated}}}};
}

NeighbourObject endpointObject(const InterfaceFacts& interface) {
    // The class of the system is the same for the service processor's interfaces:
    // so the association names them.
    return {ipProtocolEndpoint,
            {{"SystemCreationClassName", computerSystem},
             {"SystemName", interface.systemName},
             {"CreationClassName", ipProtocolEndpoint},
             {"Name", interface.name}},
            {{"ElementName", interface.name},
             {"NameFormat", std::string("NICName")},
             {"ProtocolIFType", protocolIPv4},
             {"IPv4Address", interface.ipv4Address},
             {"AddressOrigin", NodeLexicon::addressOriginOf(interface.addressSource)}}};
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

struct NeighbourClass {
    const char* name;
    std::vector<NeighbourObject> (*objects)(const std::string& name);
};

constexpr std::array<NeighbourClass, 4> neighbourClasses{{
    {computerSystem, &computers},
    {serviceProcessorSystem, &serviceProcessors},
    {ipProtocolEndpoint, &endpoints},
    {ipAssignmentSettingData, &assignments},
}};

const NeighbourClass* find(const std::string& className) {
    const auto* found = std::find_if(
        neighbourClasses.begin(), neighbourClasses.end(),
        [&className](const NeighbourClass& entry) { return equalNames(entry.name, className); });
    return found == neighbourClasses.end() ? nullptr : found;
}

}  // namespace

const std::string* NeighbourObject::key(const std::string& name) const {
    const auto found = std::find_if(keys.begin(), keys.end(), [&name](const auto& entry) {
        return equalNames(entry.first, name);
    });
    return found == keys.end() ? nullptr : &found->second;
}

bool isNeighbourClass(const std::string& className) {
    return find(className) != nullptr;
}

std::vector<NeighbourObject> objectsOf(const std::string& className, const std::string& name) {
    const NeighbourClass* entry = find(className);
    return entry == nullptr ? std::vector<NeighbourObject>{} : entry->objects(name);
}

}  // namespace ZR::DHCPClientNeighbours
