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

/// Whether the object is an end of the association, that of the role if one is given; of
/// an association path, the keys are its references.
[[nodiscard]] bool playsRole(const Instance& association, const ObjectPath& object,
                             const std::optional<std::string>& role,
                             const ClassRepository& repository);

/// The objects that the association connects the source to, the source playing `role`, the
/// others `resultRole`.
[[nodiscard]] std::vector<ObjectPath> otherEnds(const Instance& association,
                                                const ObjectPath& source,
                                                const std::optional<std::string>& role,
                                                const std::optional<std::string>& resultRole,
                                                const ClassRepository& repository);

/// Whether one of the associations connects the two objects, the source playing
/// `role`, the other `resultRole`, by two different references.
[[nodiscard]] bool connects(const std::vector<Instance>& associations, const ObjectPath& source,
                            const ObjectPath& other, const std::optional<std::string>& role,
                            const std::optional<std::string>& resultRole,
                            const ClassRepository& repository);

/// Whether associations of the class can have the source, in that role, at one end, and the
/// other object, in the result role, at another. The class of an object may also be given as
/// a parent of its own. Of a class that is none of associations, nothing can be told: true.
[[nodiscard]] bool canConnect(const ClassDeclaration& association,
                              const std::optional<std::string>& sourceClass,
                              const std::optional<std::string>& otherClass,
                              const std::optional<std::string>& role,
                              const std::optional<std::string>& resultRole,
                              const ClassRepository& repository);

}  // namespace cimom
