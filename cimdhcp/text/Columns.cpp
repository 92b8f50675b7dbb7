#include "text/Columns.h"

#include <utility>

#include "cimom/Names.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "text/Likeness.h"

namespace cimdhcp {

namespace {

std::string plain(std::string name) {
    std::replace_if(
        name.begin(), name.end(), [](char c) { return c == '-' || c == '_'; }, ' ');
    return name;
}

}  // namespace

std::string cellOf(const std::string& text) {
    return text.empty() ? "-" : text;
}

std::size_t columnNamed(const std::string& option, const std::string& wanted,
                        const std::vector<std::string>& names) {
    std::string known;
    for (std::size_t index = 0; index < names.size(); ++index) {
        if (cimom::sameName(plain(names[index]), plain(wanted))) {
            return index;
        }
        known += (index == 0 ? "" : ", ") + printable(names[index]);
    }
    throw Failure(ExitStatus::usage, option + ": there is no column \"" + printable(wanted) +
                                         "\"; there are: " + known + didYouMean(wanted, names));
}

std::string tsvValue(std::string_view text) {
    constexpr unsigned char firstPrintable = 0x20;
    constexpr unsigned char deleted = 0x7F;
    constexpr std::string_view digits = "0123456789ABCDEF";
    std::string value;
    for (const char letter : text) {
        const auto code = static_cast<unsigned char>(letter);
        if (letter == '\\') {
            value += "\\\\";
        } else if (letter == '\t') {
            value += "\\t";
        } else if (letter == '\n') {
            value += "\\n";
        } else if (letter == '\r') {
            value += "\\r";
        } else if (code < firstPrintable || code == deleted) {
            value += {'\\', 'x', digits[code >> 4U], digits[code & 0xFU]};
        } else {
            value += letter;
        }
    }
    return value;
}

std::string tsvLine(const std::vector<std::string>& values) {
    std::string line;
    for (std::size_t index = 0; index < values.size(); ++index) {
        line += (index == 0 ? "" : "\t") + tsvValue(values[index]);
    }
    return line + '\n';
}

}  // namespace cimdhcp
