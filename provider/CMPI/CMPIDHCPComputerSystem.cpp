#include "CMPI/CMPIDHCPComputerSystem.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPComputerSystem = loggerCategory;

const RowSource DHCPComputerSystemRow::trace{
    {"CMPI/CMPIDHCPComputerSystem", loggerCMPIDHCPComputerSystem},
    "~CMPIDHCPComputerSystem",
    __LINE__};

template class ReferencedAdapter<DHCPComputerSystemRow>;

}  // namespace ZR::DHCPClientProvider
