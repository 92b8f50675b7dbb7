#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

#include "client/ClassList.h"
#include "text/Columns.h"
#include "text/Style.h"

namespace cimdhcp {

[[nodiscard]] const std::vector<Column<ClassEntry>>& classColumns();

[[nodiscard]] std::string classTable(const std::vector<ClassEntry>& classes,
                                     std::optional<std::size_t> width, const Style& style = {});

/// {"classes": [{"class", "superclass", "kind", "provider", "namespaces"}]}
[[nodiscard]] std::string classJson(const std::vector<ClassEntry>& classes);

}  // namespace cimdhcp
