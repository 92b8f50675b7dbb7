#include "cimom/MofError.h"

#include <utility>

namespace cimom {

MofError::MofError(std::string fileName, MofPosition position, const std::string& reason)
    : std::runtime_error(fileName + ':' + std::to_string(position.line) + ':' +
                         std::to_string(position.column) + ": " + reason),
      file(std::move(fileName)),
      line(position.line),
      column(position.column) {}

}  // namespace cimom
