#include "CMPI/CMPIIPProtocolEndpoint.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIIPProtocolEndpoint = loggerCategory;

const RowSource IPProtocolEndpointRow::trace{
    {"CMPI/CMPIIPProtocolEndpoint", loggerCMPIIPProtocolEndpoint},
    "~CMPIIPProtocolEndpoint",
    __LINE__};

template class ReferencedAdapter<IPProtocolEndpointRow>;

}  // namespace ZR::DHCPClientProvider
