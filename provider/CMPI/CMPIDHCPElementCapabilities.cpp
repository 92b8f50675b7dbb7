#include "CMPI/CMPIDHCPElementCapabilities.h"

#include <array>

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPElementCapabilities = loggerCategory;

namespace {

using Record = DHCPElementCapabilitiesAssociation::Record;

constexpr std::array ownProperties{
    property<&Record::getCharacteristics>("Characteristics"),
};

}  // namespace

const RowSource DHCPElementCapabilitiesAssociation::trace{
    {"CMPI/CMPIDHCPElementCapabilities", loggerCMPIDHCPElementCapabilities},
    "~CMPIDHCPElementCapabilities",
    __LINE__};

const AssociationClass<DHCPElementCapabilitiesAssociation::Record>
    DHCPElementCapabilitiesAssociation::associationClass{
        "QVXZR_DHCPElementCapabilities",
        6,
        {"ManagedElement", 4, "QVXZR_DHCPProtocolEndpoint", "CIM_DHCPProtocolEndpoint",
         "locateDHCPProtocolEndpoint", &Record::getDHCPEndpointMoniker},
        {"Capabilities", 5, "QVXZR_DHCPCapabilities", "CIM_DHCPCapabilities", "locateCapabilities",
         &Record::getDHCPCapabilitiesMoniker},
        ownProperties,
    };

template class AssociationAdapter<DHCPElementCapabilitiesAssociation>;

}  // namespace ZR::DHCPClientProvider
