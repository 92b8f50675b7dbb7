#include "formats/Assignments.h"

#include <algorithm>
#include <cstddef>

#include "zrcommon/Strings.h"

namespace ZR::Live {
namespace {

constexpr std::string_view nameLetters =
    "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_";

/// The first word of an assignment's right side, its quotes taken off. What stands
/// behind it is a comment or another command, and does not count.
std::string firstWord(std::string_view text) {
    std::string word;
    char quote = '\0';
    for (std::size_t i = 0; i < text.size(); ++i) {
        const char letter = text[i];
        if (letter == '\\' && quote != '\'' && i + 1 < text.size()) {
            word += text[++i];
        } else if (quote != '\0') {
            if (letter == quote) {
                quote = '\0';
            } else {
                word += letter;
            }
        } else if (letter == '"' || letter == '\'') {
            quote = letter;
        } else if (letter == ' ' || letter == '\t' || letter == ';') {
            break;
        } else {
            word += letter;
        }
    }
    return word;
}

}  // namespace

std::vector<ShellAssignment> parseShellAssignments(std::string_view text) {
    std::vector<ShellAssignment> assignments;
    while (!text.empty()) {
        const std::size_t end = std::min(text.find('\n'), text.size());
        std::string_view line = trim(text.substr(0, end));
        text.remove_prefix(std::min(end + 1, text.size()));
        if (line.starts_with("export ") || line.starts_with("export\t")) {
            line = trim(line.substr(7));
        }
        const std::size_t equals = line.find('=');
        const std::string_view name = line.substr(0, equals);
        if (equals == std::string_view::npos || name.empty() ||
            name.find_first_not_of(nameLetters) != std::string_view::npos) {
            continue;
        }
        assignments.push_back(
            {.name = std::string{name}, .value = firstWord(line.substr(equals + 1))});
    }
    return assignments;
}

std::string_view lastValue(const std::vector<ShellAssignment>& assignments,
                           std::string_view name) noexcept {
    const auto found =
        std::find_if(assignments.rbegin(), assignments.rend(),
                     [&](const ShellAssignment& assignment) { return assignment.name == name; });
    return found == assignments.rend() ? std::string_view{} : std::string_view{found->value};
}

}  // namespace ZR::Live
