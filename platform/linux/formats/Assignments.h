#pragma once

#include <algorithm>
#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "zrcommon/Strings.h"

namespace ZR::Live {

/// Runs over the lines KEY=value of a text with [sections], as systemd and
/// NetworkManager write them: action(section, key, value), blanks around each taken
/// off. Comments and lines that are not a pair are skipped; any text is walked.
template <typename Action>
void forEachKey(std::string_view text, Action action) {
    std::string_view section;
    while (!text.empty()) {
        const std::size_t end = std::min(text.find('\n'), text.size());
        const std::string_view line = trim(text.substr(0, end));
        text.remove_prefix(std::min(end + 1, text.size()));
        if (line.starts_with('#') || line.starts_with(';')) {
            continue;
        }
        if (line.starts_with('[') && line.ends_with(']')) {
            section = line.substr(1, line.size() - 2);
        } else if (const std::size_t equals = line.find('='); equals != std::string_view::npos) {
            action(section, trim(line.substr(0, equals)), trim(line.substr(equals + 1)));
        }
    }
}

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
