#pragma once

#include <algorithm>
#include <cstddef>
#include <string_view>

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

}  // namespace ZR::Live
