#include "broker/objects/BrokerResult.h"

#include <utility>

#include "broker/BrokerTypes.h"
#include "broker/Conversion.h"
#include "broker/objects/BrokerError.h"
#include "broker/objects/BrokerStatus.h"

namespace cimom::broker {

namespace {

ResultCollector* collectorOf(const CMPIResult* result) noexcept {
    return result != nullptr && result->ft == &resultTable
               ? static_cast<ResultCollector*>(result->hdl)
               : nullptr;
}

/// Results belong to the request alone.
CMPIStatus release(CMPIResult* self) {
    return statusOf(collectorOf(self) == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
}

CMPIResult* clone(const CMPIResult*, CMPIStatus* rc) {
    answer(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullptr;
}

template <typename Item>
CMPIStatus deliver(const CMPIResult* self, const Item* item) {
    return guarded([=] {
        ResultCollector* const collector = collectorOf(self);
        return collector == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : collector->add(item);
    });
}

/// No operation that is served returns plain data; an instance or a path may
/// come this way.
CMPIStatus returnData(const CMPIResult* self, const CMPIValue* value, CMPIType type) {
    switch (type) {
        case CMPI_instance:
            return deliver<CMPIInstance>(
                self, value == nullptr ? nullptr : memberOf<CMPIInstance*>(value));
        case CMPI_ref:
            return deliver<CMPIObjectPath>(
                self, value == nullptr ? nullptr : memberOf<CMPIObjectPath*>(value));
        default:
            return statusOf(collectorOf(self) == nullptr ? CMPI_RC_ERR_INVALID_HANDLE
                                                         : CMPI_RC_ERR_NOT_SUPPORTED);
    }
}

CMPIStatus returnInstance(const CMPIResult* self, const CMPIInstance* instance) {
    return deliver(self, instance);
}

CMPIStatus returnObjectPath(const CMPIResult* self, const CMPIObjectPath* path) {
    return deliver(self, path);
}

CMPIStatus returnDone(const CMPIResult* self) {
    return guarded([=] {
        ResultCollector* const collector = collectorOf(self);
        if (collector == nullptr) {
            return CMPI_RC_ERR_INVALID_HANDLE;
        }
        collector->done();
        return CMPI_RC_OK;
    });
}

CMPIStatus returnError(const CMPIResult* self, const CMPIError* error) {
    return deliver(self, error);
}

}  // namespace

const CMPIResultFT resultTable{CMPIVersion200, release,          clone,      returnData,
                               returnInstance, returnObjectPath, returnDone, returnError};

ResultCollector::ResultCollector(Kind kind, const Consumer* consumer) noexcept
    : kind_(kind), consumer_(consumer), record_{this, &resultTable} {}

Delivery ResultCollector::take() {
    const std::lock_guard lock(mutex_);
    return std::exchange(delivery_, Delivery{});
}

std::exception_ptr ResultCollector::failure() const {
    const std::lock_guard lock(mutex_);
    return failure_;
}

template <typename Object>
CMPIrc ResultCollector::pass(std::optional<Object> object,
                             std::function<void(std::optional<Object>)> Consumer::*receive,
                             std::vector<std::optional<Object>>& kept) {
    const std::lock_guard lock(mutex_);
    if (failure_) {
        return CMPI_RC_ERR_FAILED;
    }
    if (consumer_ == nullptr) {
        kept.push_back(std::move(object));
        return CMPI_RC_OK;
    }
    try {
        (consumer_->*receive)(std::move(object));
        return CMPI_RC_OK;
    } catch (const std::exception&) {
        failure_ = std::current_exception();
        return CMPI_RC_ERR_FAILED;
    }
}

CMPIrc ResultCollector::add(const CMPIInstance* instance) {
    if (failure()) {
        return CMPI_RC_ERR_FAILED;
    }
    const InstanceRecord* const record = instanceOf(instance);
    if (instance != nullptr && record == nullptr) {
        return CMPI_RC_ERR_INVALID_PARAMETER;
    }
    if (kind_ == Kind::paths) {
        // A request for names gets the instance's name.
        return add(record == nullptr ? nullptr : static_cast<const CMPIObjectPath*>(record->path));
    }
    std::optional<Instance> copy;
    if (record != nullptr) {
        copy = toModel(*record);
    }
    return pass(std::move(copy), &Consumer::instance, delivery_.instances);
}

CMPIrc ResultCollector::add(const CMPIObjectPath* path) {
    if (failure()) {
        return CMPI_RC_ERR_FAILED;
    }
    const PathRecord* const record = pathOf(path);
    if (path != nullptr && record == nullptr) {
        return CMPI_RC_ERR_INVALID_PARAMETER;
    }
    if (kind_ == Kind::instances && record != nullptr) {
        return CMPI_RC_ERR_NOT_SUPPORTED;
    }
    if (kind_ == Kind::instances) {
        return pass(std::optional<Instance>(), &Consumer::instance, delivery_.instances);
    }
    std::optional<ObjectPath> copy;
    if (record != nullptr) {
        copy = toModel(*record);
    }
    return pass(std::move(copy), &Consumer::path, delivery_.paths);
}

CMPIrc ResultCollector::add(const CMPIError* error) {
    const ErrorRecord* const record = errorOf(error);
    if (record == nullptr) {
        return CMPI_RC_ERR_INVALID_PARAMETER;
    }
    const std::lock_guard lock(mutex_);
    if (delivery_.errorMessage.empty() && record->message != nullptr) {
        delivery_.errorMessage = record->message->view();
    }
    return CMPI_RC_OK;
}

void ResultCollector::done() {
    const std::lock_guard lock(mutex_);
    ++delivery_.returnDoneCalls;
}

}  // namespace cimom::broker
