#include "manager/ProviderCall.h"

#include <cstring>

#include "broker/objects/BrokerString.h"

namespace cimom {

namespace {

/// The status of the whole. A call that stands for one of several classes adds
/// nothing when the provider does not know the class or the operation.
Status overall(const std::vector<CallOutcome>& calls, bool exact) {
    for (const CallOutcome& call : calls) {
        const bool nothingToAdd = !exact && (call.status.code == CMPI_RC_ERR_INVALID_CLASS ||
                                             call.status.code == CMPI_RC_ERR_NOT_SUPPORTED ||
                                             call.status.code == CMPI_RC_ERR_NOT_FOUND);
        if (!call.status.ok() && !nothingToAdd) {
            return call.status;
        }
    }
    return {};
}

}  // namespace

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

PropertyNames::PropertyNames(const std::optional<std::vector<std::string>>& names) {
    if (!names) {
        return;
    }
    pointers_.reserve(names->size() + 1);
    for (const std::string& name : *names) {
        pointers_.push_back(name.c_str());
    }
    pointers_.push_back(nullptr);
}

Status checkDepth() {
    constexpr unsigned deepest = broker::RequestScope::deepest;
    if (broker::RequestScope::depthOfThread() < deepest) {
        return {};
    }
    return {CMPI_RC_ERR_FAILED, "requests of providers to each other are nested more than " +
                                    std::to_string(deepest) + " deep"};
}

CallOutcome missingSlot(const std::string& provider, const char* slot) {
    return {{CMPI_RC_ERR_NOT_SUPPORTED, "provider " + provider + " does not offer " + slot}};
}

RequestEnd endOf(const std::vector<CallOutcome>& calls, bool exact) {
    RequestEnd end{overall(calls, exact)};
    for (const CallOutcome& call : calls) {
        end.returnDoneCalls += call.returnDoneCalls;
    }
    return end;
}

void beginCall(const broker::AnyReceiver& receiver) {
    std::visit([](auto* each) { each->beginCall(); }, receiver);
}

CallOutcome finished(Status status, const broker::BrokerResult& result,
                     const broker::AnyReceiver& receiver) {
    if (const std::exception_ptr failure = result.failure()) {
        std::rethrow_exception(failure);
    }
    if (!status.ok()) {
        if (status.message.empty()) {
            status.message = result.errorMessage();
        }
        std::visit([](auto* each) { each->dropCall(); }, receiver);
    }
    return {std::move(status), result.returnDoneCalls()};
}

}  // namespace cimom
