#pragma once

#include <cstddef>
#include <iosfwd>
#include <optional>

namespace cimdhcp {

/// What a run of the program writes to.
struct Outputs {
    std::ostream& out;
    std::ostream& err;
    std::optional<std::size_t> width;  ///< of the terminal that `out` is; none: it is not one
    /// The same for `err`.
    std::optional<std::size_t> errWidth = std::nullopt;
};

}  // namespace cimdhcp
