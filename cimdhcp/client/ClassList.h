#pragma once

#include <string>
#include <vector>

#include "cimom/Forward.h"
#include "cimom/Registrations.h"

namespace cimdhcp {

/// One served class.
struct ClassEntry {
    std::string name;
    std::string superclass;  ///< empty: none
    bool association = false;
    std::string provider;  ///< empty: not known
    std::vector<std::string> nameSpaces;

    bool operator==(const ClassEntry&) const = default;
};

/// The served classes in the order of their registrations. A class that two
/// providers serve appears twice.
[[nodiscard]] std::vector<ClassEntry> servedClasses(
    const std::vector<cimom::Registration>& registrations,
    const cimom::ClassRepository& repository);

}  // namespace cimdhcp
