#include "Lindows/DHCPElementSettingData.h"

#include "Lindows/AssociationRecord.h"
#include "Lindows/DHCPProtocolEndpoint.h"
#include "Lindows/DHCPSettingData.h"

namespace ZR::DHCPClientProvider {

const std::string loggerDHCPElementSettingData = loggerCategory;

namespace {

const TraceSource source{"Lindows/DHCPElementSettingData", loggerDHCPElementSettingData};

/// The second "%"-separated piece of a setting's InstanceID: the interface name.
std::optional<std::string> interfaceOf(const std::string& instanceId) {
    std::vector<std::string> pieces;
    stringTokenize(instanceId, pieces, "%");
    return pieces.size() < 2 ? std::nullopt : std::optional(pieces[1]);
}

}  // namespace

DHCPElementSettingData::DHCPElementSettingData() {
    traceMethod(ZR_HERE);
}

DHCPElementSettingData::~DHCPElementSettingData() {
    traceMethod(ZR_HERE);
}

Moniker DHCPElementSettingData::getDHCPSettingDataMoniker(Moniker& dhcpEndpointMoniker) {
    const ParameterScope scope(ZR_HERE, " dhcpEndpointMoniker=", &dhcpEndpointMoniker);
    const std::string name =
        requireKey(dhcpEndpointMoniker, "Name", "Could not find 'Name' key in Moniker", ZR_HERE);
    DHCPSettingData setting;
    std::string instanceId;
    if (!walkTo(setting, [&](const auto& element) {
            return element.getInstanceID(instanceId) && interfaceOf(instanceId) == name;
        })) {
        throw FrameworkException("Could not get 'Instance ID' key");
    }
    return monikerOf("InstanceID", instanceId);
}

Moniker DHCPElementSettingData::getManagedElementMoniker(Moniker& dhcpSettingDataMoniker) {
    const ParameterScope scope(ZR_HERE, " dhcpSettingDataMoniker=", &dhcpSettingDataMoniker);
    // The text names another key than the one sought; clients know it.
    const std::string instanceId = requireKey(dhcpSettingDataMoniker, "InstanceID",
                                              "Could not find 'Name' key in Moniker", ZR_HERE);
    const std::optional<std::string> name = interfaceOf(instanceId);
    if (!name) {
        throw FrameworkException("Instance ID Property value is not correct");
    }
    DHCPProtocolEndpoint endpoint;
    if (!walkTo(endpoint, [&name](const auto& element) {
            return has(element, &DHCPProtocolEndpoint::getName, *name);
        })) {
        throw FrameworkException("Could not get 'System Name' and  'Name' key");
    }
    Moniker found;
    std::string value;
    if (endpoint.getSystemCreationClassName(value)) {
        found.addKey("SystemCreationClassName", value);
    }
    if (endpoint.getSystemName(value)) {
        found.addKey("SystemName", value);
    }
    found.addKey("Name", *name);
    return found;
}

bool DHCPElementSettingData::getIsCurrent(unsigned short& isCurrent) const {
    isCurrent = 1;
    return true;
}

}  // namespace ZR::DHCPClientProvider
