#include "Lindows/DHCPCapabilities.h"

#include <utility>

#include "Lindows/ElementIteration.h"

namespace ZR::DHCPClientProvider {

using NodeLexicon::NodeType;
using NodeLexicon::Properties;

const std::string loggerDHCPCapabilities = loggerCategory;

namespace {

const TraceSource source{"Lindows/DHCPCapabilities", loggerDHCPCapabilities};

}  // namespace

DHCPCapabilities::DHCPCapabilities() {
    const TraceScope scope(ZR_HERE);
    cursor_.selectNode(NodeType::NetworkInterface);
}

DHCPCapabilities::~DHCPCapabilities() {
    const TraceScope scope(ZR_HERE);
}

void DHCPCapabilities::setFilter(FilterType type, std::string reference) {
    const ParameterScope scope(ZR_HERE, " filterType=", &type, " reference=", reference);
    addFilter(filtered_, filters_, type, std::move(reference));
    searchOnward(cursor_, *this);
}

DHCPCapabilities::operator bool() {
    const TraceScope scope(ZR_HERE);
    return skipToDHCPInterface(cursor_);
}

void DHCPCapabilities::operator++() {
    const TraceScope scope(ZR_HERE);
    stepOnward(cursor_, filtered_, *this);
}

bool DHCPCapabilities::evaluate() const {
    const TraceScope scope(ZR_HERE);
    return holdsByInstanceID(filters_, *this, FilterByInstanceID, ZR_HERE);
}

bool DHCPCapabilities::getInstanceID(std::string& value) const {
    const ParameterScope scope(ZR_HERE, " value=", &value);
    return getElementName(value);
}

bool DHCPCapabilities::getElementName(std::string& value) const {
    fromNode(ZR_HERE, cursor_, Properties::Name, value);
    return true;
}

bool DHCPCapabilities::getOptionsSupported(std::vector<unsigned short>& value) const {
    return appendOptions(ZR_HERE, value);
}

bool DHCPCapabilities::getMaxElementNameLen(unsigned short& value) const {
    unsigned int length = 0;
    if (!fromNode(ZR_HERE, cursor_, Properties::NameMaxLength, length)) {
        return false;
    }
    value = static_cast<unsigned short>(length);
    return true;
}

bool DHCPCapabilities::getElementNameEditSupported(bool& value) const {
    const ParameterScope scope(ZR_HERE, " value=", &value);
    if (!cursor_.isPropertyReadOnly(Properties::Name, value)) {
        return false;
    }
    value = !value;
    return true;
}

bool DHCPCapabilities::getRequestedStatesSupported(std::vector<unsigned short>& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPCapabilities::getElementNameMask(std::string& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPCapabilities::getStateAwareness(std::vector<unsigned short>& value) const {
    return unsupported(ZR_HERE, &value);
}

}  // namespace ZR::DHCPClientProvider
