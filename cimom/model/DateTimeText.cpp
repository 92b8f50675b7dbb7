#include "cimom/DateTimeText.h"

#include <algorithm>
#include <chrono>

#include "cimom/Names.h"

namespace cimom {

namespace {

constexpr std::size_t textLength = 25;
constexpr std::size_t separatorAt = 21;
constexpr std::int64_t perSecond = 1'000'000;
constexpr std::int64_t perMinute = 60 * perSecond;
constexpr std::int64_t perHour = 60 * perMinute;
constexpr std::int64_t perDay = 24 * perHour;

/// Reads the fields from the left; once a field is unknown, all behind it are.
class Fields {
  public:
    explicit Fields(std::string_view text) noexcept : text_(text) {}

    /// A field that is digits or asterisks as a whole; `smallest` is what
    /// asterisks stand for.
    std::int64_t whole(std::size_t length, std::int64_t smallest, std::int64_t largest) noexcept {
        const std::string_view field = text_.substr(at_, length);
        at_ += length;
        if (field.find_first_not_of('*') == std::string_view::npos) {
            unknown_ = true;
            return smallest;
        }
        const std::int64_t value = digits(field);
        good_ = good_ && !unknown_ && value >= smallest && value <= largest;
        return value;
    }

    /// The microseconds: single digits from the right may be unknown.
    std::int64_t fraction() noexcept {
        const std::string_view field = text_.substr(at_, 6);
        at_ += 6;
        const std::size_t known = std::min(field.find('*'), field.size());
        good_ = good_ && (known == 0 || !unknown_) &&
                field.find_first_not_of('*', known) == std::string_view::npos;
        std::int64_t value = digits(field.substr(0, known));
        for (std::size_t missing = known; missing < field.size(); ++missing) {
            value *= 10;
        }
        return value;
    }

    void character(char expected) noexcept {
        good_ = good_ && text_[at_] == expected;
        ++at_;
    }

    std::int64_t digits(std::string_view field) noexcept {
        std::int64_t value = 0;
        for (const char digit : field) {
            good_ = good_ && isDigit(digit);
            value = value * 10 + (digit - '0');
        }
        return value;
    }

    [[nodiscard]] bool good() const noexcept { return good_; }

  private:
    std::string_view text_;
    std::size_t at_ = 0;
    bool unknown_ = false;
    bool good_ = true;
};

std::optional<DateTime> parseInterval(std::string_view text) noexcept {
    Fields fields(text);
    const std::int64_t days = fields.whole(8, 0, 99'999'999);
    const std::int64_t hours = fields.whole(2, 0, 23);
    const std::int64_t minutes = fields.whole(2, 0, 59);
    const std::int64_t seconds = fields.whole(2, 0, 59);
    fields.character('.');
    const std::int64_t micros = fields.fraction();
    if (!fields.good() || text.substr(separatorAt) != ":000") {
        return std::nullopt;
    }
    return DateTime{
        true, days * perDay + hours * perHour + minutes * perMinute + seconds * perSecond + micros};
}

std::optional<DateTime> parsePoint(std::string_view text) noexcept {
    Fields fields(text);
    const std::int64_t year = fields.whole(4, 0, 9999);
    const std::int64_t month = fields.whole(2, 1, 12);
    const std::int64_t day = fields.whole(2, 1, 31);
    const std::int64_t hours = fields.whole(2, 0, 23);
    const std::int64_t minutes = fields.whole(2, 0, 59);
    const std::int64_t seconds = fields.whole(2, 0, 59);
    fields.character('.');
    const std::int64_t micros = fields.fraction();
    const std::int64_t offset = fields.digits(text.substr(separatorAt + 1));
    if (!fields.good()) {
        return std::nullopt;
    }
    const std::chrono::year_month_day date{std::chrono::year(static_cast<int>(year)),
                                           std::chrono::month(static_cast<unsigned>(month)),
                                           std::chrono::day(static_cast<unsigned>(day))};
    if (!date.ok()) {
        return std::nullopt;
    }
    const std::int64_t days = std::chrono::sys_days(date).time_since_epoch().count();
    const std::int64_t local =
        days * perDay + hours * perHour + minutes * perMinute + seconds * perSecond + micros;
    // The text is local time; the offset is what was added to UTC.
    const std::int64_t shift = text[separatorAt] == '-' ? -offset : offset;
    return DateTime{false, local - shift * perMinute};
}

void put(std::string& text, std::size_t at, std::size_t length, std::int64_t value) {
    for (std::size_t digit = 0; digit < length; ++digit) {
        text[at + length - 1 - digit] = static_cast<char>('0' + value % 10);
        value /= 10;
    }
}

}  // namespace

std::optional<DateTime> parseDateTime(std::string_view text) noexcept {
    if (text.size() != textLength) {
        return std::nullopt;
    }
    switch (text[separatorAt]) {
        case ':':
            return parseInterval(text);
        case '+':
        case '-':
            return parsePoint(text);
        default:
            return std::nullopt;
    }
}

std::optional<std::string> toText(const DateTime& value) {
    std::int64_t days = value.microseconds / perDay;
    std::int64_t rest = value.microseconds % perDay;
    if (rest < 0) {
        rest += perDay;
        --days;
    }
    std::string text = value.interval ? "00000000000000.000000:000" : "00000000000000.000000+000";
    put(text, 8, 2, rest / perHour);
    put(text, 10, 2, rest % perHour / perMinute);
    put(text, 12, 2, rest % perMinute / perSecond);
    put(text, 15, 6, rest % perSecond);
    if (value.interval) {
        if (days < 0 || days > 99'999'999) {
            return std::nullopt;
        }
        put(text, 0, 8, days);
        return text;
    }
    constexpr std::int64_t yearZero = -719528;  // days from 1970-01-01 to 0000-01-01
    constexpr std::int64_t yearTenThousand = 2932897;
    if (days < yearZero || days >= yearTenThousand) {
        return std::nullopt;
    }
    const std::chrono::year_month_day date{
        std::chrono::sys_days(std::chrono::days(static_cast<int>(days)))};
    put(text, 0, 4, int{date.year()});
    put(text, 4, 2, unsigned{date.month()});
    put(text, 6, 2, unsigned{date.day()});
    return text;
}

}  // namespace cimom
