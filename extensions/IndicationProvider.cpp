#include <cmpift.h>

#include <atomic>
#include <exception>
#include <string>

#include "LeaseWatch.h"
#include "providerutilities/ProviderUtilities.h"
#include "zrlinux/LiveSource.h"

/// The function table for indications. All slots are there: some object managers call them
/// without a look.
namespace ZR::DHCPClientExtensions {

namespace {

std::atomic<const CMPIBroker*> indicationBroker = nullptr;

/// Runs a function of the watch; a failure of it becomes the status.
template <typename Work>
CMPIStatus watched(const Work& work) {
    try {
        work(LeaseWatch::process());
        return {CMPI_RC_OK, nullptr};
    } catch (const std::exception& exception) {
        const CMPIBroker* const host = indicationBroker;
        return {CMPI_RC_ERR_FAILED, host->eft->newString(host, exception.what(), nullptr)};
    }
}

/// The thread is the library's code, which must not go before it.
CMPIStatus cleanupIndications(CMPIIndicationMI* /*mi*/, const CMPIContext* /*ctx*/,
                              CMPIBoolean terminating) {
    if (terminating == 0 && LeaseWatch::process().running()) {
        return {CMPI_RC_DO_NOT_UNLOAD, nullptr};
    }
    return watched([](LeaseWatch& watch) { watch.end(); });
}

/// Who may subscribe is for the object manager to say, and so is what a filter selects.
CMPIStatus authorizeFilter(CMPIIndicationMI* /*mi*/, const CMPIContext* /*ctx*/,
                           const CMPISelectExp* /*filter*/, const char* /*className*/,
                           const CMPIObjectPath* /*op*/, const char* /*owner*/) {
    return {CMPI_RC_OK, nullptr};
}

/// Object managers do not agree on its parameters: none is touched.
CMPIStatus mustPoll(CMPIIndicationMI* /*mi*/, const CMPIContext* /*ctx*/,
                    const CMPISelectExp* /*filter*/, const char* /*className*/,
                    const CMPIObjectPath* /*op*/) {
    return {CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
}

CMPIStatus activateFilter(CMPIIndicationMI* /*mi*/, const CMPIContext* ctx,
                          const CMPISelectExp* filter, const char* /*className*/,
                          const CMPIObjectPath* op, CMPIBoolean /*firstActivation*/) {
    return watched([=](LeaseWatch& watch) {
        watch.activate(indicationBroker, ctx, filter, ProviderUtilities::getNamespace(op));
    });
}

CMPIStatus deActivateFilter(CMPIIndicationMI* /*mi*/, const CMPIContext* /*ctx*/,
                            const CMPISelectExp* filter, const char* /*className*/,
                            const CMPIObjectPath* /*op*/, CMPIBoolean /*lastActivation*/) {
    return watched([=](LeaseWatch& watch) { watch.deactivate(filter); });
}

CMPIStatus enableIndications(CMPIIndicationMI* /*mi*/, const CMPIContext* ctx) {
    return watched([=](LeaseWatch& watch) { watch.enable(indicationBroker, ctx); });
}

CMPIStatus disableIndications(CMPIIndicationMI* /*mi*/, const CMPIContext* /*ctx*/) {
    return watched([](LeaseWatch& watch) { watch.disable(); });
}

constexpr int indicationLevel = 200;

constexpr CMPIIndicationMIFT indicationTable{
    indicationLevel,     indicationLevel,   "IndicationDHCPClientExtensions",
    &cleanupIndications, &authorizeFilter,  &mustPoll,
    &activateFilter,     &deActivateFilter, &enableIndications,
    &disableIndications,
};

}  // namespace

}  // namespace ZR::DHCPClientExtensions

CMPI_EXTERN_C CMPIIndicationMI* DHCPClientExtensions_Create_IndicationMI(const CMPIBroker* broker,
                                                                         const CMPIContext* ctx,
                                                                         CMPIStatus* rc);

CMPIIndicationMI* DHCPClientExtensions_Create_IndicationMI(const CMPIBroker* broker,
                                                           const CMPIContext* /*ctx*/,
                                                           CMPIStatus* /*rc*/) {
    static CMPIIndicationMI mi{nullptr, &ZR::DHCPClientExtensions::indicationTable};
    ZR::DHCPClientExtensions::indicationBroker = broker;
    ZR::serveLiveMachine();
    return &mi;
}
