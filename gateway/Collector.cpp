#include "Collector.h"

#include <utility>

namespace ZR::DHCPClientGateway {

/// The functions of the record.
struct Collector::Slots {
    static CMPIStatus handOn(const CMPIResult* result, const CMPIObjectPath* path,
                             const CMPIInstance* instance) noexcept {
        Collector& collector = *static_cast<Collector*>(result->hdl);
        if (collector.thrown_ == nullptr) {
            try {
                collector.take_(path, instance);
                return {CMPI_RC_OK, nullptr};
            } catch (...) {
                collector.thrown_ = std::current_exception();
            }
        }
        return {CMPI_RC_ERR_FAILED, nullptr};
    }

    static CMPIStatus release(CMPIResult* /*self*/) { return {CMPI_RC_OK, nullptr}; }

    static CMPIResult* clone(const CMPIResult* /*self*/, CMPIStatus* status) {
        if (status != nullptr) {
            *status = {CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
        }
        return nullptr;
    }

    static CMPIStatus returnData(const CMPIResult* /*self*/, const CMPIValue* /*value*/,
                                 const CMPIType /*type*/) {
        return {CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
    }

    static CMPIStatus returnInstance(const CMPIResult* self, const CMPIInstance* instance) {
        return handOn(self, nullptr, instance);
    }

    static CMPIStatus returnObjectPath(const CMPIResult* self, const CMPIObjectPath* path) {
        return handOn(self, path, nullptr);
    }

    static CMPIStatus returnDone(const CMPIResult* /*self*/) { return {CMPI_RC_OK, nullptr}; }

    static CMPIStatus returnError(const CMPIResult* /*self*/, const CMPIError* /*error*/) {
        return {CMPI_RC_OK, nullptr};
    }

    static constexpr CMPIResultFT table{200,         &release,        &clone,
                                        &returnData, &returnInstance, &returnObjectPath,
                                        &returnDone, &returnError};
};

Collector::Collector(Take take) : record_{this, &Slots::table}, take_(std::move(take)) {}

void Collector::rethrow() const {
    if (thrown_ != nullptr) {
        std::rethrow_exception(thrown_);
    }
}

}  // namespace ZR::DHCPClientGateway
