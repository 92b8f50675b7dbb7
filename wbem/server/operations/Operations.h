#pragma once

#include <cstddef>
#include <string_view>

#include "cimom/Forward.h"
#include "cimxml/Call.h"
#include "operations/Caller.h"
#include "operations/EnumerationSessions.h"
#include "operations/Modification.h"
#include "operations/ResponseBody.h"
#include "wbem/Limits.h"

namespace cimom::wbem {

/// The operations of DSP0200 on an object manager. Safe for concurrent use.
class Operations {
  public:
    /// Borrows the manager.
    Operations(ObjectManager& manager, const Limits& limits, ModificationLog log);

    /// Carries a call out. A CIM error becomes a response, too. Throws NotValid when a
    /// parameter's elements are not those of DSP0203.
    [[nodiscard]] ResponseBody perform(const Call& call, const Caller& caller);

    /// The operation's name as the standard writes it; "other" for one that is not offered.
    [[nodiscard]] static std::string_view nameOf(const Call& call);

    [[nodiscard]] EnumerationSessions& sessions() noexcept { return sessions_; }

  private:
    ObjectManager& manager_;
    EnumerationSessions sessions_;
    const std::size_t largestResult_;
    ModificationLog log_;
};

}  // namespace cimom::wbem
