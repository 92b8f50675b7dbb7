#include "MachineFacts.h"

#include <utility>

#include "zrclient/Instrumentation.h"
#include "zrcommon/SystemName.h"

namespace ZR::DHCPClientNeighbours {

using NodeLexicon::NodeType;
using NodeLexicon::Properties;

namespace {

bool isServiceProcessor(const Instrumentation& system) {
    std::string description;
    return system.getNodeDescription(description) &&
           description == NodeLexicon::serviceProcessorDescription;
}

/// The computer two levels above an interface.
Instrumentation systemOf(const Instrumentation& interface) {
    Instrumentation node;
    node.selectParentOf(interface);
    node.selectParentOf(node);
    return node;
}

}  // namespace

std::vector<ComputerFacts> readComputers() {
    std::vector<ComputerFacts> computers;
    Instrumentation cursor;
    for (cursor.selectNode(NodeType::ComputerSystem); cursor; ++cursor) {
        ComputerFacts computer;
        if (cursor.getProperty(Properties::Name, computer.name)) {
            computer.isServiceProcessor = isServiceProcessor(cursor);
            computers.push_back(std::move(computer));
        }
    }
    return computers;
}

std::vector<InterfaceFacts> readInterfaces() {
    std::vector<InterfaceFacts> interfaces;
    const std::string hostName = getSystemName();
    Instrumentation cursor;
    for (cursor.selectNode(NodeType::NetworkInterface); cursor; ++cursor) {
        InterfaceFacts interface;
        if (!cursor.getProperty(Properties::Name, interface.name)) {
            continue;
        }
        interface.ofServiceProcessor = isServiceProcessor(systemOf(cursor));
        interface.systemName =
            interface.ofServiceProcessor ? NodeLexicon::serviceProcessorName : hostName;
        // What cannot be read stays empty or unknown.
        cursor.getProperty(Properties::IPv4Address, interface.ipv4Address);
        cursor.getProperty(Properties::AddressSource, interface.addressSource);
        interfaces.push_back(std::move(interface));
    }
    return interfaces;
}

}  // namespace ZR::DHCPClientNeighbours
