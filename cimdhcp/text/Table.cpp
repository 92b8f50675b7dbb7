#include "text/Table.h"

#include <algorithm>
#include <numeric>
#include <span>
#include <stdexcept>
#include <string_view>
#include <utility>

#include "text/DisplayText.h"

namespace cimdhcp {

namespace {

constexpr std::size_t gap = 2;
/// Narrower than this, folded cells read worse than a table with a column less.
constexpr std::size_t narrowestColumn = 12;

using TableRows = std::span<const std::vector<std::string>>;

/// The longest part of a text that is not broken.
std::size_t longestWord(std::string_view text) {
    std::size_t longest = 0;
    while (!text.empty()) {
        const std::size_t end = std::min(text.find(' '), text.size());
        longest = std::max(longest, displayWidth(text.substr(0, end)));
        text.remove_prefix(std::min(end + 1, text.size()));
    }
    return longest;
}

/// A column that is shown: which one it is, how wide it is, and how narrow it could be.
struct Shown {
    std::size_t column = 0;
    std::size_t width = 0;
    std::size_t narrowest = 0;
};

std::size_t lineWidth(const std::vector<Shown>& columns) {
    return std::accumulate(columns.begin(), columns.end(),
                           columns.empty() ? 0 : gap * (columns.size() - 1),
                           [](std::size_t sum, const Shown& each) { return sum + each.width; });
}

/// Takes the room that lacks from the widest columns that can be folded. False: they cannot
/// give enough.
bool fold(std::vector<Shown>& columns, std::size_t available) {
    while (lineWidth(columns) > available) {
        const auto widest =
            std::max_element(columns.begin(), columns.end(), [](const Shown& a, const Shown& b) {
                const auto room = [](const Shown& each) {
                    return each.width > each.narrowest ? each.width : 0;
                };
                return room(a) < room(b);
            });
        if (widest == columns.end() || widest->width <= widest->narrowest) {
            return false;
        }
        --widest->width;
    }
    return true;
}

/// All columns, each as wide as its widest cell.
std::vector<Shown> columnsOf(TableRows rows, const std::vector<ColumnRoom>& room) {
    std::vector<Shown> columns(room.size());
    for (std::size_t column = 0; column < columns.size(); ++column) {
        Shown& each = columns[column];
        each.column = column;
        for (const auto& row : rows) {
            each.width = std::max(each.width, displayWidth(row[column]));
            each.narrowest = std::max(each.narrowest, longestWord(row[column]));
        }
        each.narrowest = room[column].whole
                             ? each.width
                             : std::max(each.narrowest, std::min(each.width, narrowestColumn));
    }
    return columns;
}

/// Takes from folded columns what their lines do not need, and unfolds columns that it suffices
/// for.
void settle(std::vector<Shown>& folded, const std::vector<Shown>& all, TableRows rows,
            std::size_t available) {
    for (Shown& each : folded) {
        std::size_t needed = 0;
        for (const auto& row : rows) {
            for (const std::string& line : wrapToWidth(row[each.column], each.width)) {
                needed = std::max(needed, displayWidth(line));
            }
        }
        each.width = std::min(each.width, needed);
    }
    for (Shown& each : folded) {
        const std::size_t whole = all[each.column].width;
        if (lineWidth(folded) + whole - each.width <= available) {
            each.width = whole;
        }
    }
}

/// The columns that are shown within the width, narrowed where they are folded. Those that are
/// left out are appended to `leftOut`.
std::vector<Shown> fitting(const std::vector<Shown>& all, TableRows rows,
                           const std::vector<ColumnRoom>& room, std::size_t available,
                           std::vector<std::size_t>& leftOut) {
    std::vector<Shown> kept = all;
    for (;;) {
        std::vector<Shown> folded = kept;
        if (fold(folded, available)) {
            settle(folded, all, rows, available);
            return folded;
        }
        const auto last =
            std::max_element(kept.begin(), kept.end(), [&room](const Shown& a, const Shown& b) {
                return room[a.column].leaveOut < room[b.column].leaveOut;
            });
        if (last == kept.end() || room[last->column].leaveOut == 0) {
            return folded;
        }
        leftOut.push_back(last->column);
        kept.erase(last);
    }
}

/// The lines of one row.
std::vector<std::string> linesOf(const std::vector<std::string>& row,
                                 const std::vector<Shown>& columns) {
    std::vector<std::vector<std::string>> cells;
    std::size_t height = 1;
    for (const Shown& each : columns) {
        const std::string& cell = row[each.column];
        cells.push_back(displayWidth(cell) <= each.width ? std::vector{cell}
                                                         : wrapToWidth(cell, each.width));
        height = std::max(height, cells.back().size());
    }
    std::vector<std::string> lines(height);
    for (std::size_t line = 0; line < height; ++line) {
        for (std::size_t place = 0; place < columns.size(); ++place) {
            const std::string cell = line < cells[place].size() ? cells[place][line] : "";
            const std::size_t width = displayWidth(cell);
            lines[line] += cell;
            lines[line].append(std::max(columns[place].width, width) - width + gap, ' ');
        }
        lines[line].erase(lines[line].find_last_not_of(' ') + 1);
    }
    return lines;
}

}  // namespace

Table::Table(std::vector<std::string> headings, std::vector<ColumnRoom> room)
    : room_(std::move(room)) {
    if (headings.empty()) {
        throw std::invalid_argument("a table without columns");
    }
    room_.resize(headings.size());
    rows_.push_back(std::move(headings));
}

void Table::add(const std::vector<std::string>& cells) {
    if (cells.size() != rows_.front().size()) {
        throw std::invalid_argument("a row needs a cell for each heading");
    }
    std::vector<std::string> row(cells.size());
    std::transform(cells.begin(), cells.end(), row.begin(),
                   [](const std::string& cell) { return printable(cell); });
    rows_.push_back(std::move(row));
}

std::string Table::text(std::optional<std::size_t> width, const Style& style) const {
    const TableRows shown = std::span(rows_).subspan(style.header ? 0 : 1);
    std::vector<std::size_t> leftOut;
    std::vector<Shown> columns = columnsOf(shown, room_);
    if (width) {
        columns = fitting(columns, shown, room_, *width, leftOut);
    }
    std::string result;
    for (const auto& row : shown) {
        const bool heading = &row == rows_.data();
        for (const std::string& line : linesOf(row, columns)) {
            result += (heading ? style.strong(line) : line) + '\n';
        }
    }
    if (style.header && !leftOut.empty()) {
        std::string names;
        for (const std::size_t column : leftOut) {
            names += (names.empty() ? "" : ", ") + rows_.front()[column];
        }
        result += "(without " + names + ": --wide shows all)\n";
    }
    return result;
}

}  // namespace cimdhcp
