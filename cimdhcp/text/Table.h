#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

#include "text/Style.h"

namespace cimdhcp {

/// Rows of cells below headings, in aligned columns with two blanks between them.
class Table {
  public:
    explicit Table(std::vector<std::string> headings);

    /// Adds a row of as many cells as there are headings. Cells are made printable.
    void add(const std::vector<std::string>& cells);

    /// The lines of the table, without blanks at their ends. With a width, the
    /// widest columns are cut until the lines fit into it, though never below four
    /// columns each.
    [[nodiscard]] std::string text(std::optional<std::size_t> width, const Style& style = {}) const;

  private:
    std::vector<std::vector<std::string>> rows_;  ///< the first are the headings
};

}  // namespace cimdhcp
