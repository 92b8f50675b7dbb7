#include "DHCPClientGateway.h"

#include <atomic>
#include <exception>
#include <string>

#include "Modification.h"
#include "Requests.h"
#include "providerutilities/ProviderUtilities.h"
#include "providerutilities/Refusal.h"
#include "zrclient/OneMoment.h"

// The factories of the exact provider, which is known by nothing else.
CMPI_EXTERN_C CMPIInstanceMI* DHCPClientProvider_Create_InstanceMI(const CMPIBroker* broker,
                                                                   const CMPIContext* ctx,
                                                                   CMPIStatus* rc);

/// The function tables of the gateway, and the frame of every request.
namespace ZR::DHCPClientGateway {

namespace {

std::atomic<const CMPIBroker*> loadingBroker = nullptr;

CMPIStatus statusOf(const CMPIBroker* host, CMPIrc code, const char* message) {
    return {code, host->eft->newString(host, message, nullptr)};
}

/// Runs one request, with one snapshot of the machine for all that it asks, and ends its
/// result. No exception reaches the object manager.
template <typename Serve>
CMPIStatus serve(const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* path,
                 const Serve& operation) {
    const CMPIBroker* host = loadingBroker;
    const OneMoment moment;
    try {
        operation(Request{host, context, result, path, ProviderUtilities::getNamespace(path)});
        result->ft->returnDone(result);
        return {CMPI_RC_OK, nullptr};
    } catch (const Refusal& refusal) {
        return statusOf(host, refusal.code(), refusal.what());
    } catch (const std::exception& exception) {
        return statusOf(host, CMPI_RC_ERR_FAILED, exception.what());
    }
}

CMPIStatus refuse(const char* message) {
    return statusOf(loadingBroker, CMPI_RC_ERR_NOT_SUPPORTED, message);
}

CMPIStatus cleanup(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                   CMPIBoolean /*terminating*/) {
    return {CMPI_RC_OK, nullptr};
}

CMPIStatus enumerateInstanceNames(CMPIInstanceMI* /*mi*/, const CMPIContext* ctx,
                                  const CMPIResult* result, const CMPIObjectPath* path) {
    return serve(ctx, result, path, [](const Request& request) { enumerateNames(request); });
}

CMPIStatus enumerateInstances(CMPIInstanceMI* /*mi*/, const CMPIContext* ctx,
                              const CMPIResult* result, const CMPIObjectPath* path,
                              const char** properties) {
    return serve(ctx, result, path,
                 [=](const Request& request) { enumerate(request, properties); });
}

CMPIStatus getInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* ctx, const CMPIResult* result,
                       const CMPIObjectPath* path, const char** properties) {
    return serve(ctx, result, path, [=](const Request& request) { get(request, properties); });
}

CMPIStatus createInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                          const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/,
                          const CMPIInstance* /*instance*/) {
    return refuse("instances follow from the machine; none can be made");
}

CMPIStatus modify(CMPIInstanceMI* /*mi*/, const CMPIContext* ctx, const CMPIResult* result,
                  const CMPIObjectPath* path, const CMPIInstance* instance,
                  const char** properties) {
    return serve(ctx, result, path,
                 [=](const Request& request) { modifyInstance(request, instance, properties); });
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

CMPIStatus cleanupAssociations(CMPIAssociationMI* /*mi*/, const CMPIContext* /*ctx*/,
                               CMPIBoolean /*terminating*/) {
    return {CMPI_RC_OK, nullptr};
}

CMPIStatus giveAssociators(CMPIAssociationMI* /*mi*/, const CMPIContext* ctx,
                           const CMPIResult* result, const CMPIObjectPath* path,
                           const char* association, const char* resultClass, const char* role,
                           const char* resultRole, const char** properties) {
    return serve(ctx, result, path, [=](const Request& request) {
        associators(request, {association, resultClass, role, resultRole},
                    Delivery(request, properties));
    });
}

CMPIStatus giveAssociatorNames(CMPIAssociationMI* /*mi*/, const CMPIContext* ctx,
                               const CMPIResult* result, const CMPIObjectPath* path,
                               const char* association, const char* resultClass, const char* role,
                               const char* resultRole) {
    return serve(ctx, result, path, [=](const Request& request) {
        associators(request, {association, resultClass, role, resultRole}, Delivery(request));
    });
}

CMPIStatus giveReferences(CMPIAssociationMI* /*mi*/, const CMPIContext* ctx,
                          const CMPIResult* result, const CMPIObjectPath* path,
                          const char* resultClass, const char* role, const char** properties) {
    return serve(ctx, result, path, [=](const Request& request) {
        references(request, {.association = resultClass, .role = role},
                   Delivery(request, properties));
    });
}

CMPIStatus giveReferenceNames(CMPIAssociationMI* /*mi*/, const CMPIContext* ctx,
                              const CMPIResult* result, const CMPIObjectPath* path,
                              const char* resultClass, const char* role) {
    return serve(ctx, result, path, [=](const Request& request) {
        references(request, {.association = resultClass, .role = role}, Delivery(request));
    });
}

constexpr int cmpiLevel = 200;

constexpr CMPIInstanceMIFT instanceTable{
    cmpiLevel,
    cmpiLevel,
    "instanceDHCPClientGateway",
    &cleanup,
    &enumerateInstanceNames,
    &enumerateInstances,
    &getInstance,
    &createInstance,
    &modify,
    &deleteInstance,
    &execQuery,
};

constexpr CMPIAssociationMIFT associationTable{
    cmpiLevel,
    cmpiLevel,
    "associationDHCPClientGateway",
    &cleanupAssociations,
    &giveAssociators,
    &giveAssociatorNames,
    &giveReferences,
    &giveReferenceNames,
};

/// Both kinds of requests ask the instances of the exact provider.
void prepare(const CMPIBroker* host, const CMPIContext* context, CMPIStatus* status) {
    loadingBroker = host;
    useExactProvider(DHCPClientProvider_Create_InstanceMI(host, context, status));
}

}  // namespace

}  // namespace ZR::DHCPClientGateway

CMPIInstanceMI* DHCPClientGateway_Create_InstanceMI(const CMPIBroker* broker,
                                                    const CMPIContext* ctx, CMPIStatus* rc) {
    static CMPIInstanceMI mi{nullptr, &ZR::DHCPClientGateway::instanceTable};
    ZR::DHCPClientGateway::prepare(broker, ctx, rc);
    return &mi;
}

CMPIAssociationMI* DHCPClientGateway_Create_AssociationMI(const CMPIBroker* broker,
                                                          const CMPIContext* ctx, CMPIStatus* rc) {
    static CMPIAssociationMI mi{nullptr, &ZR::DHCPClientGateway::associationTable};
    ZR::DHCPClientGateway::prepare(broker, ctx, rc);
    return &mi;
}
