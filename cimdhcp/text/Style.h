#pragma once

#include <string>

namespace cimdhcp {

/// How text looks.
struct Style {
    bool header = true;  ///< tables have headings
    bool color = false;  ///< with the escape sequences of ECMA-48

    /// Headings and the names of what is below them.
    [[nodiscard]] std::string strong(const std::string& text) const;
    /// What went wrong.
    [[nodiscard]] std::string alarming(const std::string& text) const;

    bool operator==(const Style&) const = default;
};

enum class ColorMode { automatic, always, never };

/// Whether colors are wanted: in automatic mode on a terminal, unless the variables
/// NO_COLOR (when it is not empty) or TERM ("dumb") of the environment say otherwise.
/// Both may be null: not set.
[[nodiscard]] bool wantsColor(ColorMode mode, bool terminal, const char* noColor,
                              const char* terminalKind) noexcept;

}  // namespace cimdhcp
