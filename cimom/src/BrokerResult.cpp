#include "BrokerResult.h"

#include <utility>

#include "BrokerError.h"
#include "BrokerStatus.h"
#include "BrokerTypes.h"
#include "Conversion.h"

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

ResultCollector::ResultCollector(Kind kind) noexcept : kind_(kind), record_{this, &resultTable} {}

Delivery ResultCollector::take() {
    const std::lock_guard lock(mutex_);
    return std::exchange(delivery_, Delivery{});
}

CMPIrc ResultCollector::add(const CMPIInstance* instance) {
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
    const std::lock_guard lock(mutex_);
    delivery_.instances.push_back(std::move(copy));
    return CMPI_RC_OK;
}

CMPIrc ResultCollector::add(const CMPIObjectPath* path) {
    const PathRecord* const record = pathOf(path);
    if (path != nullptr && record == nullptr) {
        return CMPI_RC_ERR_INVALID_PARAMETER;
    }
    if (kind_ == Kind::instances && record != nullptr) {
        return CMPI_RC_ERR_NOT_SUPPORTED;
    }
    std::optional<ObjectPath> copy;
    if (record != nullptr) {
        copy = toModel(*record);
    }
    const std::lock_guard lock(mutex_);
    if (kind_ == Kind::paths) {
        delivery_.paths.push_back(std::move(copy));
    } else {
        delivery_.instances.emplace_back();
    }
    return CMPI_RC_OK;
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
