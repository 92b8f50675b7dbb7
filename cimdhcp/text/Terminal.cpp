#include "text/Terminal.h"

#include <sys/ioctl.h>
#include <unistd.h>

#include <charconv>
#include <string_view>

namespace cimdhcp {

namespace {

constexpr std::size_t usualWidth = 80;

}  // namespace

std::optional<std::size_t> terminalWidth(int descriptor, const char* columns) {
    if (::isatty(descriptor) == 0) {
        return std::nullopt;
    }
    const std::string_view text = columns == nullptr ? "" : columns;
    std::size_t width = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), width);
    if (error == std::errc() && end == text.data() + text.size() && width > 0) {
        return width;
    }
    winsize size{};
    if (::ioctl(descriptor, TIOCGWINSZ, &size) == 0 && size.ws_col > 0) {
        return size.ws_col;
    }
    return usualWidth;
}

}  // namespace cimdhcp
