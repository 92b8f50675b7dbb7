#include "cimxml/Errors.h"

#include <array>

#include "cimom/Status.h"

namespace cimom::wbem {

std::string_view cimStatusName(unsigned code) noexcept {
    // The statuses of the pull operations follow those that CMPI knows, too.
    constexpr unsigned first = 20;
    static constexpr std::array<std::string_view, 10> names{
        "CIM_ERR_NAMESPACE_NOT_EMPTY",
        "CIM_ERR_INVALID_ENUMERATION_CONTEXT",
        "CIM_ERR_INVALID_OPERATION_TIMEOUT",
        "CIM_ERR_PULL_HAS_BEEN_ABANDONED",
        "CIM_ERR_PULL_CANNOT_BE_ABANDONED",
        "CIM_ERR_FILTERED_ENUMERATION_NOT_SUPPORTED",
        "CIM_ERR_CONTINUATION_ON_ERROR_NOT_SUPPORTED",
        "CIM_ERR_SERVER_LIMITS_EXCEEDED",
        "CIM_ERR_SERVER_IS_SHUTTING_DOWN",
        "CIM_ERR_QUERY_FEATURE_NOT_SUPPORTED",
    };
    if (code >= first && code < first + names.size()) {
        return names.at(code - first);
    }
    const bool unknown = code == 0 || code >= first;
    return statusName(unknown ? CMPI_RC_ERR_FAILED : static_cast<CMPIrc>(code));
}

}  // namespace cimom::wbem
