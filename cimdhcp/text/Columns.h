#pragma once

#include <algorithm>
#include <cstddef>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

#include "text/Table.h"

namespace cimdhcp {

/// Whether a text comes before another one for a person: numbers within them by
/// their value ("eth2" before "eth10"), else byte by byte.
[[nodiscard]] bool comesBefore(std::string_view a, std::string_view b) noexcept;

/// Which of the names of columns a person means: without regard to case, and with
/// hyphens or underscores in place of blanks. Throws Failure when it is none of them.
[[nodiscard]] std::size_t columnNamed(const std::string& wanted,
                                      const std::vector<std::string>& names);

/// The text, or "-" for an empty one: a cell that is never blank.
[[nodiscard]] std::string cellOf(const std::string& text);

/// One column of a table of records.
template <typename Row>
struct Column {
    std::string heading;
    std::function<std::string(const Row&)> cell;
    /// What rows are sorted by, in natural order; none: by the cell.
    std::function<std::string(const Row&)> order{};
};

template <typename Row>
std::vector<std::string> headingsOf(const std::vector<Column<Row>>& columns) {
    std::vector<std::string> headings;
    headings.reserve(columns.size());
    for (const Column<Row>& column : columns) {
        headings.push_back(column.heading);
    }
    return headings;
}

template <typename Row>
Table tableOf(const std::vector<Column<Row>>& columns, const std::vector<Row>& rows) {
    Table table(headingsOf(columns));
    for (const Row& row : rows) {
        std::vector<std::string> cells;
        cells.reserve(columns.size());
        for (const Column<Row>& column : columns) {
            cells.push_back(column.cell(row));
        }
        table.add(cells);
    }
    return table;
}

/// Sorts records by a column; rows between which it makes no difference keep their order.
/// Throws Failure when there is no such column.
template <typename Row>
void sortBy(const std::string& wanted, const std::vector<Column<Row>>& columns,
            std::vector<Row>& rows) {
    const Column<Row>& column = columns[columnNamed(wanted, headingsOf(columns))];
    const auto& key = column.order ? column.order : column.cell;
    std::stable_sort(rows.begin(), rows.end(),
                     [&key](const Row& a, const Row& b) { return comesBefore(key(a), key(b)); });
}

}  // namespace cimdhcp
