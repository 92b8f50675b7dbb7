#include "Lindows/DHCPProtocolEndpoint.h"

#include <utility>

#include "Lindows/ElementIteration.h"
#include "providerutilities/Classes.h"

namespace ZR::DHCPClientProvider {

using NodeLexicon::NodeType;
using NodeLexicon::Properties;

const std::string loggerDHCPProtocolEndpoint = loggerCategory;

namespace {

const TraceSource source{"Lindows/DHCPProtocolEndpoint", loggerDHCPProtocolEndpoint};

// Values of EnabledState and RequestedState, and of ClientState (CIM 2.41).
constexpr unsigned short stateEnabled = 2;
constexpr unsigned short stateDisabled = 3;
constexpr unsigned short stateEnabledButOffline = 6;
constexpr unsigned short clientUnknown = 0;
constexpr unsigned short clientInitReboot = 6;
constexpr unsigned short clientBound = 8;

constexpr unsigned int interfaceActive = 1;

}  // namespace

DHCPProtocolEndpoint::DHCPProtocolEndpoint() {
    const TraceScope scope(ZR_HERE);
    cursor_.selectNode(NodeType::NetworkInterface);
}

DHCPProtocolEndpoint::~DHCPProtocolEndpoint() {
    const TraceScope scope(ZR_HERE);
}

void DHCPProtocolEndpoint::setFilter(FilterType type, std::string reference) {
    const ParameterScope scope(ZR_HERE, " filterType=", &type, " reference=", reference);
    addFilter(filtered_, filters_, type, std::move(reference));
    cursor_.selectNode(NodeType::NetworkInterface);
    searchOnward(cursor_, *this);
}

DHCPProtocolEndpoint::operator bool() {
    const TraceScope scope(ZR_HERE);
    return skipToDHCPInterface(cursor_);
}

void DHCPProtocolEndpoint::operator++() {
    const TraceScope scope(ZR_HERE);
    stepOnward(cursor_, filtered_, *this);
}

bool DHCPProtocolEndpoint::evaluate() const {
    const TraceScope scope(ZR_HERE);
    for (const Filter& filter : filters_) {
        std::string actual;
        if (filter.type == FilterBySystemName) {
            // A system name that cannot be had counts as held.
            if (getSystemName(actual) && !equalsReference(actual, filter.reference, ZR_HERE)) {
                return false;
            }
        } else if (filter.type == FilterByName) {
            getName(actual);
            if (!equalsReference(actual, filter.reference, ZR_HERE)) {
                return false;
            }
        }
    }
    return true;
}

bool DHCPProtocolEndpoint::getName(std::string& value) const {
    fromNode(ZR_HERE, cursor_, Properties::Name, value);
    return true;
}

bool DHCPProtocolEndpoint::getElementName(std::string& value) const {
    return fromNode(ZR_HERE, cursor_, Properties::Name, value);
}

bool DHCPProtocolEndpoint::getSystemName(std::string& value) const {
    const ParameterScope scope(ZR_HERE, " value=", &value);
    if (readSystemDescription(cursor_, ZR_HERE, "nodeString") ==
        NodeLexicon::serviceProcessorDescription) {
        value = NodeLexicon::serviceProcessorName;
        return true;
    }
    return readHostName(value, ZR_HERE);
}

bool DHCPProtocolEndpoint::getCreationClassName(std::string& value) const {
    return constant(ZR_HERE, value, Classes::dhcpProtocolEndpoint.name);
}

bool DHCPProtocolEndpoint::getSystemCreationClassName(std::string& value) const {
    const ParameterScope scope(ZR_HERE, " value=", &value);
    value = systemClassOf(readSystemDescription(cursor_, ZR_HERE, "nodeString"));
    return true;
}

bool DHCPProtocolEndpoint::getDescription(std::string& value) const {
    const ParameterScope scope(ZR_HERE, " value=", &value);
    cursor_.getNodeDescription(value);
    return true;
}

bool DHCPProtocolEndpoint::getNameFormat(std::string& value) const {
    return constant(ZR_HERE, value, "NICName");
}

bool DHCPProtocolEndpoint::getOtherTypeDescription(std::string& value) const {
    return constant(ZR_HERE, value, "DHCP");
}

bool DHCPProtocolEndpoint::getProtocolIFType(unsigned short& value) const {
    constexpr unsigned short other = 1;
    return constant(ZR_HERE, value, other);
}

bool DHCPProtocolEndpoint::getRequestedState(unsigned short& value) const {
    const ParameterScope scope(ZR_HERE, " value=", &value);
    // What cannot be read is not enabled.
    bool enabled = false;
    cursor_.getProperty(Properties::DHCPEnabled, enabled);
    value = enabled ? stateEnabled : stateDisabled;
    return true;
}

bool DHCPProtocolEndpoint::getEnabledState(unsigned short& value) const {
    const ParameterScope scope(ZR_HERE, " value=", &value);
    // An address source that cannot be read is one that is not DHCP.
    unsigned int addressSource = 0;
    cursor_.getProperty(Properties::AddressSource, addressSource);
    if (addressSource != static_cast<unsigned int>(NodeLexicon::AddressSource::DHCP)) {
        value = stateDisabled;
        return true;
    }
    unsigned int interfaceState = 0;
    if (cursor_.getProperty(Properties::InterfaceState, interfaceState)) {
        value = interfaceState == interfaceActive ? stateEnabled : stateDisabled;
    }
    return true;
}

bool DHCPProtocolEndpoint::getClientState(unsigned short& value) const {
    const ParameterScope scope(ZR_HERE, " value=", &value);
    unsigned short enabledState = 0;
    getEnabledState(enabledState);
    if (enabledState == stateDisabled) {
        value = clientUnknown;
    } else if (enabledState == stateEnabledButOffline) {
        value = clientInitReboot;
    } else if (enabledState == stateEnabled) {
        value = clientBound;
    }
    return true;
}

bool DHCPProtocolEndpoint::getOptionsReceived(std::vector<unsigned short>& value) const {
    return appendOptions(ZR_HERE, value);
}

bool DHCPProtocolEndpoint::getCaption(std::string& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPProtocolEndpoint::getInstallDate(std::string& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPProtocolEndpoint::getStatusDescriptions(std::vector<std::string>& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPProtocolEndpoint::getHealthState(unsigned short& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPProtocolEndpoint::getPrimaryStatus(unsigned short& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPProtocolEndpoint::getDetailedStatus(unsigned short& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPProtocolEndpoint::getOperatingStatus(unsigned short& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPProtocolEndpoint::getCommunicationStatus(unsigned short& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPProtocolEndpoint::getOtherEnabledState(std::string& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPProtocolEndpoint::getEnabledDefault(unsigned short& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPProtocolEndpoint::getAvailableRequestedStates(std::vector<unsigned short>& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPProtocolEndpoint::getTransitioningToState(unsigned short& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPProtocolEndpoint::getOperationalStatus(std::vector<unsigned short>& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPProtocolEndpoint::getTimeOfLastStateChange(std::string& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPProtocolEndpoint::getBroadcastResetSupported(bool& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPProtocolEndpoint::getRenewalTime(unsigned int& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPProtocolEndpoint::getRebindingTime(unsigned int& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPProtocolEndpoint::getLeaseTime(unsigned int& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPProtocolEndpoint::getLeaseObtained(std::string& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPProtocolEndpoint::getLeaseExpires(std::string& value) const {
    return unsupported(ZR_HERE, &value);
}

}  // namespace ZR::DHCPClientProvider
