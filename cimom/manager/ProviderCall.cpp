#include "manager/ProviderCall.h"

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
