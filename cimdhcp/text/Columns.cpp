#include "text/Columns.h"

#include <utility>

#include "cimom/Names.h"
#include "text/DisplayText.h"
#include "text/Failure.h"

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

std::size_t columnNamed(const std::string& wanted, const std::vector<std::string>& names) {
    std::string known;
    for (std::size_t index = 0; index < names.size(); ++index) {
        if (cimom::sameName(plain(names[index]), plain(wanted))) {
            return index;
        }
        known += (index == 0 ? "" : ", ") + printable(names[index]);
    }
    throw Failure(ExitStatus::usage,
                  "--sort: there is no column \"" + printable(wanted) + "\"; there are: " + known);
}

}  // namespace cimdhcp
