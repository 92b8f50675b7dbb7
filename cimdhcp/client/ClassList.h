#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

#include "cimom/ClassRepository.h"
#include "cimom/ObjectManager.h"
#include "text/Columns.h"
#include "text/Style.h"

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

[[nodiscard]] const std::vector<Column<ClassEntry>>& classColumns();

[[nodiscard]] std::string classTable(const std::vector<ClassEntry>& classes,
                                     std::optional<std::size_t> width, const Style& style = {});

/// {"classes": [{"class", "superclass", "kind", "provider", "namespaces"}]}
[[nodiscard]] std::string classJson(const std::vector<ClassEntry>& classes);

}  // namespace cimdhcp
