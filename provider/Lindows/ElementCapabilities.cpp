#include "Lindows/ElementCapabilities.h"

#include "Lindows/AssociationRecord.h"
#include "Lindows/DHCPProtocolEndpoint.h"

namespace ZR::DHCPClientProvider {

using NodeLexicon::NodeType;
using NodeLexicon::Properties;

const std::string loggerElementCapabilities = loggerCategory;

namespace {

const TraceSource source{"Lindows/ElementCapabilities", loggerElementCapabilities};

}  // namespace

ElementCapabilities::ElementCapabilities() {
    traceMethod(ZR_HERE);
}

ElementCapabilities::~ElementCapabilities() {
    traceMethod(ZR_HERE);
}

Moniker ElementCapabilities::getDHCPCapabilitiesMoniker(Moniker& monikerDHCPEndpoint) {
    const ParameterScope scope(ZR_HERE, " monikerDHCPEndpoint=", &monikerDHCPEndpoint);
    const std::string endpointName =
        requireKey(monikerDHCPEndpoint, "Name", "Could not find 'Name' Key in Moniker", ZR_HERE);
    // That nothing matches is not a failure: the name is then that of the last interface.
    std::string name;
    walkTo(*this, NodeType::NetworkInterface, [&](const auto& interface) {
        if (!interface.getProperty(Properties::Name, name)) {
            throw InstrumentationException("Name Property on NetworkIPConfig Node not available.");
        }
        return name == endpointName;
    });
    return monikerOf("InstanceID", name);
}

Moniker ElementCapabilities::getDHCPEndpointMoniker(Moniker& monikerCapabilities) {
    const ParameterScope scope(ZR_HERE, " monikerCapabilities=", &monikerCapabilities);
    const auto count = static_cast<unsigned>(monikerCapabilities.getKeyCount());
    unsigned keyId = count;
    std::string instanceId;
    visitKeys(monikerCapabilities, [&](std::size_t position, const std::string& name) {
        if (name != "InstanceID" || !monikerCapabilities.getValue(instanceId)) {
            return false;
        }
        keyId = static_cast<unsigned>(position);
        return true;
    });
    traceVariable(ZR_HERE, "InstanceID", instanceId);
    traceVariable(ZR_HERE, "KeyID", keyId);
    traceVariable(ZR_HERE, "count", count);
    if (keyId == count) {
        throw FrameworkException("Could not find 'InstanceID' Key in Moniker");
    }
    DHCPProtocolEndpoint endpoint;
    if (!walkTo(endpoint, [&instanceId](const auto& element) {
            return has(element, &DHCPProtocolEndpoint::getName, instanceId);
        })) {
        throw FrameworkException("Could not match 'InstanceID' Key with DHCP instance");
    }
    return monikerOf("Name", instanceId);
}

// NOLINTNEXTLINE(readability-non-const-parameter): the shape of all such getters
bool ElementCapabilities::getCharacteristics(
    std::vector<unsigned short>& /*characteristics*/) const {
    return false;
}

}  // namespace ZR::DHCPClientProvider
