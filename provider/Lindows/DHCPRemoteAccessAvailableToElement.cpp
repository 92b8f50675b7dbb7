#include "Lindows/DHCPRemoteAccessAvailableToElement.h"

#include "Lindows/AssociationRecord.h"
#include "Lindows/DHCPRemoteServiceAccessPoint.h"
#include "providerutilities/Classes.h"

namespace ZR::DHCPClientProvider {

using NodeLexicon::NodeType;
using NodeLexicon::Properties;

const std::string loggerDHCPRemoteAccessAvailableToElement = loggerCategory;

namespace {

const TraceSource source{"Lindows/DHCPRemoteAccessAvailableToElement",
                         loggerDHCPRemoteAccessAvailableToElement};

constexpr const char* noNameKey = "Could not find 'Name' Key in Moniker";

}  // namespace

DHCPRemoteAccessAvailableToElement::DHCPRemoteAccessAvailableToElement() {
    traceMethod(ZR_HERE);
}

DHCPRemoteAccessAvailableToElement::~DHCPRemoteAccessAvailableToElement() {
    traceMethod(ZR_HERE);
}

Moniker DHCPRemoteAccessAvailableToElement::getRemoteServiceAccessPointMoniker(
    Moniker& monikerDHCPEndpoint) {
    const ParameterScope scope(ZR_HERE, " monikerDHCPEndpoint=", &monikerDHCPEndpoint);
    const std::string endpointName = requireKey(monikerDHCPEndpoint, "Name", noNameKey, ZR_HERE);
    DHCPRemoteServiceAccessPoint accessPoint;
    std::string accessPointName;
    const TracePoint at = ZR_HERE;
    // One malformed name on the way ends the whole search.
    if (!walkTo(accessPoint, [&](const auto& element) {
            accessPointName.clear();
            element.getName(accessPointName);
            return interfaceOfAccessPoint(accessPointName, at) == endpointName;
        })) {
        // It is the access point that is missing; clients know the text.
        throw InstrumentationException("Concerned DHCP Protocol Endpoint Could Not Be Found.");
    }
    orderOfAccess_ = static_cast<unsigned short>(accessPoint.getOrderOfAccess());
    return monikerOf("Name", accessPointName);
}

Moniker DHCPRemoteAccessAvailableToElement::getDHCPProtocolEndpointMoniker(
    Moniker& accesspointmoniker) {
    const ParameterScope scope(ZR_HERE, " accesspointmoniker=", &accesspointmoniker);
    const TracePoint at = ZR_HERE;
    constexpr std::array<std::string_view, 3> names{"Name", "SystemCreationClassName",
                                                    "SystemName"};
    const auto [name, systemClass, systemName] = findKeys(accesspointmoniker, names, at);
    if (!name) {
        throw FrameworkException(noNameKey);
    }
    const std::string nameKey = interfaceOfAccessPoint(*name, at);
    std::vector<std::string> servers;
    if (!walkTo(*this, NodeType::NetworkInterface, [&](const auto& interface) {
            std::string interfaceName;
            return interface.getProperty(Properties::Name, interfaceName) &&
                   interfaceName == nameKey &&
                   interface.getProperty(Properties::DHCPServerAddresses, servers);
        })) {
        // It is a DHCP endpoint that is missing; clients know the text.
        throw InstrumentationException("Concerned IP Protocol Endpoint Could Not Be Found.");
    }
    if (servers.size() > 1) {
        orderOfAccess_ = 0;
    }
    Moniker endpoint;
    endpoint.addKey("Name", nameKey);
    endpoint.addKey("SystemName", systemName.value_or(""));
    endpoint.addKey("SystemCreationClassName", systemClass.value_or(""));
    endpoint.addKey("CreationClassName", Classes::dhcpProtocolEndpoint.name);
    return endpoint;
}

bool DHCPRemoteAccessAvailableToElement::getOrderOfAccess(unsigned short& order) const {
    const ParameterScope scope(ZR_HERE, " order=", &order);
    order = orderOfAccess_;
    return true;
}

}  // namespace ZR::DHCPClientProvider
