#pragma once

#include <chrono>
#include <functional>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "cimom/Instance.h"
#include "cimom/Status.h"

namespace cimom {

/// Which indications a subscriber wants.
struct IndicationFilter {
    std::string query;  ///< its FROM class is an indication class
    std::string queryLanguage = "WQL";
    /// Where what the indications tell of happens; at least one.
    std::vector<std::string> sourceNameSpaces = {};
    std::string owner = {};  ///< who subscribes, as providers are told; may be empty
};

/// What a provider told, as one subscriber gets it.
struct Indication {
    /// Of an indication class; its path has the source namespace and no keys. Instances that
    /// it embeds (SourceInstance, PreviousInstance) are Scalars that hold instances. It has
    /// the properties that the query selects.
    Instance instance;
    std::chrono::system_clock::time_point received;
};

/// Gets the indications of one subscription, one after the other, in threads of providers:
/// it copies what it needs and returns. It must neither wait, nor ask the object manager
/// anything, nor end its own subscription. What it throws is dropped and told in the log.
using IndicationReceiver = std::function<void(const Indication&)>;

/// An active filter; ends with the object. Afterwards its receiver is neither running nor
/// called any more. It may outlive the object manager, whose end ends all of them.
class IndicationSubscription {
  public:
    class Ended {
      public:
        Ended() = default;
        virtual ~Ended() = default;
        Ended(const Ended&) = delete;
        Ended& operator=(const Ended&) = delete;
    };

    IndicationSubscription() = default;
    explicit IndicationSubscription(std::unique_ptr<Ended> active) noexcept
        : active_(std::move(active)) {}

    /// False for one that never began, was moved from or was ended.
    [[nodiscard]] bool active() const noexcept { return active_ != nullptr; }
    void end() noexcept { active_.reset(); }

  private:
    std::unique_ptr<Ended> active_;
};

struct IndicationActivation {
    Status status;
    IndicationSubscription subscription;  ///< active when the status is OK
};

/// Where the indications of all providers arrive, and go to those who wait for them.
/// Safe for concurrent use.
class IndicationHub {
  public:
    IndicationHub() = default;
    virtual ~IndicationHub() = default;
    IndicationHub(const IndicationHub&) = delete;
    IndicationHub& operator=(const IndicationHub&) = delete;

    /// Activates the filter at every provider that is registered for its class, or one below,
    /// in a source namespace. OK when one of them accepts it; the first refusal otherwise.
    /// CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED, CMPI_RC_ERR_INVALID_QUERY for one that does
    /// not name an indication class, CMPI_RC_ERR_INVALID_NAMESPACE, CMPI_RC_ERR_INVALID_CLASS;
    /// CMPI_RC_ERR_NOT_SUPPORTED when no provider is registered. Indications may arrive before
    /// it returns. It calls providers, and takes as long as they do.
    [[nodiscard]] virtual IndicationActivation activate(const IndicationFilter& filter,
                                                        IndicationReceiver receiver) = 0;
};

}  // namespace cimom
