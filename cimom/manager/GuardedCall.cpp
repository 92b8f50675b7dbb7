#include "manager/GuardedCall.h"

#include <cstring>

#include "broker/RequestScope.h"
#include "broker/objects/BrokerString.h"

namespace cimom {

Status statusFrom(const CMPIStatus& status) {
    // The provider may have put any number there, which the enumeration cannot hold.
    int code = 0;
    static_assert(sizeof code == sizeof status.rc);
    std::memcpy(&code, &status.rc, sizeof code);
    std::string message(broker::textOf(status.msg));
    switch (code) {
        case CMPI_RC_OK:
            return {};
        case CMPI_RC_ERR_FAILED:
        case CMPI_RC_ERR_ACCESS_DENIED:
        case CMPI_RC_ERR_INVALID_NAMESPACE:
        case CMPI_RC_ERR_INVALID_PARAMETER:
        case CMPI_RC_ERR_INVALID_CLASS:
        case CMPI_RC_ERR_NOT_FOUND:
        case CMPI_RC_ERR_NOT_SUPPORTED:
        case CMPI_RC_ERR_CLASS_HAS_CHILDREN:
        case CMPI_RC_ERR_CLASS_HAS_INSTANCES:
        case CMPI_RC_ERR_INVALID_SUPERCLASS:
        case CMPI_RC_ERR_ALREADY_EXISTS:
        case CMPI_RC_ERR_NO_SUCH_PROPERTY:
        case CMPI_RC_ERR_TYPE_MISMATCH:
        case CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED:
        case CMPI_RC_ERR_INVALID_QUERY:
        case CMPI_RC_ERR_METHOD_NOT_AVAILABLE:
        case CMPI_RC_ERR_METHOD_NOT_FOUND:
        case CMPI_RC_ERR_INVALID_HANDLE:
        case CMPI_RC_ERR_INVALID_DATA_TYPE:
        case CMPI_RC_ERROR_SYSTEM:
        case CMPI_RC_ERROR:
            return {static_cast<CMPIrc>(code), std::move(message)};
        default:
            if (message.empty()) {
                message = "the provider's status is " + std::to_string(code);
            }
            return {CMPI_RC_ERR_FAILED, std::move(message)};
    }
}

Status checkDepth() {
    constexpr unsigned deepest = broker::RequestScope::deepest;
    if (broker::RequestScope::depthOfThread() < deepest) {
        return {};
    }
    return {CMPI_RC_ERR_FAILED, "requests of providers to each other are nested more than " +
                                    std::to_string(deepest) + " deep"};
}

}  // namespace cimom
