#include "Lindows/DHCPRemoteServiceAccessPoint.h"

#include "Lindows/ElementIteration.h"
#include "providerutilities/Classes.h"
#include "zrcommon/SystemName.h"

namespace ZR::DHCPClientProvider {

using NodeLexicon::NodeType;
using NodeLexicon::Properties;

const std::string loggerDHCPRemoteServiceAccessPoint = loggerCategory;

namespace {

const TraceSource source{"Lindows/DHCPRemoteServiceAccessPoint",
                         loggerDHCPRemoteServiceAccessPoint};

// Values of InfoFormat (CIM 2.41).
constexpr unsigned short formatIPv4Address = 3;
constexpr unsigned short formatIPv6Address = 4;

}  // namespace

DHCPRemoteServiceAccessPoint::DHCPRemoteServiceAccessPoint() {
    const TraceScope scope(ZR_HERE);
    cursor_.selectNode(NodeType::NetworkInterface);
    loadAddresses();
}

DHCPRemoteServiceAccessPoint::~DHCPRemoteServiceAccessPoint() {
    const TraceScope scope(ZR_HERE);
}

/// Loads the addresses of the first interface from the present one on that has any.
void DHCPRemoteServiceAccessPoint::loadAddresses() {
    for (; cursor_; ++cursor_) {
        serverAddresses_.clear();
        if (cursor_.getProperty(Properties::DHCPServerAddresses, serverAddresses_) &&
            !serverAddresses_.empty()) {
            return;
        }
    }
    serverAddresses_.clear();
}

bool DHCPRemoteServiceAccessPoint::isIPv6() const {
    return serverAddresses_[addressIndex_].find(':') != std::string::npos;
}

void DHCPRemoteServiceAccessPoint::setFilter(FilterType type, const std::string& reference) {
    const ParameterScope scope(ZR_HERE, " filterType=", &type, " reference=", reference);
    addFilter(filtered_, filters_, type, reference);
    searchOnward(cursor_, *this);
}

DHCPRemoteServiceAccessPoint::operator bool() const {
    const TraceScope scope(ZR_HERE);
    return isOnRecord();
}

void DHCPRemoteServiceAccessPoint::operator++() {
    const TraceScope scope(ZR_HERE);
    do {
        ++addressIndex_;
        if (!isOnRecord()) {
            ++cursor_;
            addressIndex_ = 0;
            loadAddresses();
        }
    } while (cursor_ && filtered_ && !evaluate());
}

bool DHCPRemoteServiceAccessPoint::evaluate() const {
    const TraceScope scope(ZR_HERE);
    // Set by a system name filter and compared by a name filter behind it. Without
    // the former it is empty; records of plain interface names are accepted all the
    // same, since only a name with a "_" of its own is compared at all.
    std::string working;
    for (const Filter& filter : filters_) {
        if (filter.type == FilterBySystemName) {
            working = ZR::getSystemName();
            if (!equalsReference(working, filter.reference, ZR_HERE)) {
                return false;
            }
        } else if (filter.type == FilterByName) {
            std::string name;
            if (!cursor_.getProperty(Properties::Name, name)) {
                continue;
            }
            const std::size_t nameEnd = name.rfind('_');
            const std::size_t referenceEnd = filter.reference.rfind('_');
            if (nameEnd == std::string::npos || referenceEnd == std::string::npos) {
                continue;
            }
            const std::string filterName = filter.reference.substr(0, referenceEnd);
            const std::string actualName = working.substr(0, nameEnd);
            traceVariable(ZR_HERE, "filterName", filterName);
            traceVariable(ZR_HERE, "actualName", actualName);
            if (filterName != actualName) {
                return false;
            }
        }
    }
    return true;
}

bool DHCPRemoteServiceAccessPoint::getName(std::string& value) const {
    fromNode(ZR_HERE, cursor_, Properties::Name, value);
    value += isIPv6() ? "_IPv6" : "_IPv4";
    return true;
}

bool DHCPRemoteServiceAccessPoint::getSystemName(std::string& value) const {
    const ParameterScope scope(ZR_HERE, " value=", &value);
    return readHostName(value, ZR_HERE);
}

bool DHCPRemoteServiceAccessPoint::getCreationClassName(std::string& value) const {
    return constant(ZR_HERE, value, Classes::dhcpRemoteServiceAccessPoint.name);
}

bool DHCPRemoteServiceAccessPoint::getSystemCreationClassName(std::string& value) const {
    const ParameterScope scope(ZR_HERE, " value=", &value);
    value = systemClassOf(readSystemDescription(cursor_, ZR_HERE, "nodeString"));
    traceVariable(ZR_HERE, " systemCreationClassName=", value);
    return true;
}

bool DHCPRemoteServiceAccessPoint::getElementName(std::string& value) const {
    return constant(ZR_HERE, value, "DHCP Server");
}

bool DHCPRemoteServiceAccessPoint::getAccessInfo(std::string& value) const {
    const ParameterScope scope(ZR_HERE, " value=", &value);
    if (!isOnRecord()) {
        return false;
    }
    value = serverAddresses_[addressIndex_];
    return true;
}

bool DHCPRemoteServiceAccessPoint::getInfoFormat(unsigned short& value) const {
    return constant(ZR_HERE, value, isIPv6() ? formatIPv6Address : formatIPv4Address);
}

bool DHCPRemoteServiceAccessPoint::getAccessContext(unsigned short& value) const {
    // The schema's name for this value is another server's; clients know it.
    constexpr unsigned short dhcpServer = 7;
    return constant(ZR_HERE, value, dhcpServer);
}

unsigned int DHCPRemoteServiceAccessPoint::getOrderOfAccess() const {
    const TraceScope scope(ZR_HERE);
    return static_cast<unsigned int>(serverAddresses_.size());
}

bool DHCPRemoteServiceAccessPoint::getOtherAccessContext(std::string& value) const {
    return unsupported(ZR_HERE, &value);
}

}  // namespace ZR::DHCPClientProvider
