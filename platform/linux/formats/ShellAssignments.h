#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace ZR::Live {

/// One assignment of a shell fragment.
struct ShellAssignment {
    std::string name;
    std::string value;  ///< without quotes; nothing in it is expanded

    bool operator==(const ShellAssignment&) const = default;
};

/// The assignments NAME=value, NAME='value', NAME="value", also behind "export", in
/// their order. Any text gives facts: what is not an assignment is skipped, and nothing
/// is ever executed.
[[nodiscard]] std::vector<ShellAssignment> parseShellAssignments(std::string_view text);

/// The last value of a name; empty when there is none.
[[nodiscard]] std::string_view lastValue(const std::vector<ShellAssignment>& assignments,
                                         std::string_view name) noexcept;

}  // namespace ZR::Live
