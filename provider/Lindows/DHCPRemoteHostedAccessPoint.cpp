#include "Lindows/DHCPRemoteHostedAccessPoint.h"

#include "Lindows/AssociationRecord.h"
#include "Lindows/DHCPRemoteServiceAccessPoint.h"

namespace ZR::DHCPClientProvider {

const std::string loggerDHCPRemoteHostedAccessPoint = loggerCategory;

namespace {

const TraceSource source{"Lindows/DHCPRemoteHostedAccessPoint", loggerDHCPRemoteHostedAccessPoint};

}  // namespace

DHCPRemoteHostedAccessPoint::DHCPRemoteHostedAccessPoint() {
    traceMethod(ZR_HERE);
}

DHCPRemoteHostedAccessPoint::~DHCPRemoteHostedAccessPoint() {
    traceMethod(ZR_HERE);
}

Moniker DHCPRemoteHostedAccessPoint::getSystemMoniker(Moniker& remoteSAPMoniker) {
    const ParameterScope scope(ZR_HERE, " remoteSAPMoniker=", &remoteSAPMoniker);
    return findSystemMoniker(*this, remoteSAPMoniker, ZR_HERE);
}

Moniker DHCPRemoteHostedAccessPoint::getRemoteSAPMoniker(Moniker& systemMoniker) {
    const ParameterScope scope(ZR_HERE, " systemMoniker=", &systemMoniker);
    const std::string name =
        requireKey(systemMoniker, "Name", "Could not find 'Name' key in Moniker", ZR_HERE);
    DHCPRemoteServiceAccessPoint accessPoint;
    if (!walkTo(accessPoint, [&name](const auto& element) {
            return has(element, &DHCPRemoteServiceAccessPoint::getSystemName, name);
        })) {
        throw FrameworkException(
            "Could not match 'System Name' key with 'Name' key in Computer Moniker");
    }
    return monikerOf("SystemName", name);
}

}  // namespace ZR::DHCPClientProvider
