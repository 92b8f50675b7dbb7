#include "CMPI/CMPIDHCPAssignmentSettingData.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPAssignmentSettingData = loggerCategory;

const RowSource DHCPAssignmentSettingDataRow::trace{
    {"CMPI/CMPIDHCPAssignmentSettingData", loggerCMPIDHCPAssignmentSettingData},
    "~CMPIDHCPAssignmentSettingData",
    __LINE__};

template class ReferencedAdapter<DHCPAssignmentSettingDataRow>;

}  // namespace ZR::DHCPClientProvider
