#pragma once

#include <cmpift.h>

#include <exception>
#include <functional>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include "cimom/Cim.h"

namespace cimom::broker {

/// What a provider delivered during one call. A null path or instance is an
/// absent entry.
struct Delivery {
    std::vector<std::optional<ObjectPath>> paths;
    std::vector<std::optional<Instance>> instances;
    unsigned returnDoneCalls = 0;
    std::string errorMessage;  ///< of the first CMPIError; empty: none
};

/// Who gets what a provider delivers, one by one, in place of a Delivery that
/// would hold it all. Of the two functions one is set, by the kind of the call.
struct Consumer {
    std::function<void(std::optional<ObjectPath>)> path;
    std::function<void(std::optional<Instance>)> instance;
};

/// The CMPIResult of one call: it copies what the provider hands over. A
/// provider's own threads may use it at the same time.
class ResultCollector {
  public:
    enum class Kind { paths, instances };

    /// With a consumer, which is borrowed, paths and instances go there, one at a
    /// time. Once it has thrown, whatever comes is refused.
    explicit ResultCollector(Kind kind, const Consumer* consumer = nullptr) noexcept;
    ResultCollector(const ResultCollector&) = delete;
    ResultCollector& operator=(const ResultCollector&) = delete;

    [[nodiscard]] const CMPIResult* record() const noexcept { return &record_; }
    /// What was delivered; the collector is empty afterwards.
    [[nodiscard]] Delivery take();
    /// What the consumer threw; null: nothing.
    [[nodiscard]] std::exception_ptr failure() const;

    CMPIrc add(const CMPIInstance* instance);
    CMPIrc add(const CMPIObjectPath* path);
    CMPIrc add(const CMPIError* error);
    void done();

  private:
    template <typename Object>
    CMPIrc pass(std::optional<Object> object,
                std::function<void(std::optional<Object>)> Consumer::*receive,
                std::vector<std::optional<Object>>& kept);

    const Kind kind_;
    const Consumer* const consumer_;
    CMPIResult record_;
    mutable std::mutex mutex_;
    Delivery delivery_;
    std::exception_ptr failure_;
};

extern const CMPIResultFT resultTable;

}  // namespace cimom::broker
