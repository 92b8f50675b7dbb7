#include "text/Columns.h"

#include <algorithm>

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
    // Texts that differ in leading zeros alone still have an order.
    return a.empty() && b.empty() ? wholeA < wholeB : a.empty();
}

}  // namespace cimdhcp
