#include "sources/TokenTracker.h"

#include <algorithm>

namespace ZR {

TextPlace placeOf(std::size_t offset, std::string_view text) {
    const std::string_view before = text.substr(0, std::min(offset, text.size()));
    const auto lines = std::count(before.begin(), before.end(), '\n');
    const std::size_t lineStart = before.rfind('\n') + 1;  // 0 in the first line: npos + 1
    return {static_cast<std::size_t>(lines) + 1, before.size() - lineStart + 1};
}

TokenTracker::TokenTracker(std::string_view text) noexcept : text_(text), reached_(text.data()) {
    constexpr std::string_view byteOrderMark = "\xEF\xBB\xBF";
    if (text.starts_with(byteOrderMark)) {
        lastEnd_ = byteOrderMark.size();  // the parser passes over it, too
    }
}

void TokenTracker::pass(std::size_t lookAhead) noexcept {
    lastEnd_ = static_cast<std::size_t>(reached_ - text_.data()) - lookAhead;
}

std::size_t TokenTracker::start() const noexcept {
    // Between two tokens there is nothing else.
    return std::min(text_.find_first_not_of(" \t\r\n,:", lastEnd_), text_.size());
}

}  // namespace ZR
