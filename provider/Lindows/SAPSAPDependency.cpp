#include "Lindows/SAPSAPDependency.h"

#include "Lindows/AssociationRecord.h"
#include "Lindows/DHCPProtocolEndpoint.h"
#include "providerutilities/Classes.h"

namespace ZR::DHCPClientProvider {

const std::string loggerSAPSAPDependency = loggerCategory;

namespace {

const TraceSource source{"Lindows/SAPSAPDependency", loggerSAPSAPDependency};

struct Keys {
    std::string name;
    std::string systemName;
};

Keys readKeys(Moniker& moniker, const TracePoint& at) {
    constexpr std::array<std::string_view, 2> names{"Name", "SystemName"};
    const auto [name, systemName] = findKeys(moniker, names, at);
    if (!name && !systemName) {
        throw FrameworkException("Could not find 'Name' and 'System Name' Key in Moniker");
    }
    return {name.value_or(""), systemName.value_or("")};
}

}  // namespace

SAPSAPDependency::SAPSAPDependency() {
    traceMethod(ZR_HERE);
}

SAPSAPDependency::~SAPSAPDependency() {
    traceMethod(ZR_HERE);
}

Moniker SAPSAPDependency::getIPSAPMoniker(Moniker& moniker) {
    const ParameterScope scope(ZR_HERE, " moniker=", &moniker);
    const Keys keys = readKeys(moniker, ZR_HERE);
    Moniker endpoint;
    endpoint.addKey("Name", keys.name);
    endpoint.addKey("SystemName", keys.systemName);
    endpoint.addKey("CreationClassName", Classes::ipProtocolEndpoint.name);
    endpoint.addKey("SystemCreationClassName", Classes::computerSystem.name);
    return endpoint;
}

Moniker SAPSAPDependency::getDHCPSAPMoniker(Moniker& moniker) {
    const ParameterScope scope(ZR_HERE, " moniker=", &moniker);
    const Keys keys = readKeys(moniker, ZR_HERE);
    DHCPProtocolEndpoint endpoint;
    if (!walkTo(endpoint, [&keys](const auto& element) {
            return has(element, &DHCPProtocolEndpoint::getSystemName, keys.systemName) &&
                   has(element, &DHCPProtocolEndpoint::getName, keys.name);
        })) {
        throw FrameworkException("Could not match the key property for DHCP in Moniker");
    }
    Moniker found;
    found.addKey("Name", keys.name);
    found.addKey("SystemName", keys.systemName);
    return found;
}

bool SAPSAPDependency::getAddressOrigin(unsigned short& origin) const {
    const ParameterScope scope(ZR_HERE, " origin=", &origin);
    unsigned int addressSource = 0;
    getProperty(NodeLexicon::Properties::AddressSource, addressSource);
    traceVariable(ZR_HERE, "IPOrigin in IP Protocol", addressSource);
    origin = NodeLexicon::addressOriginOf(addressSource);
    return true;
}

}  // namespace ZR::DHCPClientProvider
