#include "text/SortOrder.h"

#include <algorithm>

#include "cimom/Names.h"
#include "client/Failure.h"
#include "text/DisplayText.h"

namespace cimdhcp {

namespace {

bool isDigit(char c) noexcept {
    return c >= '0' && c <= '9';
}

/// The digits at the beginning without leading zeros, which are taken off the text
/// with them.
std::string_view takeNumber(std::string_view& text) noexcept {
    const auto* const end = std::find_if_not(text.begin(), text.end(), isDigit);
    std::string_view number = text.substr(0, static_cast<std::size_t>(end - text.begin()));
    text.remove_prefix(number.size());
    number.remove_prefix(std::min(number.find_first_not_of('0'), number.size()));
    return number;
}

std::string plain(std::string name) {
    std::replace_if(
        name.begin(), name.end(), [](char c) { return c == '-' || c == '_'; }, ' ');
    return name;
}

}  // namespace

bool comesBefore(std::string_view a, std::string_view b) noexcept {
    const std::string_view wholeA = a;
    const std::string_view wholeB = b;
    while (!a.empty() && !b.empty()) {
        if (isDigit(a.front()) && isDigit(b.front())) {
            const std::string_view numberA = takeNumber(a);
            const std::string_view numberB = takeNumber(b);
            if (numberA.size() != numberB.size()) {
                return numberA.size() < numberB.size();
            }
            if (numberA != numberB) {
                return numberA < numberB;
            }
        } else if (a.front() != b.front()) {
            return static_cast<unsigned char>(a.front()) < static_cast<unsigned char>(b.front());
        } else {
            a.remove_prefix(1);
            b.remove_prefix(1);
        }
    }
    // What is the same but for leading zeros still has an order.
    return a.empty() && b.empty() ? wholeA < wholeB : a.empty();
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
