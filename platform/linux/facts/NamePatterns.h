#pragma once

#include <string>
#include <vector>

#include "formats/InterfaceName.h"

namespace ZR::Live {

/// Links that a program was told to take, and to leave alone, by patterns of their names, in
/// which "*" and "?" stand for any text and any character.
struct NamePatterns {
    std::vector<std::string> taken;  ///< empty: all
    std::vector<std::string> left;   ///< these not, whatever is taken

    /// Whether the program was told to take a link of this name.
    [[nodiscard]] bool take(const InterfaceName& name) const;

    bool operator==(const NamePatterns&) const = default;
};

}  // namespace ZR::Live
