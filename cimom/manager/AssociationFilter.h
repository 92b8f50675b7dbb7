#pragma once

#include <optional>
#include <string>
#include <vector>

#include "cimom/Forward.h"

namespace cimom {

/// The filters of DSP0200 that a provider may have left out. Absent filters
/// restrict nothing.

/// Whether the class is the wanted one or derives from it.
[[nodiscard]] bool isOfClass(const std::string& className, const std::optional<std::string>& wanted,
                             const ClassRepository& repository);

/// Whether the association's reference of that role names the object; of an
/// association path, the keys are its references.
[[nodiscard]] bool playsRole(const Instance& association, const ObjectPath& object,
                             const std::optional<std::string>& role,
                             const ClassRepository& repository);

/// Whether one of the associations connects the two objects, the source playing
/// `role`, the other `resultRole`, by two different references.
[[nodiscard]] bool connects(const std::vector<Instance>& associations, const ObjectPath& source,
                            const ObjectPath& other, const std::optional<std::string>& role,
                            const std::optional<std::string>& resultRole,
                            const ClassRepository& repository);

}  // namespace cimom
