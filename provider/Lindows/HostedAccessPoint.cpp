#include "Lindows/HostedAccessPoint.h"

#include "Lindows/AssociationRecord.h"

namespace ZR::DHCPClientProvider {

const std::string loggerDHCPHostedAccessPoint = loggerCategory;

namespace {

const TraceSource source{"Lindows/HostedAccessPoint", loggerDHCPHostedAccessPoint};

}  // namespace

DHCPHostedAccessPoint::DHCPHostedAccessPoint() {
    traceMethod(ZR_HERE);
}

DHCPHostedAccessPoint::~DHCPHostedAccessPoint() {
    traceMethod(ZR_HERE);
}

Moniker DHCPHostedAccessPoint::getDHCPProtocolEndPointMoniker(Moniker& moniker) {
    const ParameterScope scope(ZR_HERE, " moniker=", &moniker);
    return monikerOf("SystemName",
                     requireKey(moniker, "Name", "Could not find 'Name' key in Moniker", ZR_HERE));
}

Moniker DHCPHostedAccessPoint::getSystemMoniker(Moniker& endPointMoniker) {
    const ParameterScope scope(ZR_HERE, " endPointMoniker=", &endPointMoniker);
    return findSystemMoniker(*this, endPointMoniker, ZR_HERE);
}

}  // namespace ZR::DHCPClientProvider
