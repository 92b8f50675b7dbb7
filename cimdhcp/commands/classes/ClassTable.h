#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

#include "cimom/ClassDeclaration.h"
#include "client/ClassList.h"
#include "text/Columns.h"
#include "text/Style.h"

namespace cimdhcp {

[[nodiscard]] const std::vector<Column<ClassEntry>>& classColumns();

[[nodiscard]] std::string classTable(const std::vector<ClassEntry>& classes,
                                     std::optional<std::size_t> width, const Style& style = {});

/// What a class is for and what its properties mean, by the qualifiers of the schema. With a
/// width, texts go on in further lines.
[[nodiscard]] std::string describeText(const cimom::ClassDeclaration& declaration,
                                       std::optional<std::size_t> width, const Style& style = {});

/// The same, a property in each row. Borrows the declaration.
[[nodiscard]] std::vector<Column<cimom::PropertyDeclaration>> propertyColumns(
    const cimom::ClassDeclaration& declaration);

/// {"class", "superclass", "association", "description", "properties": [{"name", "type",
/// "array", "key", "writable", "description", "values": [{"value", "meaning"}]}]}. A value that
/// stands for a range is its text "9..32767".
[[nodiscard]] std::string describeJson(const cimom::ClassDeclaration& declaration,
                                       const std::vector<cimom::PropertyDeclaration>& properties);

/// {"classes": [{"class", "superclass", "kind", "provider", "namespaces"}]}
[[nodiscard]] std::string classJson(const std::vector<ClassEntry>& classes);

}  // namespace cimdhcp
