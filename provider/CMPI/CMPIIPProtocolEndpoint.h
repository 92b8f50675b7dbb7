#pragma once

#include "CMPI/ReferencedAdapter.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIIPProtocolEndpoint;

struct IPProtocolEndpointRow {
    static constexpr const Classes::Class& servedClass = Classes::ipProtocolEndpoint;
    static const RowSource trace;
    static constexpr const char* refusal = noIPProtocolEndpoint;
    static constexpr bool asksBeforeFirst = true;
    static constexpr bool asksBeforeNext = true;
    static constexpr bool fetchesSingly = true;
};

extern template class ReferencedAdapter<IPProtocolEndpointRow>;

/// Fetches IP protocol endpoints: "QVXZR_IPProtocolEndpoint".
using CMPIIPProtocolEndpoint = ReferencedAdapter<IPProtocolEndpointRow>;

}  // namespace ZR::DHCPClientProvider
