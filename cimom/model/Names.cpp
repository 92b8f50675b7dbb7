#include "cimom/Names.h"

#include <algorithm>

namespace cimom {

bool sameName(std::string_view a, std::string_view b) noexcept {
    return std::equal(a.begin(), a.end(), b.begin(), b.end(),
                      [](char x, char y) { return lowered(x) == lowered(y); });
}

}  // namespace cimom
