#include "text/Style.h"

#include <string_view>

namespace cimdhcp {

namespace {

std::string within(const char* sequence, const std::string& text) {
    return sequence + text + "\x1B[0m";
}

}  // namespace

std::string Style::strong(const std::string& text) const {
    return color ? within("\x1B[1m", text) : text;
}

std::string Style::alarming(const std::string& text) const {
    return color ? within("\x1B[31m", text) : text;
}

bool wantsColor(ColorMode mode, bool terminal, const char* noColor,
                const char* terminalKind) noexcept {
    if (mode != ColorMode::automatic) {
        return mode == ColorMode::always;
    }
    const bool refused = noColor != nullptr && *noColor != '\0';
    const bool dumb = terminalKind != nullptr && std::string_view(terminalKind) == "dumb";
    return terminal && !refused && !dumb;
}

}  // namespace cimdhcp
