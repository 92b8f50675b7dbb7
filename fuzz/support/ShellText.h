#pragma once

#include <string>

namespace fuzz {

/// NAME='value' as a shell reads it back, with a line feed.
inline std::string shellLine(const std::string& name, const std::string& value) {
    std::string line = name + "='";
    for (const char letter : value) {
        line += letter == '\'' ? std::string("'\\''") : std::string(1, letter);
    }
    return line + "'\n";
}

}  // namespace fuzz
