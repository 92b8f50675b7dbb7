#include "CMPI/CMPIDHCPElementCapabilities.h"

#include <array>

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPElementCapabilities = loggerCategory;

namespace {

using Row = DHCPElementCapabilitiesAssociation;
using Record = Row::Record;

constexpr std::array ownProperties{
    property<&Record::getCharacteristics>("Characteristics"),
};

CMPIObjectPath* locateDHCPProtocolEndpoint(CMPIDHCPElementCapabilities& adapter,
                                           const CMPIObjectPath* objectPath) {
    return adapter.locate<End::first>(Row::trace.at(__func__), objectPath,
                                      &Record::getDHCPEndpointMoniker);
}

CMPIObjectPath* locateCapabilities(CMPIDHCPElementCapabilities& adapter,
                                   const CMPIObjectPath* objectPath) {
    return adapter.locate<End::second>(Row::trace.at(__func__), objectPath,
                                       &Record::getDHCPCapabilitiesMoniker);
}

}  // namespace

const RowSource DHCPElementCapabilitiesAssociation::trace{
    {"CMPI/CMPIDHCPElementCapabilities", loggerCMPIDHCPElementCapabilities},
    "~CMPIDHCPElementCapabilities",
    __LINE__};

constinit const AssociationClass<DHCPElementCapabilitiesAssociation>
    DHCPElementCapabilitiesAssociation::associationClass{
        .first = {"ManagedElement", &locateDHCPProtocolEndpoint},
        .second = {"Capabilities", &locateCapabilities},
        .ownProperties = ownProperties,
        .walked = End::first,
    };

template class AssociationAdapter<DHCPElementCapabilitiesAssociation>;

}  // namespace ZR::DHCPClientProvider
