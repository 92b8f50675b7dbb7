#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

#include "text/Style.h"

namespace cimdhcp {

enum class Format : std::uint8_t { table, mof, json };

/// How results are shown.
struct Presentation {
    Format format = Format::table;
    std::optional<std::size_t> width;  ///< columns to write in; none: as many as there are
    Style style;
    std::optional<std::string> sort;  ///< by this column or property
    bool comments = false;            ///< the output is in a language with "//" comments
    bool count = false;               ///< the number of results alone
    std::int64_t now = 0;             ///< what moments are told from; seconds since the epoch

    [[nodiscard]] bool json() const noexcept { return format == Format::json; }

    bool operator==(const Presentation&) const = default;
};

}  // namespace cimdhcp
