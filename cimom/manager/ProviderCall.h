#pragma once

#include <cmpift.h>

#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "broker/Arena.h"
#include "broker/Conversion.h"
#include "broker/RequestScope.h"
#include "broker/objects/BrokerRecords.h"
#include "broker/objects/BrokerResult.h"
#include "cimom/Forward.h"
#include "cimom/ObjectPath.h"
#include "cimom/Requests.h"
#include "manager/GuardedCall.h"

namespace cimom {

/// A property list as CMPI passes it: ended by a null pointer; null for none.
class PropertyNames {
  public:
    explicit PropertyNames(const std::optional<std::vector<std::string>>& names);
    [[nodiscard]] const char** pointer() noexcept {
        return pointers_.empty() ? nullptr : pointers_.data();
    }

  private:
    std::vector<const char*> pointers_;
};

/// What is the same for all calls of one request.
struct CallSettings {
    const ClassRepository* classes;
    std::string principal;
    CMPIFlags flags = 0;
};

/// What came of one call, beside the objects that went to the receiver. After an error
/// none of those count.
struct CallOutcome {
    Status status;
    unsigned returnDoneCalls = 0;
};

/// Whether the status tells that the provider has nothing of what it was asked for, and not
/// that it failed.
[[nodiscard]] bool hasNothing(const Status& status) noexcept;

[[nodiscard]] CallOutcome missingSlot(const std::string& provider, const char* slot);

/// The end of a request about instances that became these calls, and what was counted.
/// `exact`: the client named the class that was asked, whose status is that of the whole.
[[nodiscard]] RequestEnd endOf(const std::vector<CallOutcome>& calls, bool exact);

/// The end of a request about associations. What one provider responds does not depend on
/// another, so the whole fails only when every call does, with the first error. A provider
/// that does not know the class which it was asked for has nothing to add: no error, unless
/// the client named that class. Where the whole result is `empty`, a provider that does not
/// find the source is believed: others may not know what they were asked about.
[[nodiscard]] RequestEnd endOfAssociations(const std::vector<CallOutcome>& calls, bool exact,
                                           bool empty);

// The receiver as the calls of a provider need it.
void beginCall(const broker::AnyReceiver& receiver);
/// The end of a call: after an error nothing counts but its message. Throws what the
/// receiver has thrown.
[[nodiscard]] CallOutcome finished(Status status, const broker::BrokerResult& result,
                                   const broker::AnyReceiver& receiver);

/// One call of a provider's slot, with everything that it needs: memory, context,
/// result and object path. `invoke` gets those as (context, result, path)
/// and gives a CMPIStatus. Too deep a nesting of requests is an
/// error status. Throws broker::ConversionError for a path that cannot be handed
/// over, and what the receiver throws.
template <typename Invoke>
CallOutcome callProvider(const CallSettings& settings, const broker::AnyReceiver& receiver,
                         const std::string& who, const ObjectPath& path, Invoke&& invoke) {
    if (Status tooDeep = checkDepth(); !tooDeep.ok()) {
        return {std::move(tooDeep)};
    }
    broker::RequestScope scope;
    beginCall(receiver);
    const broker::BrokerResult result(receiver);
    broker::Arena& arena = scope.arena();
    const CMPIContext* const context =
        broker::makeContext(arena, path.nameSpace, settings.principal, settings.flags,
                            broker::RequestScope::depthOfThread());
    const CMPIObjectPath* const record = broker::toRecord(arena, settings.classes, path);
    Status status = guardedCall(
        who, [&] { return std::forward<Invoke>(invoke)(context, result.record(), record); });
    return finished(std::move(status), result, receiver);
}

}  // namespace cimom
