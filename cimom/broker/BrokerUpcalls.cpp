// The broker's own table: attaching threads, and the requests that a provider
// makes to other providers.
#include <utility>

#include "broker/Broker.h"
#include "broker/Conversion.h"
#include "broker/IndicationSink.h"
#include "broker/RequestScope.h"
#include "broker/objects/BrokerRecords.h"
#include "broker/objects/BrokerStatus.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "cimom/Query.h"
#include "cimom/Requests.h"
#include "cimom/Results.h"

namespace cimom::broker {

namespace {

/// What this host really does; only methods are not called.
constexpr unsigned capabilities =
    CMPI_MB_InstanceManipulation | CMPI_MB_AssociationTraversal | CMPI_MB_QueryExecution |
    CMPI_MB_Indications | CMPI_MB_OSEncapsulationSupport | CMPI_MB_Supports_MemEnhancements |
    CMPI_MB_Supports_Extended_Error;

CMPIContext* prepareAttachThread(const CMPIBroker* mb, const CMPIContext* context) {
    return guarded<CMPIContext*>(nullptr, nullptr, [=](CMPIrc&) -> CMPIContext* {
        Broker* const broker = Broker::of(mb);
        return broker == nullptr ? nullptr : broker->prepareThread(context);
    });
}

CMPIStatus attachThread(const CMPIBroker* mb, const CMPIContext* context) {
    return guarded([=] {
        Broker* const broker = Broker::of(mb);
        return broker == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : broker->attachThread(context);
    });
}

CMPIStatus detachThread(const CMPIBroker* mb, const CMPIContext* context) {
    return guarded([=] {
        Broker* const broker = Broker::of(mb);
        return broker == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : broker->detachThread(context);
    });
}

std::optional<std::vector<std::string>> listOf(const char** properties) {
    if (properties == nullptr) {
        return std::nullopt;
    }
    std::vector<std::string> names;
    for (; *properties != nullptr; ++properties) {
        names.emplace_back(*properties);
    }
    return names;
}

std::optional<std::string> textOrNone(const char* text) {
    return text == nullptr ? std::nullopt : std::optional<std::string>(text);
}

/// Checks what every request to another provider needs, runs it and makes a
/// CMPIStatus of the status that it gives. The request gets handler and path.
template <typename Request>
CMPIStatus ask(const CMPIBroker* mb, const CMPIObjectPath* op, Request&& request) {
    Broker* const broker = Broker::of(mb);
    const PathRecord* const path = pathOf(op);
    if (broker == nullptr) {
        return statusOf(CMPI_RC_ERR_INVALID_HANDLE);
    }
    const Broker::Asking asking(*broker);
    RequestHandler* const handler = asking.handler();
    if (path == nullptr) {
        return statusOf(CMPI_RC_ERR_INVALID_PARAMETER);
    }
    if (handler == nullptr) {
        return statusOf(CMPI_RC_ERR_NOT_SUPPORTED);
    }
    try {
        const Status status = std::forward<Request>(request)(*handler, toModel(*path));
        CMPIString* const message =
            status.message.empty() ? nullptr
                                   : makeString(RequestScope::current().arena(), status.message);
        return {status.code, message};
    } catch (const std::exception&) {
        return statusOf(CMPI_RC_ERR_FAILED);
    }
}

void write(CMPIStatus* rc, const CMPIStatus& status) noexcept {
    if (rc != nullptr) {
        *rc = status;
    }
}

CMPIData elementOf(Arena& arena, const ClassRepository* classes, const ObjectPath& path) {
    CMPIData data{};
    data.type = CMPI_ref;
    data.value.ref = toRecord(arena, classes, path);
    return data;
}

CMPIData elementOf(Arena& arena, const ClassRepository* classes, const Instance& instance) {
    CMPIData data{};
    data.type = CMPI_instance;
    data.value.inst = toRecord(arena, classes, instance);
    return data;
}

/// The objects of a request as an enumeration; absent ones are passed over. The
/// request gets handler, path and receiver.
template <typename Object, typename Request>
CMPIEnumeration* askObjects(const CMPIBroker* mb, const CMPIObjectPath* op, CMPIStatus* rc,
                            Request&& request) {
    CollectedObjects<Object> result;
    const CMPIStatus status = ask(mb, op, [&](RequestHandler& handler, const ObjectPath& path) {
        return std::forward<Request>(request)(handler, path, result).status;
    });
    if (status.rc != CMPI_RC_OK) {
        write(rc, status);
        return nullptr;
    }
    return guarded<CMPIEnumeration*>(rc, nullptr, [&](CMPIrc&) -> CMPIEnumeration* {
        Arena& arena = RequestScope::current().arena();
        const ClassRepository* const classes = &Broker::of(mb)->classes();
        CMPICount count = 0;
        for (const auto& object : result.objects) {
            count += object ? 1U : 0U;
        }
        constexpr bool paths = std::is_same_v<Object, ObjectPath>;
        ArrayRecord* const array = makeArray(arena, count, paths ? CMPI_ref : CMPI_instance);
        CMPICount index = 0;
        for (const auto& object : result.objects) {
            if (object) {
                array->elements[index] = elementOf(arena, classes, *object);
                ++index;
            }
        }
        return makeEnumeration(arena, array);
    });
}

CMPIEnumeration* enumerateInstanceNames(const CMPIBroker* mb, const CMPIContext* context,
                                        const CMPIObjectPath* op, CMPIStatus* rc) {
    return askObjects<ObjectPath>(
        mb, op, rc, [&](RequestHandler& handler, const ObjectPath& path, auto& receiver) {
            return handler.enumerateInstanceNames(path, {std::nullopt, principalOf(context)},
                                                  receiver);
        });
}

CMPIEnumeration* enumerateInstances(const CMPIBroker* mb, const CMPIContext* context,
                                    const CMPIObjectPath* op, const char** properties,
                                    CMPIStatus* rc) {
    return askObjects<Instance>(
        mb, op, rc, [&](RequestHandler& handler, const ObjectPath& path, auto& receiver) {
            return handler.enumerateInstances(path, {listOf(properties), principalOf(context)},
                                              receiver);
        });
}

/// A result without instance is one that was not found.
CMPIStatus askInstance(const CMPIBroker* mb, const CMPIContext* context, const CMPIObjectPath* op,
                       std::optional<std::vector<std::string>> properties,
                       InstancesResult& result) {
    CMPIStatus status = ask(mb, op, [&](RequestHandler& handler, const ObjectPath& path) {
        result = handler.getInstance(path, {std::move(properties), principalOf(context)});
        return result.status;
    });
    if (status.rc == CMPI_RC_OK && (result.instances.empty() || !result.instances.front())) {
        status.rc = CMPI_RC_ERR_NOT_FOUND;
    }
    return status;
}

CMPIInstance* getInstance(const CMPIBroker* mb, const CMPIContext* context,
                          const CMPIObjectPath* op, const char** properties, CMPIStatus* rc) {
    InstancesResult result;
    const CMPIStatus status = askInstance(mb, context, op, listOf(properties), result);
    if (status.rc != CMPI_RC_OK) {
        write(rc, status);
        return nullptr;
    }
    return guarded<CMPIInstance*>(rc, nullptr, [&](CMPIrc&) {
        return toRecord(RequestScope::current().arena(), &Broker::of(mb)->classes(),
                        *result.instances.front());
    });
}

CMPIData getProperty(const CMPIBroker* mb, const CMPIContext* context, const CMPIObjectPath* op,
                     const char* name, CMPIStatus* rc) {
    if (name == nullptr) {
        setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER);
        return missingData();
    }
    InstancesResult result;
    const CMPIStatus status = askInstance(mb, context, op, std::vector<std::string>{name}, result);
    if (status.rc != CMPI_RC_OK) {
        write(rc, status);
        return missingData();
    }
    return guarded(rc, missingData(), [&](CMPIrc& code) -> CMPIData {
        const ClassRepository* const classes = &Broker::of(mb)->classes();
        const Instance& instance = *result.instances.front();
        if (const Value* const value = instance.property(name)) {
            return toData(RequestScope::current().arena(), classes, *value);
        }
        const ClassDeclaration* const declaration = classes->find(instance.path.className);
        const PropertyDeclaration* const declared =
            declaration == nullptr ? nullptr : declaration->property(name);
        if (declared == nullptr) {
            code = CMPI_RC_ERR_NO_SUCH_PROPERTY;
            return {};
        }
        // A property that an instance leaves out is null.
        return toData(RequestScope::current().arena(), classes,
                      Value::null(declared->type, declared->isArray));
    });
}

CMPIStatus modifyInstance(const CMPIBroker* mb, const CMPIContext* context,
                          const CMPIObjectPath* op, const CMPIInstance* instance,
                          const char** properties) {
    const InstanceRecord* const record = instanceOf(instance);
    if (record == nullptr) {
        return statusOf(CMPI_RC_ERR_INVALID_PARAMETER);
    }
    return ask(mb, op, [&](RequestHandler& handler, ObjectPath path) {
        Instance changed = toModel(*record);
        changed.path = std::move(path);
        return handler.modifyInstance(changed, {listOf(properties), principalOf(context)}).status;
    });
}

CMPIObjectPath* createInstance(const CMPIBroker* mb, const CMPIContext* context,
                               const CMPIObjectPath* op, const CMPIInstance* instance,
                               CMPIStatus* rc) {
    const InstanceRecord* const record = instanceOf(instance);
    if (record == nullptr) {
        setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER);
        return nullptr;
    }
    PathsResult result;
    const CMPIStatus status = ask(mb, op, [&](RequestHandler& handler, ObjectPath path) {
        Instance created = toModel(*record);
        created.path = std::move(path);
        result = handler.createInstance(created, {std::nullopt, principalOf(context)});
        return result.status;
    });
    if (status.rc != CMPI_RC_OK) {
        write(rc, status);
        return nullptr;
    }
    return guarded<CMPIObjectPath*>(rc, nullptr, [&](CMPIrc&) {
        return toRecord(RequestScope::current().arena(), &Broker::of(mb)->classes(),
                        *result.paths.front());
    });
}

CMPIStatus deleteInstance(const CMPIBroker* mb, const CMPIContext* context,
                          const CMPIObjectPath* op) {
    return ask(mb, op, [&](RequestHandler& handler, const ObjectPath& path) {
        return handler.deleteInstance(path, {std::nullopt, principalOf(context)});
    });
}

/// The instance with this one property, which is the only one that may change.
CMPIStatus setProperty(const CMPIBroker* mb, const CMPIContext* context, const CMPIObjectPath* op,
                       const char* name, const CMPIValue* value, CMPIType type) {
    const Broker* const broker = Broker::of(mb);
    const PathRecord* const path = pathOf(op);
    if (broker == nullptr || path == nullptr || name == nullptr) {
        return statusOf(broker == nullptr ? CMPI_RC_ERR_INVALID_HANDLE
                                          : CMPI_RC_ERR_INVALID_PARAMETER);
    }
    CMPIStatus made{CMPI_RC_OK, nullptr};
    const CMPIInstance* const instance =
        guarded<CMPIInstance*>(&made, nullptr, [&](CMPIrc& code) -> CMPIInstance* {
            const ObjectPath named = toModel(*path);
            const ClassDeclaration* const declaration = broker->classes().find(named.className);
            if (declaration != nullptr && declaration->property(name) == nullptr) {
                code = CMPI_RC_ERR_NO_SUCH_PROPERTY;
                return nullptr;
            }
            return makeInstance(RequestScope::current().arena(), *path);
        });
    if (instance != nullptr) {
        made = instance->ft->setProperty(instance, name, value, type);
    }
    if (made.rc != CMPI_RC_OK) {
        return made;
    }
    const char* only[] = {name, nullptr};
    return modifyInstance(mb, context, op, instance, only);
}

/// The path counts for its namespace alone: the query names the class.
CMPIEnumeration* execQuery(const CMPIBroker* mb, const CMPIContext* context,
                           const CMPIObjectPath* op, const char* query, const char* language,
                           CMPIStatus* rc) {
    if (query == nullptr || language == nullptr) {
        setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER);
        return nullptr;
    }
    return askObjects<Instance>(
        mb, op, rc,
        [&](RequestHandler& handler, const ObjectPath& path, auto& receiver) -> RequestEnd {
            try {
                return handler.execQuery(path.nameSpace, Query::parse(language, query),
                                         {std::nullopt, principalOf(context)}, receiver);
            } catch (const QueryError& error) {
                return {{error.code, error.what()}};
            }
        });
}

AssociationRequest associationRequest(const CMPIContext* context, const char* assocClass,
                                      const char* resultClass, const char* role,
                                      const char* resultRole, const char** properties) {
    return {textOrNone(assocClass), textOrNone(resultClass), textOrNone(role),
            textOrNone(resultRole), listOf(properties),      principalOf(context)};
}

CMPIEnumeration* associators(const CMPIBroker* mb, const CMPIContext* context,
                             const CMPIObjectPath* op, const char* assocClass,
                             const char* resultClass, const char* role, const char* resultRole,
                             const char** properties, CMPIStatus* rc) {
    return askObjects<Instance>(
        mb, op, rc, [&](RequestHandler& handler, const ObjectPath& path, auto& receiver) {
            return handler.associators(
                path,
                associationRequest(context, assocClass, resultClass, role, resultRole, properties),
                receiver);
        });
}

CMPIEnumeration* associatorNames(const CMPIBroker* mb, const CMPIContext* context,
                                 const CMPIObjectPath* op, const char* assocClass,
                                 const char* resultClass, const char* role, const char* resultRole,
                                 CMPIStatus* rc) {
    return askObjects<ObjectPath>(
        mb, op, rc, [&](RequestHandler& handler, const ObjectPath& path, auto& receiver) {
            return handler.associatorNames(
                path,
                associationRequest(context, assocClass, resultClass, role, resultRole, nullptr),
                receiver);
        });
}

CMPIEnumeration* references(const CMPIBroker* mb, const CMPIContext* context,
                            const CMPIObjectPath* op, const char* resultClass, const char* role,
                            const char** properties, CMPIStatus* rc) {
    return askObjects<Instance>(
        mb, op, rc, [&](RequestHandler& handler, const ObjectPath& path, auto& receiver) {
            return handler.references(
                path, associationRequest(context, nullptr, resultClass, role, nullptr, properties),
                receiver);
        });
}

CMPIEnumeration* referenceNames(const CMPIBroker* mb, const CMPIContext* context,
                                const CMPIObjectPath* op, const char* resultClass, const char* role,
                                CMPIStatus* rc) {
    return askObjects<ObjectPath>(
        mb, op, rc, [&](RequestHandler& handler, const ObjectPath& path, auto& receiver) {
            return handler.referenceNames(
                path, associationRequest(context, nullptr, resultClass, role, nullptr, nullptr),
                receiver);
        });
}

/// The context is not looked at: some providers deliver with one whose request has ended.
CMPIStatus deliverIndication(const CMPIBroker* mb, const CMPIContext*, const char* nameSpace,
                             const CMPIInstance* indication) {
    return guarded([=] {
        const Broker* const broker = Broker::of(mb);
        const InstanceRecord* const record = instanceOf(indication);
        if (broker == nullptr || record == nullptr) {
            return broker == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_ERR_INVALID_PARAMETER;
        }
        if (broker->sink() == nullptr) {
            return CMPI_RC_ERR_NOT_SUPPORTED;
        }
        Instance copy = toModel(*record);
        if (copy.path.nameSpace.empty() && nameSpace != nullptr) {
            copy.path.nameSpace = nameSpace;
        }
        return broker->sink()->take(*broker, std::move(copy));
    });
}

// What this host has no meaning for.

CMPIData invokeMethod(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*, const char*,
                      const CMPIArgs*, CMPIArgs*, CMPIStatus* rc) {
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return badData();
}

}  // namespace

const CMPIBrokerFT brokerTable{
    capabilities, CMPIVersion200,     "cimom",           prepareAttachThread,
    attachThread, detachThread,       deliverIndication, enumerateInstanceNames,
    getInstance,  createInstance,     modifyInstance,    deleteInstance,
    execQuery,    enumerateInstances, associators,       associatorNames,
    references,   referenceNames,     invokeMethod,      setProperty,
    getProperty};

}  // namespace cimom::broker
