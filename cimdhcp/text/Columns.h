#pragma once

#include <algorithm>
#include <cstddef>
#include <functional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "text/Table.h"

namespace cimdhcp {

/// Whether a text comes before another one for a person: numbers within them by
/// their value ("eth2" before "eth10"), else byte by byte.
[[nodiscard]] bool comesBefore(std::string_view a, std::string_view b) noexcept;

/// Which of the names of columns a person means: without regard to case, and with
/// hyphens or underscores in place of blanks. Throws Failure, which names the option, when it
/// is none of them.
[[nodiscard]] std::size_t columnNamed(const std::string& option, const std::string& wanted,
                                      const std::vector<std::string>& names);

/// The text as one value of a line whose values stand between tabs: a tab, a line feed, a
/// carriage return and a backslash become \t, \n, \r and \\, and other control characters
/// \xNN. Bytes that are not UTF-8 stay.
[[nodiscard]] std::string tsvValue(std::string_view text);
/// A line of such values.
[[nodiscard]] std::string tsvLine(const std::vector<std::string>& values);

/// The text, or "-" for an empty one: a cell that is never blank.
[[nodiscard]] std::string cellOf(const std::string& text);

/// One column of a table of records.
template <typename Row>
struct Column {
    std::string heading;
    std::function<std::string(const Row&)> cell;
    /// What rows are sorted by, in natural order; none: by the cell.
    std::function<std::string(const Row&)> order{};
    ColumnRoom room{};
    /// The value for programs, empty for what there is not; none: the cell, without "-".
    std::function<std::string(const Row&)> value{};
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
    std::vector<ColumnRoom> room;
    room.reserve(columns.size());
    for (const Column<Row>& column : columns) {
        room.push_back(column.room);
    }
    Table table(headingsOf(columns), std::move(room));
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

/// The records as lines of values with tabs between them, below a line with the headings.
template <typename Row>
std::string tsvOf(const std::vector<Column<Row>>& columns, const std::vector<Row>& rows,
                  bool header) {
    std::string text = header ? tsvLine(headingsOf(columns)) : std::string();
    for (const Row& row : rows) {
        std::vector<std::string> values;
        values.reserve(columns.size());
        for (const Column<Row>& column : columns) {
            const std::string cell = column.value ? column.value(row) : column.cell(row);
            values.push_back(!column.value && cell == cellOf("") ? std::string() : cell);
        }
        text += tsvLine(values);
    }
    return text;
}

/// The columns that a person named, in that order; each stays, however narrow the terminal.
/// Throws Failure when there is no such column.
template <typename Row>
std::vector<Column<Row>> chosenOf(const std::vector<Column<Row>>& columns,
                                  const std::vector<std::string>& wanted) {
    std::vector<Column<Row>> chosen;
    const std::vector<std::string> names = headingsOf(columns);
    for (const std::string& each : wanted) {
        chosen.push_back(columns[columnNamed("--columns", each, names)]);
        chosen.back().room.leaveOut = 0;
    }
    return chosen;
}

/// Sorts records by a column; rows between which it makes no difference keep their order.
/// Throws Failure when there is no such column.
template <typename Row>
void sortBy(const std::string& wanted, const std::vector<Column<Row>>& columns,
            std::vector<Row>& rows) {
    const Column<Row>& column = columns[columnNamed("--sort", wanted, headingsOf(columns))];
    const auto& key = column.order ? column.order : column.cell;
    std::stable_sort(rows.begin(), rows.end(),
                     [&key](const Row& a, const Row& b) { return comesBefore(key(a), key(b)); });
}

}  // namespace cimdhcp
