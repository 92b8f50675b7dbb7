#pragma once

#include <cmpift.h>

#include <string>

/// What the three referenced-class adapters share: asking the object manager for
/// instances that other providers serve. What it answers belongs to it and is
/// never released here.
namespace ZR::DHCPClientProvider {

/// All instances of the path's class; null, which is an empty enumeration, when
/// the object manager knows none. Throws ProviderException with the message when
/// it refuses, or when there is no path.
CMPIEnumeration* enumerateReferenced(const CMPIBroker* broker, const CMPIContext* context,
                                     const CMPIObjectPath* path, const char* message);

/// The one instance that the path names. Throws ProviderException as above.
CMPIInstance* getReferenced(const CMPIBroker* broker, const CMPIContext* context,
                            const CMPIObjectPath* path);

/// Whether another element follows; false without an enumeration.
bool hasNext(const CMPIEnumeration* enumeration);

/// Takes the next element. False, with the instance left as it was, when the
/// object manager reports a failure or there is no enumeration.
bool takeNext(const CMPIEnumeration* enumeration, CMPIInstance*& instance);

/// The instance's own path; null without an instance, or when it has none to tell.
CMPIObjectPath* pathOf(const CMPIInstance* instance);

/// The message of several refusals, also of classes that are no computer system.
inline constexpr const char* noComputerSystem = "Could not obtain an instance of Computer System";
inline constexpr const char* noIPProtocolEndpoint =
    "Could not obtain an instance of IP Protocol Endpoint";

}  // namespace ZR::DHCPClientProvider
