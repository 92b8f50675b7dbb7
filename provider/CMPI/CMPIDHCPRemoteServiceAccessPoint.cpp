#include "CMPI/CMPIDHCPRemoteServiceAccessPoint.h"

#include <utility>

#include "CMPI/ElementAdapter.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPRemoteServiceAccessPoint = loggerCategory;

namespace {

using Element = DHCPRemoteServiceAccessPoint;

const TraceSource source{"CMPI/CMPIDHCPRemoteServiceAccessPoint",
                         loggerCMPIDHCPRemoteServiceAccessPoint};

constexpr std::array<FilterKey<Element>, 2> filterKeys{{
    {"SystemName", Element::FilterBySystemName, true},
    {"Name", Element::FilterByName, true},
}};

constexpr std::array<PathKey<Element>, 4> pathKeys{{
    {"SystemCreationClassName", &Element::getSystemCreationClassName, nullptr},
    {"SystemName", &Element::getSystemName, nullptr},
    {"CreationClassName", &Element::getCreationClassName, nullptr},
    {"Name", &Element::getName, nullptr},
}};

constexpr std::array<ElementProperty<Element>, 9> instanceProperties{{
    property<&Element::getElementName>("ElementName"),
    property<&Element::getAccessInfo>("AccessInfo"),
    property<&Element::getOtherAccessContext>("OtherAccessContext"),
    property<&Element::getInfoFormat>("InfoFormat"),
    property<&Element::getAccessContext>("AccessContext"),
    property<&Element::getSystemCreationClassName>("SystemCreationClassName"),
    property<&Element::getSystemName>("SystemName"),
    property<&Element::getCreationClassName>("CreationClassName"),
    property<&Element::getName>("Name"),
}};

}  // namespace

CMPIDHCPRemoteServiceAccessPoint::CMPIDHCPRemoteServiceAccessPoint(const CMPIBroker* broker,
                                                                   const CMPIContext* context,
                                                                   std::string nameSpace)
    : _broker(broker), _context(context), _namespace(std::move(nameSpace)) {
    traceMethod(ZR_HERE);
}

CMPIDHCPRemoteServiceAccessPoint::CMPIDHCPRemoteServiceAccessPoint(const CMPIBroker* broker,
                                                                   const CMPIContext* context,
                                                                   const CMPIObjectPath* objectPath)
    : _broker(broker), _context(context), _namespace(ProviderUtilities::getNamespace(objectPath)) {
    const ParameterScope scope(ZR_HERE, " _broker=", _broker, " _context=", _context,
                               " objectPath=", objectPath);
    setObjectPath(objectPath);
}

CMPIDHCPRemoteServiceAccessPoint::~CMPIDHCPRemoteServiceAccessPoint() {
    traceMethod(ZR_HERE);
}

void CMPIDHCPRemoteServiceAccessPoint::setObjectPath(const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    filterByKeys(element_, objectPath, filterKeys, ZR_HERE);
}

CMPIDHCPRemoteServiceAccessPoint::operator bool() const {
    traceMethod(ZR_HERE);
    return static_cast<bool>(element_);
}

void CMPIDHCPRemoteServiceAccessPoint::operator++() {
    traceMethod(ZR_HERE);
    ++element_;
}

CMPIObjectPath* CMPIDHCPRemoteServiceAccessPoint::getObjectPath() const {
    const TraceScope scope(ZR_HERE);
    return makeObjectPath(_broker, "QVXZR_DHCPRemoteServiceAccessPoint", _namespace, element_,
                          pathKeys, ZR_HERE);
}

CMPIInstance* CMPIDHCPRemoteServiceAccessPoint::getCMPIInstance(const char** properties) const {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return makeInstance(_broker, getObjectPath(), element_, instanceProperties);
}

}  // namespace ZR::DHCPClientProvider
