#include "Lindows/DHCPOrderedComponent.h"

#include "Lindows/AssociationRecord.h"
#include "Lindows/DHCPSettingData.h"

namespace ZR::DHCPClientProvider {

using NodeLexicon::NodeType;
using NodeLexicon::Properties;

const std::string loggerDHCPOrderedComponent = loggerCategory;

namespace {

const TraceSource source{"Lindows/DHCPOrderedComponent", loggerDHCPOrderedComponent};

}  // namespace

DHCPOrderedComponent::DHCPOrderedComponent() {
    traceMethod(ZR_HERE);
}

DHCPOrderedComponent::~DHCPOrderedComponent() {
    traceMethod(ZR_HERE);
}

Moniker DHCPOrderedComponent::getGroupComponentMoniker(Moniker& dhcpDataMoniker) {
    const ParameterScope scope(ZR_HERE, " dhcpDataMoniker=", &dhcpDataMoniker);
    const std::string instanceId =
        requireKey(dhcpDataMoniker, "InstanceID", "Could not find 'InstanceID' property", ZR_HERE);
    std::vector<std::string> pieces;
    stringTokenize(instanceId, pieces, "%");
    if (!walkTo(*this, NodeType::NetworkInterface, [&pieces](const auto& interface) {
            std::string name;
            // An InstanceID without a second piece matches no interface.
            return interface.getProperty(Properties::Name, name) && pieces.size() > 1 &&
                   name == pieces[1];
        })) {
        throw FrameworkException("Could not get 'Instance ID' key");
    }
    return monikerOf("InstanceID", instanceId + "%dhcp");
}

Moniker DHCPOrderedComponent::getPartComponentMoniker(Moniker& ipSettingDataMoniker) {
    const ParameterScope scope(ZR_HERE, " ipSettingDataMoniker=", &ipSettingDataMoniker);
    // The text names another key than the one sought; clients know it.
    const std::string instanceId = requireKey(ipSettingDataMoniker, "InstanceID",
                                              "Could not find 'Name' key in Moniker", ZR_HERE);
    // Without a "%", both are the whole InstanceID.
    const std::size_t last = instanceId.rfind('%');
    const std::string isDhcp = last == std::string::npos ? instanceId : instanceId.substr(last + 1);
    const std::string setting_instanceId = instanceId.substr(0, last);
    traceVariable(ZR_HERE, "isDhcp", isDhcp);
    traceVariable(ZR_HERE, "setting_instanceId", setting_instanceId);
    if (isDhcp != "dhcp") {
        throw FrameworkException("AssignmentSetting data is not dhcp");
    }
    DHCPSettingData setting;
    if (!walkTo(setting, [&](const auto& element) {
            return has(element, &DHCPSettingData::getInstanceID, setting_instanceId);
        })) {
        throw FrameworkException("Could not get InstanceID");
    }
    return monikerOf("InstanceID", setting_instanceId);
}

bool DHCPOrderedComponent::getAssignedSequence(unsigned long long& sequence) const {
    sequence = 1;
    return true;
}

}  // namespace ZR::DHCPClientProvider
