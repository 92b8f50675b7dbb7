#pragma once

#include <cstddef>
#include <cstdint>
#include <iosfwd>
#include <optional>
#include <string>
#include <vector>

#include "text/Style.h"

namespace cimdhcp {

enum class Format : std::uint8_t { table, tsv, mof, json };

/// How results are shown.
struct Presentation {
    Format format = Format::table;
    std::optional<std::size_t> width;  ///< columns to write in; none: as many as there are
    Style style;
    std::optional<std::string> sort;   ///< by this column or property
    std::vector<std::string> columns;  ///< of a table, in this order; none: all
    bool internals = false;            ///< JSON has what helps to debug a provider
    bool comments = false;             ///< the output is in a language with "//" comments
    bool count = false;                ///< the number of results alone
    bool exact = false;                ///< the results of the exact provider, as they are
    std::int64_t now = 0;              ///< what moments are told from; seconds since the epoch

    [[nodiscard]] bool tsv() const noexcept { return format == Format::tsv; }
    [[nodiscard]] bool json() const noexcept { return format == Format::json; }

    bool operator==(const Presentation&) const = default;
};

/// Where they are shown.
struct Outputs {
    std::ostream& out;
    std::ostream& err;
    std::optional<std::size_t> width;  ///< of the terminal that `out` is; none: it is not one
    /// The same for `err`.
    std::optional<std::size_t> errWidth = std::nullopt;
};

}  // namespace cimdhcp
