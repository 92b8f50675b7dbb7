#include "commands/rename/RenameFiles.h"

#include <algorithm>
#include <array>
#include <cstddef>

#include "text/DisplayText.h"
#include "zrcommon/InterfaceFile.h"
#include "zrcommon/PropertyFile.h"

namespace cimdhcp {

namespace {

constexpr std::string_view nameKey = ZR::InterfaceFile::configurationName;
constexpr std::size_t longestName = 490;
constexpr std::size_t longestLine = 510;

/// What a shell makes of one of several characters in an assignment without quotes.
struct Meaning {
    std::string_view characters;
    const char* consequence;
};

// Nothing else has a meaning there: patterns and braces are not expanded in an
// assignment, "#" begins a comment only where a word begins, and "!" counts only where
// a person types.
constexpr std::array<Meaning, 6> meanings{{
    {" \t;&|", "a shell that reads the file ends the name there, and runs what follows"},
    {"$`",
     "a shell that reads the file puts the value of a variable, or the output of a command "
     "that it runs, in its place"},
    {"<>", "a shell that reads the file opens, or overwrites, the file that is named behind it"},
    {"()", "a shell that reads the file takes it for a list, or for a fault that ends its reading"},
    {"'\"",
     "a shell that reads the file takes it away, and reads on in the lines below up to a "
     "second one"},
    {"\\", "a shell that reads the file takes it away"},
}};

std::string inQuotes(std::string_view text) {
    constexpr std::size_t longest = 60;
    return '"' + printable(text.substr(0, longest)) + (text.size() > longest ? "...\"" : "\"");
}

std::string nameOf(char character) {
    switch (character) {
        case ' ':
            return "blank";
        case '\'':
        case '"':
            return "quotation mark";
        default:
            return inQuotes({&character, 1});
    }
}

/// A home directory stands for "~" at the beginning of a value and of its parts.
bool hasTilde(std::string_view name) {
    for (std::size_t at = name.find('~'); at != std::string_view::npos;
         at = name.find('~', at + 1)) {
        if (at == 0 || name[at - 1] == ':' || name[at - 1] == '=') {
            return true;
        }
    }
    return false;
}

/// Calls for each line, without its end, with its number.
template <typename Call>
void forEachLine(std::string_view content, Call&& call) {
    for (std::size_t number = 1; !content.empty(); ++number) {
        const std::size_t end = std::min(content.find('\n'), content.size());
        call(number, content.substr(0, end));
        content.remove_prefix(std::min(end + 1, content.size()));
    }
}

}  // namespace

std::vector<std::string> refusalsOfName(std::string_view name) {
    std::vector<std::string> refusals;
    for (const Meaning& meaning : meanings) {
        const std::size_t at = name.find_first_of(meaning.characters);
        if (at != std::string_view::npos) {
            refusals.push_back("the name has a " + nameOf(name[at]) + ": " + meaning.consequence);
        }
    }
    if (hasTilde(name)) {
        refusals.emplace_back(
            "the name has a \"~\" at the beginning of a part: a shell that reads the file puts a "
            "home directory in its place");
    }
    if (name.size() > longestName) {
        refusals.push_back("the name has " + std::to_string(name.size()) + " bytes, more than " +
                           std::to_string(longestName) +
                           ": the next change would take its line for several, and leave the end "
                           "of it behind as a line of its own");
    }
    return refusals;
}

std::vector<std::string> refusalsOfContent(std::string_view content) {
    const std::string assignment = std::string(nameKey) + '=';
    std::vector<std::string> refusals;
    forEachLine(content, [&](std::size_t number, std::string_view line) {
        const std::string where = "line " + std::to_string(number) + ", " + inQuotes(line) + ", ";
        // What stands behind a zero byte is not looked at.
        const bool contains =
            line.substr(0, line.find('\0')).find(nameKey) != std::string_view::npos;
        if (line.size() > longestLine) {
            refusals.push_back(where + "has " + std::to_string(line.size()) +
                               " bytes: it would be taken for several lines of at most 511, and "
                               "each of these that contains " +
                               std::string(nameKey) + " replaced by the new name's line");
        } else if (contains && !line.starts_with(assignment)) {
            refusals.push_back(where + "contains " + std::string(nameKey) +
                               ": the whole line would be replaced by the new name's line");
        }
    });
    return refusals;
}

bool lacksLineEnd(std::string_view content) {
    return !content.empty() && content.back() != '\n';
}

std::string namesIn(std::string_view content) {
    std::string text;
    for (const ZR::PropertyLine& line : ZR::parsePropertyLines(content)) {
        if (line.key == nameKey) {
            text += (text.empty() ? "" : ", and ") + line.key + '=' + printable(line.value) +
                    " in line " + std::to_string(line.line);
        }
    }
    return text.empty() ? "no " + std::string(nameKey) : text;
}

}  // namespace cimdhcp
