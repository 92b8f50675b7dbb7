#include "DHCPClientProvider.h"

#include <algorithm>
#include <array>
#include <exception>
#include <string_view>

#include "CMPI/CMPIDHCPCapabilities.h"
#include "CMPI/CMPIDHCPElementCapabilities.h"
#include "CMPI/CMPIDHCPElementSettingData.h"
#include "CMPI/CMPIDHCPHostedAccessPoint.h"
#include "CMPI/CMPIDHCPOrderedComponent.h"
#include "CMPI/CMPIDHCPProtocolEndpoint.h"
#include "CMPI/CMPIDHCPRemoteAccessAvailableToElement.h"
#include "CMPI/CMPIDHCPRemoteHostedAccessPoint.h"
#include "CMPI/CMPIDHCPRemoteServiceAccessPoint.h"
#include "CMPI/CMPIDHCPSettingData.h"
#include "CMPI/CMPISAPSAPDependency.h"
#include "Delivery.h"
#include "include/TracePoint.h"
#include "providerutilities/Classes.h"
#include "providerutilities/ProviderUtilities.h"
#include "zrclient/OneMoment.h"
#include "zrlinux/LiveSource.h"

namespace ZR::DHCPClientProvider {

const std::string loggerDHCPClientProvider = loggerCategory;

std::atomic<const CMPIBroker*> broker = nullptr;

namespace {

const TraceSource source{"DHCPClientProvider", loggerDHCPClientProvider};

/// How each class is enumerated and fetched.
struct ServedClass {
    unsigned short id;
    CMPIrc (*enumerateNames)(const Request&);
    CMPIrc (*enumerate)(const Request&);
    CMPIrc (*get)(const Request&);
};

CMPIrc notSupported(const Request& /*request*/) {
    return CMPI_RC_ERR_NOT_SUPPORTED;
}

template <typename Adapter, Ending names, Ending instances, Ending get>
constexpr ServedClass served() {
    return {Adapter::servedClass.id, &deliverPaths<Adapter, names>,
            &deliverInstances<Adapter, instances>, &deliverInstances<Adapter, get>};
}

/// A class whose instances cannot be fetched singly.
template <typename Adapter, Ending names, Ending instances>
constexpr ServedClass enumerated() {
    return {Adapter::servedClass.id, &deliverPaths<Adapter, names>,
            &deliverInstances<Adapter, instances>, &notSupported};
}

constexpr std::array servedClasses{
    served<CMPIDHCPProtocolEndpoint, Ending::returnDone, Ending::returnDone, Ending::returnDone>(),
    served<CMPIDHCPCapabilities, Ending::returnDone, Ending::returnDone, Ending::returnDone>(),
    enumerated<CMPIDHCPElementCapabilities, Ending::returnDone, Ending::left>(),
    enumerated<CMPISAPSAPDependency, Ending::left, Ending::left>(),
    enumerated<CMPIDHCPHostedAccessPoint, Ending::returnDone, Ending::left>(),
    served<CMPIDHCPRemoteServiceAccessPoint, Ending::left, Ending::left, Ending::left>(),
    served<CMPIDHCPRemoteAccessAvailableToElement, Ending::left, Ending::left, Ending::left>(),
    served<CMPIDHCPRemoteHostedAccessPoint, Ending::left, Ending::left, Ending::left>(),
    served<CMPIDHCPSettingData, Ending::left, Ending::left, Ending::left>(),
    served<CMPIDHCPElementSettingData, Ending::left, Ending::left, Ending::left>(),
    served<CMPIDHCPOrderedComponent, Ending::left, Ending::left, Ending::left>(),
};

/// The frame of an instance request: marks, the class identifier, and the one
/// place where exceptions end. What was delivered before one stays delivered, and
/// the status stays as it was: the failure shows in the log alone.
template <typename Operation>
CMPIStatus serve(const TracePoint& at, const CMPIObjectPath* path, Operation operation) {
    const OneMoment moment;
    markProviderEntry(loggerDHCPClientProvider, at.source.file.data(), at.function.data(),
                      at.line.number());
    const unsigned short classId = ProviderUtilities::getClassId(path);
    traceVariable(at, "classId", classId);
    CMPIStatus status{CMPI_RC_OK, nullptr};
    try {
        operation(classId, status);
    } catch (const std::exception& exception) {
        traceMessage(at, exception.what());
    }
    markProviderExit(loggerDHCPClientProvider, at.source.file.data(), at.function.data(),
                     at.line.number());
    return status;
}

/// Serves a request by the column of the table above that its operation names.
CMPIStatus serveByTable(CMPIrc (*ServedClass::*column)(const Request&), const Request& request) {
    return serve(request.at, request.path, [&](unsigned short classId, CMPIStatus& status) {
        const auto* row =
            std::find_if(servedClasses.begin(), servedClasses.end(),
                         [classId](const ServedClass& entry) { return entry.id == classId; });
        status.rc =
            row == servedClasses.end() ? CMPI_RC_ERR_INVALID_CLASS : (row->*column)(request);
    });
}

/// Create, delete and query, whatever their arguments.
CMPIStatus refuse(const TracePoint& at) {
    traceMethod(at);
    return {CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
}

CMPIStatus DHCPClient_Cleanup(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                              CMPIBoolean /*terminating*/) {
    return {CMPI_RC_OK, nullptr};
}

CMPIStatus DHCPClient_EnumInstanceNames(CMPIInstanceMI* /*mi*/, const CMPIContext* ctx,
                                        const CMPIResult* result, const CMPIObjectPath* path) {
    return serveByTable(&ServedClass::enumerateNames, {ctx, result, path, nullptr, ZR_HERE});
}

CMPIStatus DHCPClient_EnumInstances(CMPIInstanceMI* /*mi*/, const CMPIContext* ctx,
                                    const CMPIResult* result, const CMPIObjectPath* path,
                                    const char** properties) {
    return serveByTable(&ServedClass::enumerate, {ctx, result, path, properties, ZR_HERE});
}

CMPIStatus DHCPClient_GetInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* ctx,
                                  const CMPIResult* result, const CMPIObjectPath* path,
                                  const char** properties) {
    return serveByTable(&ServedClass::get, {ctx, result, path, properties, ZR_HERE});
}

CMPIStatus DHCPClient_CreateInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                                     const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/,
                                     const CMPIInstance* /*instance*/) {
    return refuse(ZR_HERE);
}

CMPIStatus DHCPClient_ModifyInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* ctx,
                                     const CMPIResult* result, const CMPIObjectPath* path,
                                     const CMPIInstance* instance, const char** /*properties*/) {
    const TracePoint at = ZR_HERE;
    return serve(at, path, [&](unsigned short classId, CMPIStatus& status) {
        if (classId != CMPIDHCPSettingData::servedClass.id) {
            status.rc = CMPI_RC_ERR_NOT_SUPPORTED;
            return;
        }
        const CMPIString* text = path->ft->toString(path, nullptr);
        const char* characters = text == nullptr ? nullptr : text->ft->getCharPtr(text, nullptr);
        const std::string l_strObjectPath = characters == nullptr ? "" : characters;
        traceVariable(at, "l_strObjectPath", l_strObjectPath);
        CMPIDHCPSettingData adapter(broker, ctx, path);
        if (adapter) {
            // A message that the adapter attached is dropped.
            status.rc = adapter.modifyInstance(instance).rc;
        }
        result->ft->returnDone(result);
    });
}

CMPIStatus DHCPClient_DeleteInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                                     const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/) {
    return refuse(ZR_HERE);
}

CMPIStatus DHCPClient_ExecQuery(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                                const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/,
                                const char* /*query*/, const char* /*language*/) {
    return refuse(ZR_HERE);
}

/// How each association class is served in the four association requests. The walks go
/// on until the adapter ends; an exception leaves them.
struct ServedAssociation {
    unsigned short id;
    void (*associatorNames)(const Request&, const char* resultClass);
    void (*associators)(const Request&, const char* resultClass);
    CMPIrc (*referenceNames)(const Request&);
    CMPIrc (*references)(const Request&);
};

using AssociatorColumn = void (*ServedAssociation::*)(const Request&, const char* resultClass);
using ReferenceColumn = CMPIrc (*ServedAssociation::*)(const Request&);

template <typename Adapter>
constexpr ServedAssociation association() {
    return {Adapter::servedClass.id, &deliverAssociatorNames<Adapter>, &deliverAssociators<Adapter>,
            &deliverPaths<Adapter, Ending::returnDone>,
            &deliverInstances<Adapter, Ending::returnDone>};
}

constexpr std::array associationClasses{
    association<CMPIDHCPElementCapabilities>(),
    association<CMPISAPSAPDependency>(),
    association<CMPIDHCPHostedAccessPoint>(),
    association<CMPIDHCPRemoteAccessAvailableToElement>(),
    association<CMPIDHCPRemoteHostedAccessPoint>(),
    association<CMPIDHCPElementSettingData>(),
    association<CMPIDHCPOrderedComponent>(),
};

const ServedAssociation* findAssociation(unsigned short classId) {
    const auto* row =
        std::find_if(associationClasses.begin(), associationClasses.end(),
                     [classId](const ServedAssociation& entry) { return entry.id == classId; });
    return row == associationClasses.end() ? nullptr : row;
}

/// Associators and their names: every association that the request's class name
/// stands for, one after the other. A failure in one ends that one alone, and
/// never shows in the status.
///
/// The two handlers differ: an unknown association class is an empty success for
/// names and an error for instances, and only the latter logs failures.
CMPIStatus serveAssociators(const Request& request, const char* assocClass, const char* resultClass,
                            AssociatorColumn column, bool names) {
    const OneMoment moment;
    const TracePoint& at = request.at;
    markProviderEntry(loggerDHCPClientProvider, at.source.file.data(), at.function.data(),
                      at.line.number());
    CMPIStatus status{CMPI_RC_OK, nullptr};
    bool served = true;
    const auto guarded = [&](const auto& step) {
        try {
            step();
        } catch (const std::exception& exception) {
            if (!names) {
                traceMessage(at, exception.what());
            }
        }
    };
    std::vector<unsigned short> classIds;
    guarded([&] {
        const std::string nameSpace = ProviderUtilities::getNamespace(request.path);
        if (!getClassId(assocClass, nameSpace.c_str(), classIds)) {
            traceVariable(at, "CMPI_RC_ERR_INVALID_CLASS", CMPI_RC_ERR_INVALID_CLASS);
            if (!names) {
                status.rc = CMPI_RC_ERR_INVALID_CLASS;
            }
        }
    });
    for (const unsigned short classId : classIds) {
        const ServedAssociation* association = findAssociation(classId);
        served = association != nullptr;
        if (served) {
            guarded([&] { (association->*column)(request, resultClass); });
        } else {
            status.rc = CMPI_RC_ERR_INVALID_CLASS;
        }
        if (names) {
            traceVariable(at, "rcode", served ? 1U : 0U);
        }
        if (!served) {
            break;
        }
    }
    if (served) {
        request.result->ft->returnDone(request.result);
    }
    markProviderExit(loggerDHCPClientProvider, at.source.file.data(), at.function.data(),
                     at.line.number());
    return status;
}

/// References and their names: of the one association class that is named exactly.
CMPIStatus serveReferences(const Request& request, const char* resultClass, ReferenceColumn column,
                           bool names) {
    const OneMoment moment;
    const TracePoint& at = request.at;
    markProviderEntry(loggerDHCPClientProvider, at.source.file.data(), at.function.data(),
                      at.line.number());
    const unsigned short classId = ProviderUtilities::getClassId(resultClass);
    traceVariable(at, "classId", classId);
    CMPIStatus status{CMPI_RC_OK, nullptr};
    if (const ServedAssociation* association = findAssociation(classId)) {
        try {
            status.rc = (association->*column)(request);
        } catch (const std::exception& exception) {
            // The names handler is the silent one.
            if (!names) {
                traceMessage(at, exception.what());
            }
        }
    } else {
        status.rc = CMPI_RC_ERR_INVALID_CLASS;
    }
    markProviderExit(loggerDHCPClientProvider, at.source.file.data(), at.function.data(),
                     at.line.number());
    return status;
}

CMPIStatus DHCPClient_AssociationCleanup(CMPIAssociationMI* /*mi*/, const CMPIContext* /*ctx*/,
                                         CMPIBoolean /*terminating*/) {
    return {CMPI_RC_OK, nullptr};
}

// Roles are not looked at: a source is served in whatever role it plays.

CMPIStatus DHCPClient_Associators(CMPIAssociationMI* /*mi*/, const CMPIContext* ctx,
                                  const CMPIResult* result, const CMPIObjectPath* path,
                                  const char* assocClass, const char* resultClass,
                                  const char* /*role*/, const char* /*resultRole*/,
                                  const char** properties) {
    return serveAssociators({ctx, result, path, properties, ZR_HERE}, assocClass, resultClass,
                            &ServedAssociation::associators, false);
}

CMPIStatus DHCPClient_AssociatorNames(CMPIAssociationMI* /*mi*/, const CMPIContext* ctx,
                                      const CMPIResult* result, const CMPIObjectPath* path,
                                      const char* assocClass, const char* resultClass,
                                      const char* /*role*/, const char* /*resultRole*/) {
    return serveAssociators({ctx, result, path, nullptr, ZR_HERE}, assocClass, resultClass,
                            &ServedAssociation::associatorNames, true);
}

CMPIStatus DHCPClient_References(CMPIAssociationMI* /*mi*/, const CMPIContext* ctx,
                                 const CMPIResult* result, const CMPIObjectPath* path,
                                 const char* resultClass, const char* /*role*/,
                                 const char** properties) {
    return serveReferences({ctx, result, path, properties, ZR_HERE}, resultClass,
                           &ServedAssociation::references, false);
}

CMPIStatus DHCPClient_ReferenceNames(CMPIAssociationMI* /*mi*/, const CMPIContext* ctx,
                                     const CMPIResult* result, const CMPIObjectPath* path,
                                     const char* resultClass, const char* /*role*/) {
    return serveReferences({ctx, result, path, nullptr, ZR_HERE}, resultClass,
                           &ServedAssociation::referenceNames, true);
}

/// The served association classes in the order in which a class name is compared with
/// their standard ones. Those of one standard class stand together.
constexpr std::array comparedClasses{
    Classes::dhcpElementCapabilities,     Classes::hostedDHCPPoint,
    Classes::dhcpRemoteHostedAccessPoint, Classes::sapSapDependency,
    Classes::dhcpOrderedComponent,        Classes::dhcpRemoteAccessAvailableToElement,
    Classes::dhcpElementSettingData,
};

}  // namespace

bool getClassId(const char* className, const char* nameSpace,
                std::vector<unsigned short>& classIds) {
    const ParameterScope scope(ZR_HERE, " className=", className, " nameSpace=", nameSpace,
                               " classIds=", &classIds);
    const unsigned short classId = ProviderUtilities::getClassId(className);
    if (classId != ProviderUtilities::unknownClass) {
        classIds.push_back(classId);
        return true;
    }
    const std::size_t before = classIds.size();
    const std::string place = nameSpace == nullptr ? "" : nameSpace;
    std::string_view asked;
    bool related = false;
    // A name may be related to several: a common ancestor, say.
    for (const Classes::Class& compared : comparedClasses) {
        if (asked != compared.standardName) {
            asked = compared.standardName;
            related = ProviderUtilities::areClassesRelated(broker, place, className,
                                                           compared.standardName);
        }
        if (related) {
            classIds.push_back(compared.id);
        }
    }
    return classIds.size() != before;
}

constexpr int cmpiLevel = 200;

const CMPIInstanceMIFT instMIFT__{
    cmpiLevel,
    cmpiLevel,
    "instanceDHCPClientProvider",
    &DHCPClient_Cleanup,
    &DHCPClient_EnumInstanceNames,
    &DHCPClient_EnumInstances,
    &DHCPClient_GetInstance,
    &DHCPClient_CreateInstance,
    &DHCPClient_ModifyInstance,
    &DHCPClient_DeleteInstance,
    &DHCPClient_ExecQuery,
};

const CMPIAssociationMIFT assocMIFT__{
    cmpiLevel,
    cmpiLevel,
    "associationDHCPClientProvider",
    &DHCPClient_AssociationCleanup,
    &DHCPClient_Associators,
    &DHCPClient_AssociatorNames,
    &DHCPClient_References,
    &DHCPClient_ReferenceNames,
};

}  // namespace ZR::DHCPClientProvider

namespace {

using ZR::DHCPClientProvider::source;

}  // namespace

CMPIInstanceMI* DHCPClientProvider_Create_InstanceMI(const CMPIBroker* broker,
                                                     const CMPIContext* ctx, CMPIStatus* rc) {
    const ZR::ParameterScope scope(ZR_HERE, " broker=", broker, " ctx=", ctx, " rc=", rc);
    static CMPIInstanceMI mi{nullptr, &ZR::DHCPClientProvider::instMIFT__};
    ZR::DHCPClientProvider::broker = broker;
    ZR::serveLiveMachine();
    return &mi;
}

CMPIAssociationMI* DHCPClientProvider_Create_AssociationMI(const CMPIBroker* broker,
                                                           const CMPIContext* ctx, CMPIStatus* rc) {
    const ZR::ParameterScope scope(ZR_HERE, " broker=", broker, " ctx=", ctx, " rc=", rc);
    static CMPIAssociationMI mi{nullptr, &ZR::DHCPClientProvider::assocMIFT__};
    ZR::DHCPClientProvider::broker = broker;
    ZR::serveLiveMachine();
    return &mi;
}
