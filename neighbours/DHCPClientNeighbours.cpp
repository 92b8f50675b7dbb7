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
#include "zrlinux/LiveSource.h"

/// The CMPI side of the neighbour provider: enumerate, enumerate names and get.
namespace ZR::DHCPClientNeighbours {

namespace {

std::atomic<const CMPIBroker*> broker = nullptr;

const std::string loggerNeighbours = "ZR.Neighbours";

CMPIStatus statusOf(CMPIrc code) {
    return {code, nullptr};
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
    bool operator()(unsigned short number) const {
        return ProviderUtilities::setProperty(instance, name, number);
    }
    bool operator()(const std::vector<unsigned short>& numbers) const {
        return ProviderUtilities::setProperty(broker, instance, name, numbers);
    }
};

/// Null when the broker refuses any part of it.
CMPIInstance* makeInstance(const NeighbourObject& object, const std::string& nameSpace) {
    CMPIInstance* instance = ProviderUtilities::createInstance(broker, makePath(object, nameSpace));
    bool complete = instance != nullptr;
    for (const auto& [name, value] : object.keys) {
        complete = complete && PropertySetter{instance, name.c_str()}(value);
    }
    for (const auto& [name, value] : object.properties) {
        complete = complete && std::visit(PropertySetter{instance, name.c_str()}, value);
    }
    return complete ? instance : nullptr;
}

/// Whether the object agrees with every text key of the path.
bool agrees(const NeighbourObject& object, const CMPIObjectPath* path) {
    Moniker keys;
    ProviderUtilities::transformObjectPathToMoniker(path, keys);
    for (std::size_t i = 0; i < keys.getKeyCount(); ++i) {
        std::string name;
        std::string value;
        if (!keys.selectKey(i) || !keys.getName(name) || !keys.getValue(value)) {
            continue;
        }
        const std::string* actual = object.key(name);
        if (actual == nullptr || *actual != value) {
            return false;
        }
    }
    return true;
}

/// Hands the objects of the path's class, and its namespace, to `give`, and ends the
/// result unless that returns an error. Nothing that is thrown on the way reaches the
/// object manager.
template <typename Give>
CMPIStatus serve(const CMPIResult* result, const CMPIObjectPath* path, const Give& give) {
    try {
        const std::string className = classNameOf(path);
        if (!isNeighbourClass(className)) {
            return statusOf(CMPI_RC_ERR_INVALID_CLASS);
        }
        const std::string nameSpace = ProviderUtilities::getNamespace(path);
        std::string name;
        ProviderUtilities::getKeyProperty(path, "Name", name);
        const CMPIrc code = give(objectsOf(className, name), nameSpace);
        if (code == CMPI_RC_OK) {
            result->ft->returnDone(result);
        }
        return statusOf(code);
    } catch (const std::exception& exception) {
        TKLog::TKLogger::logLevelMessage("neighbours/DHCPClientNeighbours", __func__, __LINE__,
                                         loggerNeighbours, LogLevel::failure, nullptr, 0, 0,
                                         exception.what());
        return statusOf(CMPI_RC_ERR_FAILED);
    }
}

/// A null that the broker made never reaches the result.
bool returnPath(const CMPIResult* result, const CMPIObjectPath* path) {
    return path != nullptr && result->ft->returnObjectPath(result, path).rc == CMPI_RC_OK;
}

bool returnInstance(const CMPIResult* result, const CMPIInstance* instance) {
    return instance != nullptr && result->ft->returnInstance(result, instance).rc == CMPI_RC_OK;
}

CMPIStatus cleanup(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                   CMPIBoolean /*terminating*/) {
    return statusOf(CMPI_RC_OK);
}

CMPIStatus enumerateInstanceNames(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                                  const CMPIResult* result, const CMPIObjectPath* path) {
    return serve(result, path, [&](const auto& objects, const std::string& nameSpace) {
        for (const NeighbourObject& object : objects) {
            if (!returnPath(result, makePath(object, nameSpace))) {
                return CMPI_RC_ERR_FAILED;
            }
        }
        return CMPI_RC_OK;
    });
}

CMPIStatus enumerateInstances(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                              const CMPIResult* result, const CMPIObjectPath* path,
                              const char** /*properties*/) {
    return serve(result, path, [&](const auto& objects, const std::string& nameSpace) {
        for (const NeighbourObject& object : objects) {
            if (!returnInstance(result, makeInstance(object, nameSpace))) {
                return CMPI_RC_ERR_FAILED;
            }
        }
        return CMPI_RC_OK;
    });
}

CMPIStatus getInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/, const CMPIResult* result,
                       const CMPIObjectPath* path, const char** /*properties*/) {
    return serve(result, path, [&](const auto& objects, const std::string& nameSpace) {
        for (const NeighbourObject& object : objects) {
            if (agrees(object, path)) {
                return returnInstance(result, makeInstance(object, nameSpace)) ? CMPI_RC_OK
                                                                               : CMPI_RC_ERR_FAILED;
            }
        }
        return CMPI_RC_ERR_NOT_FOUND;
    });
}

CMPIStatus createInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                          const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/,
                          const CMPIInstance* /*instance*/) {
    return statusOf(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIStatus modifyInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                          const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/,
                          const CMPIInstance* /*instance*/, const char** /*properties*/) {
    return statusOf(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIStatus deleteInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                          const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/) {
    return statusOf(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIStatus execQuery(CMPIInstanceMI* /*mi*/, const CMPIContext* /*ctx*/,
                     const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/,
                     const char* /*query*/, const char* /*language*/) {
    return statusOf(CMPI_RC_ERR_NOT_SUPPORTED);
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
