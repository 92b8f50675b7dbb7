#include "text/Likeness.h"

#include <algorithm>
#include <cstddef>
#include <utility>
#include <vector>

#include "text/DisplayText.h"

namespace cimdhcp {

namespace {

/// Longer than any name here; comparing costs the product of both lengths.
constexpr std::size_t longestCompared = 128;
/// A beginning as short as this could be that of too many.
constexpr std::size_t shortestBeginning = 3;

std::string lowered(std::string_view text) {
    std::string result(text);
    std::transform(result.begin(), result.end(), result.begin(), [](char letter) {
        return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter - 'A' + 'a') : letter;
    });
    return result;
}

/// How many letters must be put in, left out, replaced or swapped with their neighbour.
std::size_t distanceOf(std::string_view a, std::string_view b) {
    std::vector<std::size_t> beforeLast(b.size() + 1);
    std::vector<std::size_t> last(b.size() + 1);
    std::vector<std::size_t> row(b.size() + 1);
    for (std::size_t j = 0; j <= b.size(); ++j) {
        last[j] = j;
    }
    for (std::size_t i = 1; i <= a.size(); ++i) {
        row[0] = i;
        for (std::size_t j = 1; j <= b.size(); ++j) {
            const bool same = a[i - 1] == b[j - 1];
            row[j] = std::min({last[j] + 1, row[j - 1] + 1, last[j - 1] + (same ? 0 : 1)});
            if (i > 1 && j > 1 && a[i - 1] == b[j - 2] && a[i - 2] == b[j - 1]) {
                row[j] = std::min(row[j], beforeLast[j - 2] + 1);
            }
        }
        std::swap(beforeLast, last);
        std::swap(last, row);
    }
    return last[b.size()];
}

}  // namespace

std::optional<std::string> nearestTo(std::string_view wanted, std::span<const std::string> names) {
    if (wanted.empty() || wanted.size() > longestCompared) {
        return std::nullopt;
    }
    const std::string typed = lowered(wanted);
    // One letter in four may be wrong, and one more, but never all of them.
    std::size_t nearest = std::min(typed.size() / 4 + 1, typed.size() - 1) + 1;
    std::optional<std::string> found;
    for (const std::string& name : names) {
        const std::string known = lowered(name);
        if (known.size() > longestCompared) {
            continue;
        }
        const bool begins = typed.size() >= shortestBeginning && known.starts_with(typed);
        const std::size_t distance = begins ? 1 : distanceOf(typed, known);
        if (distance < nearest) {
            nearest = distance;
            found = name;
        }
    }
    return found;
}

std::string didYouMean(std::string_view wanted, std::span<const std::string> names) {
    const auto nearest = nearestTo(wanted, names);
    return nearest ? "; did you mean " + printable(*nearest) + '?' : std::string();
}

}  // namespace cimdhcp
