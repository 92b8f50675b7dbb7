#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "cimom/ObjectManager.h"
#include "cimxml/Call.h"
#include "operations/Answer.h"
#include "wbem/EnumerationSessions.h"
#include "wbem/Limits.h"

namespace cimom::wbem {

/// Who asks. Where users are not set up there is no identity, and none is made up.
struct Caller {
    std::optional<std::string> user;
    std::string address;
    bool mayModify = false;
    /// Whether nobody waits for the answer any more; empty: somebody does.
    std::function<bool()> gone = nullptr;
};

/// An attempt to change an instance, for the log.
struct Modification {
    struct Change {
        std::string property;
        std::optional<Value> oldValue;  ///< none: the instance could not be read before
        Value newValue;
    };

    Caller caller;
    ObjectPath object;
    std::vector<Change> changes;
    unsigned status = 0;  ///< CIM status code; 0: done
    std::string description;
};

/// The operations of DSP0200 on an object manager. Safe for concurrent use.
class Operations {
  public:
    /// Gets every attempt to modify, also one that was refused. Must not throw.
    using ModificationLog = std::function<void(const Modification&)>;

    /// Borrows the manager.
    Operations(ObjectManager& manager, const Limits& limits, ModificationLog log);

    /// Carries a call out. A CIM error is an answer, too. Throws NotValid when a
    /// parameter's elements are not those of DSP0203.
    [[nodiscard]] Answer perform(const Call& call, const Caller& caller);

    [[nodiscard]] EnumerationSessions& sessions() noexcept { return sessions_; }

  private:
    ObjectManager& manager_;
    EnumerationSessions sessions_;
    const std::size_t largestResult_;
    ModificationLog log_;
};

}  // namespace cimom::wbem
