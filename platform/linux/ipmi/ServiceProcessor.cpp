#include "ipmi/ServiceProcessor.h"

#include <array>
#include <vector>

#include "formats/InterfaceName.h"

namespace ZR::Live {
namespace {

using NodeLexicon::AddressSource;
using NodeLexicon::Properties;

constexpr std::uint8_t dhcp = 2;

/// By IPMI's number (IPMI 2.0, table 23-4). There is none for BOOTP or link-local.
constexpr std::array sources{AddressSource::Unknown, AddressSource::Static, AddressSource::DHCP,
                             AddressSource::Other, AddressSource::Other};

AddressSource sourceOf(const LanChannel& lan) {
    return lan.addressSource && *lan.addressSource < sources.size() ? sources[*lan.addressSource]
                                                                    : AddressSource::Unknown;
}

}  // namespace

void addServiceProcessor(const ServiceProcessor& processor, SnapshotBuilder& tree) {
    const auto computer =
        tree.add(Snapshot::none, "ComputerSystem", NodeLexicon::serviceProcessorDescription);
    tree.property(Properties::Name, NodeLexicon::serviceProcessorName);
    if (!processor.lan) {
        return;
    }
    const LanChannel& lan = *processor.lan;
    const auto network = tree.add(computer, "Network", "Network");
    tree.add(network, "NetworkInterface", "Ethernet interface");
    tree.property(Properties::Name, "bmc-lan" + std::to_string(lan.channel), true);
    tree.property(Properties::NameMaxLength,
                  std::uint64_t{InterfaceName::maxLength});  // as of the kernel's links
    // IPMI does not tell the state of the link, which is thus left out.
    if (lan.address) {
        tree.property(Properties::IPv4Address, lan.address->text());
    }
    if (lan.addressSource) {
        tree.property(Properties::DHCPEnabled, *lan.addressSource == dhcp);
    }
    tree.property(Properties::AddressSource,
                  std::uint64_t{static_cast<unsigned int>(sourceOf(lan))});
    // No parameter of IPMI tells which server the processor has its address from.
    tree.property(Properties::DHCPServerAddresses, std::vector<std::string>{});
}

}  // namespace ZR::Live
