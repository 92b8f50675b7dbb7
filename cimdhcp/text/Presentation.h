#pragma once

#include <cstddef>
#include <optional>
#include <string>

#include "arguments/CommandLine.h"
#include "text/Style.h"

namespace cimdhcp {

/// How answers are shown.
struct Presentation {
    Format format = Format::table;
    std::optional<std::size_t> width;  ///< columns to write in; none: as many as there are
    Style style;
    std::optional<std::string> sort;  ///< by this column or property
    bool comments = false;            ///< what is printed knows comments that begin with "//"
    bool count = false;               ///< how many there are, and nothing else

    [[nodiscard]] bool json() const noexcept { return format == Format::json; }

    bool operator==(const Presentation&) const = default;
};

}  // namespace cimdhcp
