#include "Collector.h"

namespace ZR::DHCPClientGateway {

/// The functions of the record. None of them throws anything but what a lack of memory
/// does, and then into a provider of this library, which goes on without the object.
struct Collector::Slots {
    static Collector& of(const CMPIResult* result) { return *static_cast<Collector*>(result->hdl); }

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
        of(self).instances_.push_back(instance);
        return {CMPI_RC_OK, nullptr};
    }

    static CMPIStatus returnObjectPath(const CMPIResult* self, const CMPIObjectPath* path) {
        of(self).paths_.push_back(path);
        return {CMPI_RC_OK, nullptr};
    }

    static CMPIStatus returnDone(const CMPIResult* /*self*/) { return {CMPI_RC_OK, nullptr}; }

    static CMPIStatus returnError(const CMPIResult* /*self*/, const CMPIError* /*error*/) {
        return {CMPI_RC_OK, nullptr};
    }

    static constexpr CMPIResultFT table{200,         &release,        &clone,
                                        &returnData, &returnInstance, &returnObjectPath,
                                        &returnDone, &returnError};
};

Collector::Collector() : record_{this, &Slots::table} {}

}  // namespace ZR::DHCPClientGateway
