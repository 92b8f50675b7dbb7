#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

#include "text/Style.h"

namespace cimdhcp {

/// What becomes of a column where there is no room for all of them.
struct ColumnRoom {
    bool whole = false;     ///< its cells are names, which are never broken
    unsigned leaveOut = 0;  ///< the highest goes first; 0: it always stays

    bool operator==(const ColumnRoom&) const = default;
};

/// Rows of cells below headings, in aligned columns with two blanks between them.
class Table {
  public:
    /// `room` has an entry for each heading, or is empty: no column is left out, and all may
    /// be folded.
    explicit Table(std::vector<std::string> headings, std::vector<ColumnRoom> room = {});

    /// Adds a row of as many cells as there are headings. Cells are made printable.
    void add(const std::vector<std::string>& cells);

    /// The lines of the table, without blanks at their ends. With a width, cells that have
    /// blanks go on in further lines until the table fits into it, and where that does not
    /// suffice columns are left out, which a last line tells of. Nothing is ever cut: what
    /// still does not fit is longer than the width.
    [[nodiscard]] std::string text(std::optional<std::size_t> width, const Style& style = {}) const;

  private:
    std::vector<std::vector<std::string>> rows_;  ///< the first are the headings
    std::vector<ColumnRoom> room_;
};

}  // namespace cimdhcp
