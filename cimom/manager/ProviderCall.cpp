#include "manager/ProviderCall.h"

#include <algorithm>

namespace cimom {

namespace {

/// The status of the whole. A call that stands for one of several classes adds
/// nothing when the provider does not know the class or the operation.
Status overall(const std::vector<CallOutcome>& calls, bool exact) {
    for (const CallOutcome& call : calls) {
        if (!call.status.ok() && (exact || !hasNothing(call.status))) {
            return call.status;
        }
    }
    return {};
}

unsigned returnDoneCallsOf(const std::vector<CallOutcome>& calls) noexcept {
    unsigned count = 0;
    for (const CallOutcome& call : calls) {
        count += call.returnDoneCalls;
    }
    return count;
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

bool hasNothing(const Status& status) noexcept {
    return status.code == CMPI_RC_ERR_INVALID_CLASS || status.code == CMPI_RC_ERR_NOT_SUPPORTED ||
           status.code == CMPI_RC_ERR_NOT_FOUND;
}

RequestEnd endOf(const std::vector<CallOutcome>& calls, bool exact) {
    return {overall(calls, exact), returnDoneCallsOf(calls)};
}

RequestEnd endOfAssociations(const std::vector<CallOutcome>& calls, bool exact, bool empty) {
    RequestEnd end{{}, returnDoneCallsOf(calls)};
    const bool failed =
        std::ranges::none_of(calls, [](const CallOutcome& call) { return call.status.ok(); });
    const auto told = std::ranges::find_if(calls, [&](const CallOutcome& call) {
        return failed ? exact || call.status.code != CMPI_RC_ERR_INVALID_CLASS
                      : empty && call.status.code == CMPI_RC_ERR_NOT_FOUND;
    });
    if (told != calls.end()) {
        end.status = told->status;
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
