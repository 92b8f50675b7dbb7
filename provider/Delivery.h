#pragma once

#include <cmpift.h>

#include "DHCPClientProvider.h"
#include "include/TracePoint.h"

/// How the objects of an adapter's walk reach the result of a request: one function
/// template for each kind of request, which the tables of the served classes are
/// filled with.
namespace ZR::DHCPClientProvider {

/// What one request hands to the walk that serves it.
struct Request {
    const CMPIContext* context = nullptr;
    const CMPIResult* result = nullptr;
    const CMPIObjectPath* path = nullptr;
    const char** properties = nullptr;
    TracePoint at;
};

/// Whether a walk tells the result that it is complete, or leaves that to the
/// object manager. Which does which is uneven, and clients have long relied on it.
enum class Ending { returnDone, left };

/// Passes one object on. The broker may have refused to make it: a null is told in
/// a failure line and never reaches the object manager, some of which die of one.
template <typename Object>
void deliver(const Request& request, Object* object,
             CMPIStatus (*give)(const CMPIResult*, const Object*)) {
    if (object == nullptr) {
        traceMessage(request.at, "The broker made no object; it is left out of the result");
        return;
    }
    // An object manager that has given up on the request refuses; the walk is
    // short enough to end by itself.
    static_cast<void>(give(request.result, object));
}

/// Walks a whole adapter. It still exists when the result is told that it is complete.
template <typename Adapter, Ending ending, typename Give>
CMPIrc walk(const Request& request, const Give& give) {
    Adapter adapter(broker, request.context, request.path);
    for (; adapter; ++adapter) {
        give(adapter);
    }
    if constexpr (ending == Ending::returnDone) {
        request.result->ft->returnDone(request.result);
    }
    return CMPI_RC_OK;
}

template <typename Adapter, Ending ending>
CMPIrc deliverPaths(const Request& request) {
    return walk<Adapter, ending>(request, [&request](Adapter& adapter) {
        deliver(request, adapter.getObjectPath(), request.result->ft->returnObjectPath);
    });
}

template <typename Adapter, Ending ending>
CMPIrc deliverInstances(const Request& request) {
    return walk<Adapter, ending>(request, [&request](Adapter& adapter) {
        deliver(request, adapter.getCMPIInstance(request.properties),
                request.result->ft->returnInstance);
    });
}

/// Walks the far ends, unless the client wants another class than the adapter has there.
/// The adapter is gone before the next association is served; the result is told that it
/// is complete after the last one.
template <typename Adapter, typename Give>
void walkFarEnds(const Request& request, const char* resultClass, const Give& give) {
    Adapter adapter(broker, request.context, request.path);
    if (resultClass != nullptr && adapter.isNotTargetClass(resultClass)) {
        return;
    }
    for (; adapter; ++adapter) {
        give(adapter);
    }
}

template <typename Adapter>
void deliverAssociatorNames(const Request& request, const char* resultClass) {
    walkFarEnds<Adapter>(request, resultClass, [&request](Adapter& adapter) {
        deliver(request, adapter.getAssociatorNames(), request.result->ft->returnObjectPath);
    });
}

template <typename Adapter>
void deliverAssociators(const Request& request, const char* resultClass) {
    walkFarEnds<Adapter>(request, resultClass, [&request](Adapter& adapter) {
        deliver(request, adapter.getAssociator(request.properties),
                request.result->ft->returnInstance);
    });
}

}  // namespace ZR::DHCPClientProvider
