#pragma once

#include "CMPI/ReferencedAdapter.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPAssignmentSettingData;

struct DHCPAssignmentSettingDataRow {
    static constexpr const Classes::Class& servedClass = Classes::ipAssignmentSettingData;
    static const RowSource trace;
    // The text is the IP endpoint's; clients know it.
    static constexpr const char* refusal = noIPProtocolEndpoint;
    static constexpr bool asksBeforeFirst = false;
    static constexpr bool asksBeforeNext = false;
    static constexpr bool fetchesSingly = true;
};

extern template class ReferencedAdapter<DHCPAssignmentSettingDataRow>;

/// Fetches IP assignment setting data: "QVXZR_IPAssignmentSettingData".
using CMPIDHCPAssignmentSettingData = ReferencedAdapter<DHCPAssignmentSettingDataRow>;

}  // namespace ZR::DHCPClientProvider
