#pragma once

#include <cmpift.h>

#include <string>
#include <utility>

#include "include/TracePoint.h"
#include "providerutilities/Classes.h"
#include "providerutilities/ProviderUtilities.h"

namespace ZR::DHCPClientProvider {

/// The message of several refusals, also of classes that are not computer systems.
inline constexpr const char* noComputerSystem = "Could not obtain an instance of Computer System";
inline constexpr const char* noIPProtocolEndpoint =
    "Could not obtain an instance of IP Protocol Endpoint";

/// All instances of the path's class; null, which is an empty enumeration, when
/// the object manager knows none. Throws ProviderException with the message when
/// it refuses, or when there is no path.
CMPIEnumeration* enumerateReferenced(const CMPIBroker* mb, const CMPIContext* context,
                                     const CMPIObjectPath* path, const char* message);

/// The one instance that the path names. Throws ProviderException as above.
CMPIInstance* getReferenced(const CMPIBroker* mb, const CMPIContext* context,
                            const CMPIObjectPath* path);

/// Whether another element follows; false without an enumeration.
bool hasNext(const CMPIEnumeration* enumeration);

/// Takes the next element. False, with the instance left as it was, when the
/// object manager reports a failure or there is no enumeration.
bool takeNext(const CMPIEnumeration* enumeration, CMPIInstance*& instance);

/// The instance's own path; null without an instance, or when it has none to tell.
CMPIObjectPath* pathOf(const CMPIInstance* instance);

/// Fetches instances of one class from the object manager, which other providers
/// serve, as ends of associations. What the object manager returns belongs to it
/// and is never released here.
///
/// Placed, the adapter stands on the first instance. It is walked so: the first
/// element, then further ones only as long as another follows the present one;
/// operator bool is asked exactly once per step. Of two instances the second is
/// thus never delivered; with one, the usual case, the walk is right.
///
/// A row has, as static members:
///   Classes::Class servedClass
///   RowSource trace
///   const char* refusal      what is thrown when the object manager refuses to enumerate
///   bool asksBeforeFirst     whether the first element is taken only when one is told of
///   bool asksBeforeNext      the same for each further one
///   bool fetchesSingly       whether the adapter can stand on one named instance
template <typename Row>
class ReferencedAdapter {
  public:
    static constexpr const Classes::Class& servedClass = Row::servedClass;

    ReferencedAdapter(const CMPIBroker* mb, const CMPIContext* context, std::string nameSpace)
        : _broker(mb), _context(context), _namespace(std::move(nameSpace)) {
        traceMethod(Row::trace.constructor());
    }
    ~ReferencedAdapter() { traceMethod(Row::trace.destructor()); }
    ReferencedAdapter(const ReferencedAdapter&) = delete;
    ReferencedAdapter& operator=(const ReferencedAdapter&) = delete;

    /// Stands on exactly the instance that the path names. Throws ProviderException
    /// when the object manager has none.
    void setSingleObjectPath(const CMPIObjectPath* objectPath) requires(Row::fetchesSingly) {
        const ParameterScope scope(Row::trace.at(__func__), " objectPath=", objectPath);
        instance_ = getReferenced(_broker, _context, objectPath);
        first_ = true;
    }

    /// Stands on the first of all instances of the path's class, whatever its keys.
    /// Throws ProviderException when the object manager refuses.
    void setObjectPath(const CMPIObjectPath* objectPath) {
        const ParameterScope scope(Row::trace.at(__func__), " objectPath=", objectPath);
        enumeration_ = enumerateReferenced(_broker, _context, objectPath, Row::refusal);
        if (take<Row::asksBeforeFirst>()) {
            first_ = true;
        }
    }

    explicit operator bool() {
        traceMethod(Row::trace.at(__func__));
        return std::exchange(first_, false) || hasNext(enumeration_);
    }

    void operator++() {
        traceMethod(Row::trace.at(__func__));
        instance_ = nullptr;
        take<Row::asksBeforeNext>();
    }

    /// The path that the present instance tells of itself; null without one.
    [[nodiscard]] CMPIObjectPath* getObjectPath() const {
        const TraceScope scope(Row::trace.at(__func__));
        return pathOf(instance_);
    }

    CMPIInstance* getCMPIInstance(const char** properties) const {
        const ParameterScope scope(Row::trace.at(__func__), " properties=", properties);
        return instance_;
    }

  private:
    template <bool asksBefore>
    bool take() {
        return (!asksBefore || hasNext(enumeration_)) && takeNext(enumeration_, instance_);
    }

    const CMPIBroker* _broker;
    const CMPIContext* _context;
    std::string _namespace;
    CMPIInstance* instance_ = nullptr;
    CMPIEnumeration* enumeration_ = nullptr;
    bool first_ = false;
};

}  // namespace ZR::DHCPClientProvider
