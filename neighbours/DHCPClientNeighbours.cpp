#include <cmpift.h>

#include <algorithm>
#include <atomic>
#include <exception>
#include <string>
#include <utility>
#include <vector>

#include "NeighbourObjects.h"
#include "providerutilities/ProviderUtilities.h"
#include "tklogger/TKLogger.h"
#include "zrcommon/LogLevel.h"
#include "zrcommon/Strings.h"
#include "zrlinux/LiveSource.h"

/// The CMPI side of the neighbour provider: enumerate, enumerate names and get.
namespace ZR::DHCPClientNeighbours {

namespace {

std::atomic<const CMPIBroker*> broker = nullptr;

const std::string loggerNeighbours = "ZR.Neighbours";

/// What a request is refused with.
struct Refusal {
    CMPIrc code;
    std::string message;
};

CMPIStatus statusOf(CMPIrc code) {
    return {code, nullptr};
}

/// The message belongs to the host, and ends with the request.
CMPIStatus statusOf(const Refusal& refusal) {
    const CMPIBroker* host = broker;
    CMPIStatus status{refusal.code, nullptr};
    try {
        if (host != nullptr) {
            status.msg = host->eft->newString(host, refusal.message.c_str(), nullptr);
        }
    } catch (const std::exception&) {
        // The code says what matters most, and nothing else can be told this host.
        status.msg = nullptr;
    }
    return status;
}

CMPIStatus notSupported() {
    return statusOf(Refusal{CMPI_RC_ERR_NOT_SUPPORTED, "This provider only reads"});
}

std::string classNameOf(const CMPIObjectPath* path) {
    const CMPIString* name = path->ft->getClassName(path, nullptr);
    const char* text = name == nullptr ? nullptr : name->ft->getCharPtr(name, nullptr);
    return text == nullptr ? "" : text;
}

/// Null when the broker refuses any part of it: an object with half its keys would
/// be another one.
CMPIObjectPath* makePath(const NeighbourObject& object, const std::string& nameSpace) {
    CMPIObjectPath* path =
        ProviderUtilities::createObjectPath(broker, object.className.c_str(), nameSpace);
    const bool complete =
        std::all_of(object.keys.begin(), object.keys.end(), [path](const auto& key) {
            return ProviderUtilities::setKeyProperty(path, key.first.c_str(), key.second);
        });
    return complete ? path : nullptr;
}

/// Sets one property; false when the broker refuses.
struct PropertySetter {
    CMPIInstance* instance;
    const char* name;

    bool operator()(const std::string& text) const {
        return ProviderUtilities::setProperty(instance, name, text);
    }
    bool operator()(std::monostate /*null*/) const {
        return ProviderUtilities::setNull(instance, name, CMPI_uint16);
    }
    bool operator()(unsigned short number) const {
        return ProviderUtilities::setProperty(instance, name, number);
    }
    bool operator()(const std::vector<unsigned short>& numbers) const {
        return ProviderUtilities::setProperty(broker, instance, name, numbers);
    }
};

/// Sets one property to the null of its type.
struct NullSetter {
    CMPIInstance* instance;
    const char* name;

    bool operator()(const std::string& /*text*/) const { return set(CMPI_string); }
    bool operator()(std::monostate /*null*/) const { return set(CMPI_uint16); }
    bool operator()(unsigned short /*number*/) const { return set(CMPI_uint16); }
    bool operator()(const std::vector<unsigned short>& /*numbers*/) const {
        return set(CMPI_uint16A);
    }

  private:
    [[nodiscard]] bool set(CMPIType type) const {
        return ProviderUtilities::setNull(instance, name, type);
    }
};

/// Null when the broker refuses any part of it. What a property list leaves out is set to
/// null: unset, some object managers show the default of the schema.
CMPIInstance* makeInstance(const NeighbourObject& object, const std::string& nameSpace,
                           const char** properties) {
    CMPIInstance* instance = ProviderUtilities::createInstance(broker, makePath(object, nameSpace));
    bool complete = instance != nullptr;
    for (const auto& [name, value] : object.keys) {
        if (ProviderUtilities::isListed(properties, name)) {
            complete = complete && PropertySetter{instance, name.c_str()}(value);
        }
    }
    for (const auto& [name, value] : object.properties) {
        complete = complete && (ProviderUtilities::isListed(properties, name)
                                    ? std::visit(PropertySetter{instance, name.c_str()}, value)
                                    : std::visit(NullSetter{instance, name.c_str()}, value));
    }
    return complete ? instance : nullptr;
}

/// Throws Refusal when the path has a key that its class does not have. It need not have all:
/// the exact provider asks for what is at the other end of an association by what it was
/// given itself, and takes the first.
void requireOwnKeys(const CMPIObjectPath* path, const std::string& className) {
    const auto names = keysOf(className);
    const auto known = std::count_if(names.begin(), names.end(), [path](const char* name) {
        std::string value;
        return ProviderUtilities::getKeyProperty(path, name, value);
    });
    if (ProviderUtilities::getKeyCount(path) != static_cast<std::size_t>(known)) {
        throw Refusal{
            CMPI_RC_ERR_INVALID_PARAMETER,
            "The path has a key that " + className + " does not have, or one that is not a text"};
    }
}

/// Whether the object agrees with all that a path names.
bool agrees(const NeighbourObject& object, const CMPIObjectPath* path) {
    return equalNames(object.className, classNameOf(path)) &&
           std::all_of(object.keys.begin(), object.keys.end(), [path](const auto& key) {
               std::string value;
               return !ProviderUtilities::getKeyProperty(path, key.first.c_str(), value) ||
                      value == key.second;
           });
}

/// Hands the objects of the path's class, and its namespace, to `give`, and ends the
/// result. Nothing that is thrown on the way reaches the object manager.
template <typename Give>
CMPIStatus serve(const CMPIResult* result, const CMPIObjectPath* path, const Give& give) {
    try {
        const std::string className = classNameOf(path);
        if (!isNeighbourClass(className)) {
            throw Refusal{CMPI_RC_ERR_INVALID_CLASS,
                          "This provider does not serve the class " + className};
        }
        const std::string nameSpace = ProviderUtilities::getNamespace(path);
        std::string name;
        ProviderUtilities::getKeyProperty(path, "Name", name);
        give(objectsOf(className, name), nameSpace);
        result->ft->returnDone(result);
        return statusOf(CMPI_RC_OK);
    } catch (const Refusal& refusal) {
        return statusOf(refusal);
    } catch (const std::exception& exception) {
        TKLog::TKLogger::logLevelMessage("neighbours/DHCPClientNeighbours", __func__, __LINE__,
                                         loggerNeighbours, LogLevel::failure, nullptr, 0, 0,
                                         exception.what());
        return statusOf(Refusal{CMPI_RC_ERR_FAILED, exception.what()});
    }
}

void requireTaken(bool taken) {
    if (!taken) {
        throw Refusal{CMPI_RC_ERR_FAILED, "The object manager refuses a part of the result"};
    }
}

/// A null that the broker made never reaches the result.
void returnPath(const CMPIResult* result, const CMPIObjectPath* path) {
    requireTaken(path != nullptr && result->ft->returnObjectPath(result, path).rc == CMPI_RC_OK);
}

void returnInstance(const CMPIResult* result, const CMPIInstance* instance) {
    requireTaken(instance != nullptr &&
                 result->ft->returnInstance(result, instance).rc == CMPI_RC_OK);
}

CMPIStatus cleanup(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                   CMPIBoolean /*terminating*/) {
    return statusOf(CMPI_RC_OK);
}

CMPIStatus enumerateInstanceNames(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                                  const CMPIResult* result, const CMPIObjectPath* path) {
    return serve(result, path, [&](const auto& objects, const std::string& nameSpace) {
        for (const NeighbourObject& object : objects) {
            returnPath(result, makePath(object, nameSpace));
        }
    });
}

CMPIStatus enumerateInstances(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                              const CMPIResult* result, const CMPIObjectPath* path,
                              const char** properties) {
    return serve(result, path, [&](const auto& objects, const std::string& nameSpace) {
        for (const NeighbourObject& object : objects) {
            returnInstance(result, makeInstance(object, nameSpace, properties));
        }
    });
}

CMPIStatus getInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/, const CMPIResult* result,
                       const CMPIObjectPath* path, const char** properties) {
    return serve(result, path, [&](const auto& objects, const std::string& nameSpace) {
        const std::string className = classNameOf(path);
        requireOwnKeys(path, className);
        const auto found =
            std::find_if(objects.begin(), objects.end(),
                         [path](const NeighbourObject& object) { return agrees(object, path); });
        if (found == objects.end()) {
            throw Refusal{CMPI_RC_ERR_NOT_FOUND, "There is no such instance of " + className};
        }
        returnInstance(result, makeInstance(*found, nameSpace, properties));
    });
}

CMPIStatus createInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                          const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/,
                          const CMPIInstance* /*instance*/) {
    return notSupported();
}

CMPIStatus modifyInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                          const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/,
                          const CMPIInstance* /*instance*/, const char** /*properties*/) {
    return notSupported();
}

CMPIStatus deleteInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                          const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/) {
    return notSupported();
}

CMPIStatus execQuery(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                     const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/,
                     const char* /*query*/, const char* /*language*/) {
    return notSupported();
}

constexpr int cmpiLevel = 200;

constexpr CMPIInstanceMIFT functionTable{
    cmpiLevel,
    cmpiLevel,
    "instanceDHCPClientNeighbours",
    &cleanup,
    &enumerateInstanceNames,
    &enumerateInstances,
    &getInstance,
    &createInstance,
    &modifyInstance,
    &deleteInstance,
    &execQuery,
};

}  // namespace

}  // namespace ZR::DHCPClientNeighbours

CMPI_EXTERN_C CMPIInstanceMI* DHCPClientNeighbours_Create_InstanceMI(const CMPIBroker* broker,
                                                                     const CMPIContext* ctx,
                                                                     CMPIStatus* rc);

CMPIInstanceMI* DHCPClientNeighbours_Create_InstanceMI(const CMPIBroker* broker,
                                                       const CMPIContext* /*ctx*/,
                                                       CMPIStatus* /*rc*/) {
    static CMPIInstanceMI mi{nullptr, &ZR::DHCPClientNeighbours::functionTable};
    ZR::DHCPClientNeighbours::broker = broker;
    ZR::serveLiveMachine();
    return &mi;
}
