#pragma once

#include <cmpift.h>

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

/// The CMPIResult of one call: it copies what the provider hands over. A
/// provider's own threads may use it at the same time.
class ResultCollector {
  public:
    enum class Kind { paths, instances };

    explicit ResultCollector(Kind kind) noexcept;
    ResultCollector(const ResultCollector&) = delete;
    ResultCollector& operator=(const ResultCollector&) = delete;

    [[nodiscard]] const CMPIResult* record() const noexcept { return &record_; }
    /// What was delivered; the collector is empty afterwards.
    [[nodiscard]] Delivery take();

    CMPIrc add(const CMPIInstance* instance);
    CMPIrc add(const CMPIObjectPath* path);
    CMPIrc add(const CMPIError* error);
    void done();

  private:
    const Kind kind_;
    CMPIResult record_;
    std::mutex mutex_;
    Delivery delivery_;
};

extern const CMPIResultFT resultTable;

}  // namespace cimom::broker
