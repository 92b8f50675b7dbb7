#pragma once

#include <cstddef>
#include <stdexcept>
#include <string>

namespace cimom {

/// A place in a MOF file. Both count from 1; columns in bytes.
struct MofPosition {
    std::size_t line = 1;
    std::size_t column = 1;

    bool operator==(const MofPosition&) const = default;
};

/// A MOF file that cannot be used. what() is "FILE:LINE:COLUMN: REASON".
class MofError : public std::runtime_error {
  public:
    MofError(std::string file, MofPosition position, const std::string& reason);

    const std::string file;
    const std::size_t line;
    const std::size_t column;
};

}  // namespace cimom
