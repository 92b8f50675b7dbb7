#pragma once

#include <cstddef>
#include <iosfwd>
#include <optional>
#include <string>
#include <vector>

namespace cimdhcp {

/// What a run of the program writes to.
struct Outputs {
    std::ostream& out;
    std::ostream& err;
    std::optional<std::size_t> width;  ///< of the terminal that `out` is; none: it is not one
    /// The same for `err`.
    std::optional<std::size_t> errWidth = std::nullopt;
};

/// Runs the program with the arguments behind its name, and returns its exit status.
/// Throws nothing: whatever fails is one line on `err`. It sets environment
/// variables and reads the platform's settings, which are read once per process.
int run(const std::vector<std::string>& arguments, const Outputs& outputs) noexcept;

}  // namespace cimdhcp
