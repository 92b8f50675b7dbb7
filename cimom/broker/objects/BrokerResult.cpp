#include "broker/objects/BrokerResult.h"

#include <utility>

#include "broker/BrokerTypes.h"
#include "broker/Conversion.h"
#include "broker/objects/BrokerRecords.h"
#include "broker/objects/BrokerStatus.h"
#include "cimom/Instance.h"

namespace cimom::broker {

namespace {

BrokerResult* resultOf(const CMPIResult* result) noexcept {
    return result != nullptr && result->ft == &resultTable ? static_cast<BrokerResult*>(result->hdl)
                                                           : nullptr;
}

/// Results belong to the request alone.
CMPIStatus release(CMPIResult* self) {
    return statusOf(resultOf(self) == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
}

CMPIResult* clone(const CMPIResult*, CMPIStatus* rc) {
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullptr;
}

template <typename Item>
CMPIStatus handOver(const CMPIResult* self, const Item* item) {
    return guarded([=] {
        BrokerResult* const result = resultOf(self);
        return result == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : result->add(item);
    });
}

/// No operation that is served returns plain data; an instance or a path may
/// come this way.
CMPIStatus returnData(const CMPIResult* self, const CMPIValue* value, CMPIType type) {
    switch (type) {
        case CMPI_instance:
            return handOver<CMPIInstance>(
                self, value == nullptr ? nullptr : memberOf<CMPIInstance*>(value));
        case CMPI_ref:
            return handOver<CMPIObjectPath>(
                self, value == nullptr ? nullptr : memberOf<CMPIObjectPath*>(value));
        default:
            return statusOf(resultOf(self) == nullptr ? CMPI_RC_ERR_INVALID_HANDLE
                                                      : CMPI_RC_ERR_NOT_SUPPORTED);
    }
}

CMPIStatus returnInstance(const CMPIResult* self, const CMPIInstance* instance) {
    return handOver(self, instance);
}

CMPIStatus returnObjectPath(const CMPIResult* self, const CMPIObjectPath* path) {
    return handOver(self, path);
}

CMPIStatus returnDone(const CMPIResult* self) {
    return guarded([=] {
        BrokerResult* const result = resultOf(self);
        if (result == nullptr) {
            return CMPI_RC_ERR_INVALID_HANDLE;
        }
        result->done();
        return CMPI_RC_OK;
    });
}

CMPIStatus returnError(const CMPIResult* self, const CMPIError* error) {
    return handOver(self, error);
}

}  // namespace

const CMPIResultFT resultTable{CMPIVersion200, release,          clone,      returnData,
                               returnInstance, returnObjectPath, returnDone, returnError};

BrokerResult::BrokerResult(const AnyReceiver& receiver) noexcept
    : receiver_(receiver), record_{this, &resultTable} {}

std::exception_ptr BrokerResult::failure() const {
    const std::lock_guard lock(mutex_);
    return failure_;
}

unsigned BrokerResult::returnDoneCalls() const {
    const std::lock_guard lock(mutex_);
    return returnDoneCalls_;
}

std::string BrokerResult::errorMessage() const {
    const std::lock_guard lock(mutex_);
    return errorMessage_;
}

template <typename Object>
CMPIrc BrokerResult::pass(ResultReceiver<Object>& receiver, std::optional<Object> object) {
    const std::lock_guard lock(mutex_);
    if (failure_) {
        return CMPI_RC_ERR_FAILED;
    }
    try {
        receiver.take(std::move(object));
        return CMPI_RC_OK;
    } catch (const std::exception&) {
        failure_ = std::current_exception();
        return CMPI_RC_ERR_FAILED;
    }
}

CMPIrc BrokerResult::add(const CMPIInstance* instance) {
    if (failure()) {
        return CMPI_RC_ERR_FAILED;
    }
    const InstanceRecord* const record = instanceOf(instance);
    if (instance != nullptr && record == nullptr) {
        return CMPI_RC_ERR_INVALID_PARAMETER;
    }
    if (wantsPaths(receiver_)) {
        // A request for names gets the instance's name.
        return add(record == nullptr ? nullptr : static_cast<const CMPIObjectPath*>(record->path));
    }
    return pass(*std::get<ResultReceiver<Instance>*>(receiver_),
                record == nullptr ? std::nullopt : std::optional(toModel(*record)));
}

CMPIrc BrokerResult::add(const CMPIObjectPath* path) {
    if (failure()) {
        return CMPI_RC_ERR_FAILED;
    }
    const PathRecord* const record = pathOf(path);
    if (path != nullptr && record == nullptr) {
        return CMPI_RC_ERR_INVALID_PARAMETER;
    }
    if (wantsPaths(receiver_)) {
        return pass(*std::get<ResultReceiver<ObjectPath>*>(receiver_),
                    record == nullptr ? std::nullopt : std::optional(toModel(*record)));
    }
    // A null path is an absent entry, of whatever kind.
    return record == nullptr
               ? pass(*std::get<ResultReceiver<Instance>*>(receiver_), std::optional<Instance>())
               : CMPI_RC_ERR_NOT_SUPPORTED;
}

CMPIrc BrokerResult::add(const CMPIError* error) {
    const ErrorRecord* const record = errorOf(error);
    if (record == nullptr) {
        return CMPI_RC_ERR_INVALID_PARAMETER;
    }
    const std::lock_guard lock(mutex_);
    if (errorMessage_.empty() && record->message != nullptr) {
        errorMessage_ = record->message->view();
    }
    return CMPI_RC_OK;
}

void BrokerResult::done() {
    const std::lock_guard lock(mutex_);
    ++returnDoneCalls_;
}

}  // namespace cimom::broker
