#include "text/DisplayText.h"

#include <langinfo.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <charconv>
#include <clocale>
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

bool showsUtf8() {
    // A locale of its own: that of the process stays "C", so that numbers look the same.
    const locale_t locale = ::newlocale(LC_CTYPE_MASK, "", nullptr);
    if (locale == nullptr) {
        return false;  // there is no such locale
    }
    const bool utf8 = std::string_view(::nl_langinfo_l(CODESET, locale)) == "UTF-8";
    ::freelocale(locale);
    return utf8;
}

}  // namespace cimdhcp
