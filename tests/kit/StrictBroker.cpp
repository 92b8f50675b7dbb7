#include "kit/StrictBroker.h"

#include <utility>

#include "cimom/DateTimeText.h"
#include "cimom/Names.h"
#include "kit/StrictHost.h"
#include "kit/StrictObjects.h"

namespace strict {

namespace {

/// The host behind the broker; null with a violation when the broker is null.
StrictHost* hostOf(const CMPIBroker* broker, const char* function) {
    return given(broker, function, "broker") ? &StrictHost::of(broker) : nullptr;
}

CMPIInstance* newInstance(const CMPIBroker* broker, const CMPIObjectPath* path,
                          CMPIStatus* status) {
    const StrictHost* host = hostOf(broker, "newInstance");
    const PathObject* object = RequestObjects::get<PathObject>(path, "newInstance");
    setStatus(status, host == nullptr || object == nullptr ? CMPI_RC_ERR_FAILED : CMPI_RC_OK);
    if (host == nullptr || object == nullptr) {
        return nullptr;
    }
    return RequestObjects::make<InstanceObject>(host->repository(),
                                                cimom::Instance{object->model, {}});
}

CMPIObjectPath* newObjectPath(const CMPIBroker* broker, const char* nameSpace,
                              const char* className, CMPIStatus* status) {
    const StrictHost* host = hostOf(broker, "newObjectPath");
    if (host == nullptr || !given(nameSpace, "newObjectPath", "namespace") ||
        !given(className, "newObjectPath", "class name")) {
        setStatus(status, CMPI_RC_ERR_INVALID_PARAMETER);
        return nullptr;
    }
    setStatus(status, CMPI_RC_OK);
    return RequestObjects::make<PathObject>(host->repository(),
                                            cimom::ObjectPath{"", nameSpace, className, {}});
}

CMPIString* newString(const CMPIBroker* broker, const char* text, CMPIStatus* status) {
    if (hostOf(broker, "newString") == nullptr || !given(text, "newString", "text")) {
        setStatus(status, CMPI_RC_ERR_INVALID_PARAMETER);
        return nullptr;
    }
    setStatus(status, CMPI_RC_OK);
    return RequestObjects::make<StringObject>(text);
}

CMPIDateTime* newDateTimeFromChars(const CMPIBroker* broker, const char* text, CMPIStatus* status) {
    const bool usable = hostOf(broker, "newDateTimeFromChars") != nullptr &&
                        given(text, "newDateTimeFromChars", "text");
    if (!usable || !cimom::parseDateTime(text)) {
        if (usable) {
            violations().add("newDateTimeFromChars was given \"" + std::string(text) + '"');
        }
        setStatus(status, CMPI_RC_ERR_INVALID_PARAMETER);
        return nullptr;
    }
    setStatus(status, CMPI_RC_OK);
    return RequestObjects::make<DateTimeObject>(text);
}

CMPIArray* newArray(const CMPIBroker* broker, CMPICount size, CMPIType type, CMPIStatus* status) {
    const StrictHost* host = hostOf(broker, "newArray");
    if (host == nullptr) {
        setStatus(status, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    setStatus(status, CMPI_RC_OK);
    return RequestObjects::make<ArrayObject>(host->repository(), size, type);
}

/// An unknown class equals itself alone, and without namespace no class has parents.
CMPIBoolean classPathIsA(const CMPIBroker* broker, const CMPIObjectPath* path, const char* ancestor,
                         CMPIStatus* status) {
    const StrictHost* host = hostOf(broker, "classPathIsA");
    const PathObject* object = RequestObjects::get<PathObject>(path, "classPathIsA");
    if (host == nullptr || object == nullptr || !given(ancestor, "classPathIsA", "class name")) {
        setStatus(status, CMPI_RC_ERR_INVALID_PARAMETER);
        return 0;
    }
    setStatus(status, CMPI_RC_OK);
    const cimom::ObjectPath& model = object->model;
    const bool derives =
        !model.nameSpace.empty() && host->repository().isA(model.className, ancestor);
    return derives || cimom::sameName(model.className, ancestor) ? 1 : 0;
}

/// The path of a request to another provider; null with a violation when any of its
/// arguments is missing.
const PathObject* asked(const CMPIBroker* broker, const CMPIContext* context,
                        const CMPIObjectPath* path, const char* function) {
    const bool usable = hostOf(broker, function) != nullptr &&
                        RequestObjects::get<ContextObject>(context, function) != nullptr;
    return usable ? RequestObjects::get<PathObject>(path, function) : nullptr;
}

CMPIEnumeration* enumerateInstances(const CMPIBroker* broker, const CMPIContext* context,
                                    const CMPIObjectPath* path, const char** properties,
                                    CMPIStatus* status) {
    const PathObject* object = asked(broker, context, path, "enumerateInstances");
    if (object == nullptr) {
        setStatus(status, CMPI_RC_ERR_INVALID_PARAMETER);
        return nullptr;
    }
    StrictHost& host = StrictHost::of(broker);
    StrictHost::Response given = host.enumerate(object->model, properties);
    setStatus(status, given.code);
    return given.code == CMPI_RC_OK ? RequestObjects::make<EnumerationObject>(
                                          host.repository(), std::move(given.instances))
                                    : nullptr;
}

CMPIInstance* getInstance(const CMPIBroker* broker, const CMPIContext* context,
                          const CMPIObjectPath* path, const char** properties, CMPIStatus* status) {
    const PathObject* object = asked(broker, context, path, "getInstance");
    if (object == nullptr) {
        setStatus(status, CMPI_RC_ERR_INVALID_PARAMETER);
        return nullptr;
    }
    StrictHost& host = StrictHost::of(broker);
    StrictHost::Response given = host.get(object->model, properties);
    // OK without an instance is one that was not found.
    const CMPIrc code =
        given.code == CMPI_RC_OK && given.instances.empty() ? CMPI_RC_ERR_NOT_FOUND : given.code;
    setStatus(status, code);
    return code == CMPI_RC_OK
               ? RequestObjects::make<InstanceObject>(host.repository(), given.instances.front())
               : nullptr;
}

// The rest is null: what no provider of ours needs, SFCB's or OpenPegasus' broker may lack.

CMPIBrokerFT makeFunctions(unsigned int version) {
    CMPIBrokerFT table{};
    table.brokerVersion = version;
    table.brokerName = "strict";
    table.enumerateInstances = &enumerateInstances;
    table.getInstance = &getInstance;
    return table;
}

constexpr unsigned int version200 = 200;
const CMPIBrokerFT functions = makeFunctions(0);
const CMPIBrokerFT functionsThatTellTheirVersion = makeFunctions(version200);

const CMPIBrokerEncFT encapsulation = [] {
    CMPIBrokerEncFT table{};
    table.ftVersion = 1;
    table.newInstance = &newInstance;
    table.newObjectPath = &newObjectPath;
    table.newString = &newString;
    table.newArray = &newArray;
    table.newDateTimeFromChars = &newDateTimeFromChars;
    table.classPathIsA = &classPathIsA;
    return table;
}();

const CMPIBrokerExtFT extension{};
const CMPIBrokerMemFT memory{};

}  // namespace

CMPIBroker strictBroker(StrictHost& host, const Traits& traits) {
    return {&host, traits.tellsItsVersion ? &functionsThatTellTheirVersion : &functions,
            &encapsulation, &extension, &memory};
}

}  // namespace strict
