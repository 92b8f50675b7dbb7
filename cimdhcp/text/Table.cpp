#include "text/Table.h"

#include <algorithm>
#include <numeric>
#include <span>
#include <stdexcept>

#include "text/DisplayText.h"

namespace cimdhcp {

namespace {

constexpr std::size_t gap = 2;
constexpr std::size_t narrowest = 4;

std::size_t lineWidth(const std::vector<std::size_t>& widths) {
    return std::accumulate(widths.begin(), widths.end(), std::size_t{0}) +
           gap * (widths.size() - 1);
}

/// Takes columns off the widest until the line fits or nothing more can go.
void shrink(std::vector<std::size_t>& widths, std::size_t available) {
    while (lineWidth(widths) > available) {
        const auto widest = std::max_element(widths.begin(), widths.end());
        if (*widest <= narrowest) {
            return;
        }
        --*widest;
    }
}

}  // namespace

Table::Table(std::vector<std::string> headings) {
    if (headings.empty()) {
        throw std::invalid_argument("a table without columns");
    }
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
    std::vector<std::size_t> widths(rows_.front().size());
    const std::span<const std::vector<std::string>> shown =
        std::span(rows_).subspan(style.header ? 0 : 1);
    for (const auto& row : shown) {
        for (std::size_t column = 0; column < row.size(); ++column) {
            widths[column] = std::max(widths[column], displayWidth(row[column]));
        }
    }
    if (width) {
        shrink(widths, *width);
    }
    std::string result;
    for (const auto& row : shown) {
        std::string line;
        for (std::size_t column = 0; column < row.size(); ++column) {
            const std::string cell =
                cutToWidth(row[column], std::max<std::size_t>(widths[column], 1));
            line += cell;
            line.append(widths[column] + gap - std::min(displayWidth(cell), widths[column]), ' ');
        }
        line.erase(line.find_last_not_of(' ') + 1);
        const bool heading = &row == rows_.data();
        result += (heading ? style.strong(line) : line) + '\n';
    }
    return result;
}

}  // namespace cimdhcp
