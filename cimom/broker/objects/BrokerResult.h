#pragma once

#include <cmpift.h>

#include <exception>
#include <mutex>
#include <optional>
#include <string>
#include <variant>

#include "cimom/Forward.h"
#include "cimom/ResultReceiver.h"

namespace cimom::broker {

/// The receiver of a request, for paths or for instances; never null.
using AnyReceiver = std::variant<ResultReceiver<ObjectPath>*, ResultReceiver<Instance>*>;

[[nodiscard]] inline bool wantsPaths(const AnyReceiver& receiver) noexcept {
    return std::holds_alternative<ResultReceiver<ObjectPath>*>(receiver);
}

/// The CMPIResult of one call: what the provider hands over goes to the receiver as a
/// copy. A provider's own threads may use it at the same time.
class BrokerResult {
  public:
    /// Borrows the receiver, whose call has begun. Once that has thrown, whatever
    /// comes is refused.
    explicit BrokerResult(const AnyReceiver& receiver) noexcept;
    BrokerResult(const BrokerResult&) = delete;
    BrokerResult& operator=(const BrokerResult&) = delete;

    [[nodiscard]] const CMPIResult* record() const noexcept { return &record_; }
    /// What the receiver threw; null: nothing.
    [[nodiscard]] std::exception_ptr failure() const;
    [[nodiscard]] unsigned returnDoneCalls() const;
    /// Of the first CMPIError; empty: none.
    [[nodiscard]] std::string errorMessage() const;

    // What the table's functions do; null is an absent entry.
    CMPIrc add(const CMPIInstance* instance);
    CMPIrc add(const CMPIObjectPath* path);
    CMPIrc add(const CMPIError* error);
    void done();

  private:
    template <typename Object>
    CMPIrc pass(ResultReceiver<Object>& receiver, std::optional<Object> object);

    const AnyReceiver receiver_;
    CMPIResult record_;
    mutable std::mutex mutex_;
    unsigned returnDoneCalls_ = 0;
    std::string errorMessage_;
    std::exception_ptr failure_;
};

extern const CMPIResultFT resultTable;

}  // namespace cimom::broker
