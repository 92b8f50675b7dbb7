#include "text/DisplayText.h"

#include <bit>
#include <clocale>
#include <cstdint>
#include <cwchar>

#include "zrcommon/Strings.h"

namespace cimdhcp {

namespace {

/// The widths of characters, whatever locale the program was started in.
class Widths {
  public:
    Widths() : locale_(::newlocale(LC_CTYPE_MASK, "C.UTF-8", nullptr)) {}
    ~Widths() {
        if (locale_ != nullptr) {
            ::freelocale(locale_);
        }
    }
    Widths(const Widths&) = delete;
    Widths& operator=(const Widths&) = delete;

    /// Columns of a character, below 0 when it cannot be printed.
    [[nodiscard]] int of(wchar_t unit) const {
        if (unit == L'\0') {
            return -1;  // wcwidth() takes it for the end of a text, of no width
        }
        if (locale_ == nullptr) {
            return unit < L' ' || (unit >= 0x7F && unit <= 0x9F) ? -1 : 1;
        }
        locale_t const before = ::uselocale(locale_);
        const int width = ::wcwidth(unit);
        ::uselocale(before);
        return width;
    }

  private:
    locale_t locale_;
};

int widthOf(wchar_t unit) {
    static const Widths widths;
    return widths.of(unit);
}

/// Characters without a width that change how the text around them looks: marks of direction,
/// which make it read in another order, and separators of lines.
bool misleads(wchar_t unit) noexcept {
    return unit == 0x0085 || unit == 0x061C || unit == 0x200E || unit == 0x200F ||
           (unit >= 0x2028 && unit <= 0x202E) || (unit >= 0x2066 && unit <= 0x2069);
}

std::string escaped(wchar_t unit) {
    constexpr std::uint32_t firstStrayByte = 0xDC80;  // as ZR::make_wstring marks them
    constexpr std::uint32_t lastStrayByte = 0xDCFF;
    auto value = std::bit_cast<std::uint32_t>(unit);
    std::string text = "\\";
    unsigned digits = 2;
    if (value >= firstStrayByte && value <= lastStrayByte) {
        value &= 0xFFU;
        text += 'x';
    } else if (value <= 0x7F) {
        text += 'x';
    } else if (value <= 0xFFFF) {
        digits = 4;
        text += 'u';
    } else {
        digits = 8;
        text += 'U';
    }
    while (digits > 0) {
        --digits;
        text += "0123456789ABCDEF"[(value >> (4U * digits)) & 0xFU];
    }
    return text;
}

std::size_t columns(std::wstring_view text) {
    std::size_t sum = 0;
    for (const wchar_t unit : text) {
        const int width = widthOf(unit);
        sum += width > 0 ? static_cast<std::size_t>(width) : 0;
    }
    return sum;
}

/// How many characters of the text fit into the columns; at least one.
std::size_t fitting(std::wstring_view text, std::size_t width) {
    std::size_t count = 0;
    std::size_t used = 0;
    while (count < text.size()) {
        used += columns(text.substr(count, 1));
        if (used > width && count > 0) {
            break;
        }
        ++count;
    }
    return count;
}

}  // namespace

std::string printable(std::string_view text) {
    std::string result;
    for (const wchar_t unit : ZR::make_wstring(text)) {
        result += widthOf(unit) < 0 || misleads(unit) ? escaped(unit) : ZR::make_string({&unit, 1});
    }
    return result;
}

std::size_t displayWidth(std::string_view text) {
    return columns(ZR::make_wstring(text));
}

std::string cutToWidth(const std::string& text, std::size_t width) {
    const std::wstring wide = ZR::make_wstring(text);
    if (columns(wide) <= width) {
        return text;
    }
    if (width < 2) {
        return "…";
    }
    const std::wstring_view beginning = std::wstring_view(wide).substr(0, fitting(wide, width - 1));
    // The first character alone may be wider than the room before the dots.
    return columns(beginning) < width ? ZR::make_string(beginning) + "…" : "…";
}

std::vector<std::string> wrapToWidth(std::string_view text, std::size_t width) {
    const std::wstring wide = ZR::make_wstring(text);
    std::wstring_view rest = wide;
    std::vector<std::string> lines;
    while (columns(rest) > width) {
        std::size_t end = fitting(rest, width);
        std::size_t next = end;
        const std::size_t blank = rest.substr(0, end + 1).rfind(L' ');
        if (blank != std::wstring_view::npos && blank > 0) {
            end = blank;
            next = blank + 1;
        }
        lines.push_back(ZR::make_string(rest.substr(0, end)));
        rest.remove_prefix(next);
    }
    lines.push_back(ZR::make_string(rest));
    return lines;
}

}  // namespace cimdhcp
