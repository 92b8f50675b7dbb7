#pragma once

#include "CMPI/ReferencedAdapter.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPComputerSystem;

struct DHCPComputerSystemRow {
    static constexpr const Classes::Class& servedClass = Classes::computerSystem;
    static const RowSource trace;
    static constexpr const char* refusal = noComputerSystem;
    static constexpr bool asksBeforeFirst = true;
    static constexpr bool asksBeforeNext = false;
    static constexpr bool fetchesSingly = false;
};

extern template class ReferencedAdapter<DHCPComputerSystemRow>;

/// Fetches computer systems: "QVXZR_ComputerSystem".
using CMPIDHCPComputerSystem = ReferencedAdapter<DHCPComputerSystemRow>;

}  // namespace ZR::DHCPClientProvider
