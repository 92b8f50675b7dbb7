#include <cmpift.h>

#include <atomic>
#include <exception>
#include <memory>

#include "ExtensionRequests.h"
#include "providerutilities/ProviderUtilities.h"
#include "providerutilities/Refusal.h"
#include "tklogger/TKLogger.h"
#include "zrclient/OneMoment.h"
#include "zrcommon/LogLevel.h"
#include "zrlinux/LiveSource.h"

/// The function tables of the extensions for instances and associations, and the frame of
/// every request.
namespace ZR::DHCPClientExtensions {

namespace {

std::atomic<const CMPIBroker*> hostBroker = nullptr;

const std::string loggerExtensions = "ZR.Extensions";

CMPIStatus statusOf(CMPIrc code, const char* message) {
    const CMPIBroker* host = hostBroker;
    return {code, host->eft->newString(host, message, nullptr)};
}

/// Runs one request, with one snapshot of the machine for all that it asks, and ends its
/// result. No exception reaches the object manager.
template <typename Serve>
CMPIStatus serve(const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* path,
                 const Serve& operation) {
    const OneMoment moment;
    try {
        const std::shared_ptr<const Snapshot> machine = OneMoment::current();
        operation(Request{hostBroker, context, result, path, ProviderUtilities::getNamespace(path),
                          machine.get()});
        result->ft->returnDone(result);
        return {CMPI_RC_OK, nullptr};
    } catch (const Refusal& refusal) {
        return statusOf(refusal.code(), refusal.what());
    } catch (const std::exception& exception) {
        TKLog::TKLogger::logLevelMessage("extensions/DHCPClientExtensions", __func__, __LINE__,
                                         loggerExtensions, LogLevel::failure, nullptr, 0, 0,
                                         exception.what());
        return statusOf(CMPI_RC_ERR_FAILED, exception.what());
    }
}

CMPIStatus refuse(const char* message) {
    return statusOf(CMPI_RC_ERR_NOT_SUPPORTED, message);
}

/// Object managers may ask for instances after this, when another kind of requests still
/// needs the library.
CMPIStatus cleanup(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                   CMPIBoolean /*terminating*/) {
    return {CMPI_RC_OK, nullptr};
}

CMPIStatus cleanupAssociations(CMPIAssociationMI* /*mi*/, const CMPIContext* /*ctx*/,
                               CMPIBoolean /*terminating*/) {
    return {CMPI_RC_OK, nullptr};
}

CMPIStatus enumerateInstanceNames(CMPIInstanceMI* /*mi*/, const CMPIContext* ctx,
                                  const CMPIResult* result, const CMPIObjectPath* path) {
    return serve(ctx, result, path,
                 [](const Request& request) { enumerate(request, {.names = true}); });
}

CMPIStatus enumerateInstances(CMPIInstanceMI* /*mi*/, const CMPIContext* ctx,
                              const CMPIResult* result, const CMPIObjectPath* path,
                              const char** properties) {
    return serve(ctx, result, path,
                 [=](const Request& request) { enumerate(request, {.properties = properties}); });
}

CMPIStatus getInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* ctx, const CMPIResult* result,
                       const CMPIObjectPath* path, const char** properties) {
    return serve(ctx, result, path,
                 [=](const Request& request) { get(request, {.properties = properties}); });
}

CMPIStatus createInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                          const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/,
                          const CMPIInstance* /*instance*/) {
    return refuse("instances follow from the machine; none can be made");
}

CMPIStatus modifyInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                          const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/,
                          const CMPIInstance* /*instance*/, const char** /*properties*/) {
    return refuse("instances follow from the machine; none can be changed");
}

CMPIStatus deleteInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                          const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/) {
    return refuse("instances follow from the machine; none can be deleted");
}

CMPIStatus execQuery(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                     const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/,
                     const char* /*query*/, const char* /*language*/) {
    return refuse("this provider does not understand queries");
}

CMPIStatus giveAssociators(CMPIAssociationMI* /*mi*/, const CMPIContext* ctx,
                           const CMPIResult* result, const CMPIObjectPath* path,
                           const char* association, const char* resultClass, const char* role,
                           const char* resultRole, const char** properties) {
    return serve(ctx, result, path, [=](const Request& request) {
        associators(request, {association, resultClass, role, resultRole},
                    {.properties = properties});
    });
}

CMPIStatus giveAssociatorNames(CMPIAssociationMI* /*mi*/, const CMPIContext* ctx,
                               const CMPIResult* result, const CMPIObjectPath* path,
                               const char* association, const char* resultClass, const char* role,
                               const char* resultRole) {
    return serve(ctx, result, path, [=](const Request& request) {
        associators(request, {association, resultClass, role, resultRole}, {.names = true});
    });
}

CMPIStatus giveReferences(CMPIAssociationMI* /*mi*/, const CMPIContext* ctx,
                          const CMPIResult* result, const CMPIObjectPath* path,
                          const char* resultClass, const char* role, const char** properties) {
    return serve(ctx, result, path, [=](const Request& request) {
        references(request, {.association = resultClass, .role = role}, {.properties = properties});
    });
}

CMPIStatus giveReferenceNames(CMPIAssociationMI* /*mi*/, const CMPIContext* ctx,
                              const CMPIResult* result, const CMPIObjectPath* path,
                              const char* resultClass, const char* role) {
    return serve(ctx, result, path, [=](const Request& request) {
        references(request, {.association = resultClass, .role = role}, {.names = true});
    });
}

constexpr int cmpiLevel = 200;

constexpr CMPIInstanceMIFT instanceTable{
    cmpiLevel,
    cmpiLevel,
    "instanceDHCPClientExtensions",
    &cleanup,
    &enumerateInstanceNames,
    &enumerateInstances,
    &getInstance,
    &createInstance,
    &modifyInstance,
    &deleteInstance,
    &execQuery,
};

constexpr CMPIAssociationMIFT associationTable{
    cmpiLevel,
    cmpiLevel,
    "associationDHCPClientExtensions",
    &cleanupAssociations,
    &giveAssociators,
    &giveAssociatorNames,
    &giveReferences,
    &giveReferenceNames,
};

void prepare(const CMPIBroker* host) {
    hostBroker = host;
    serveLiveMachine();
}

}  // namespace

}  // namespace ZR::DHCPClientExtensions

CMPI_EXTERN_C CMPIInstanceMI* DHCPClientExtensions_Create_InstanceMI(const CMPIBroker* broker,
                                                                     const CMPIContext* ctx,
                                                                     CMPIStatus* rc);
CMPI_EXTERN_C CMPIAssociationMI* DHCPClientExtensions_Create_AssociationMI(const CMPIBroker* broker,
                                                                           const CMPIContext* ctx,
                                                                           CMPIStatus* rc);

CMPIInstanceMI* DHCPClientExtensions_Create_InstanceMI(const CMPIBroker* broker,
                                                       const CMPIContext* /*ctx*/,
                                                       CMPIStatus* /*rc*/) {
    static CMPIInstanceMI mi{nullptr, &ZR::DHCPClientExtensions::instanceTable};
    ZR::DHCPClientExtensions::prepare(broker);
    return &mi;
}

CMPIAssociationMI* DHCPClientExtensions_Create_AssociationMI(const CMPIBroker* broker,
                                                             const CMPIContext* /*ctx*/,
                                                             CMPIStatus* /*rc*/) {
    static CMPIAssociationMI mi{nullptr, &ZR::DHCPClientExtensions::associationTable};
    ZR::DHCPClientExtensions::prepare(broker);
    return &mi;
}
