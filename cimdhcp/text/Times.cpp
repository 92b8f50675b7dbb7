#include "text/Times.h"

#include <algorithm>
#include <array>
#include <chrono>
#include <concepts>
#include <cstddef>
#include <string>

namespace cimdhcp {

namespace {

struct Unit {
    std::int64_t seconds;
    std::int64_t most;  ///< as many of it are told; more in the next one
    const char* name;
};
// One of a unit says little: two are told in the smaller unit still.
constexpr std::array<Unit, 4> units{
    {{1, 119, "s"}, {60, 119, "min"}, {3600, 47, "h"}, {86400, 100, "d"}}};

constexpr std::int64_t firstMoment = 0;
constexpr std::int64_t lastMoment = 253'402'300'799;  // 9999-12-31T23:59:59Z

/// With zeros in front.
std::string padded(std::integral auto number, std::size_t width) {
    std::string digits = std::to_string(number);
    digits.insert(0, width - std::min(width, digits.size()), '0');
    return digits;
}

}  // namespace

std::int64_t secondsNow() {
    const auto now = std::chrono::system_clock::now().time_since_epoch();
    return std::chrono::floor<std::chrono::seconds>(now).count();
}

std::string durationText(std::chrono::duration<double> duration) {
    using std::chrono::milliseconds;
    const auto whole = std::max(std::chrono::round<milliseconds>(duration), milliseconds::zero());
    constexpr std::int64_t perSecond = 1000;
    std::string fraction = std::to_string(whole.count() % perSecond);
    fraction.insert(0, 3 - fraction.size(), '0');
    return std::to_string(whole.count() / perSecond) + '.' + fraction + " s";
}

std::string relativeText(std::int64_t moment, std::int64_t now) {
    const std::int64_t bounded = std::clamp(moment, firstMoment, lastMoment);
    const std::int64_t from = std::clamp(now, firstMoment, lastMoment);
    const bool past = bounded < from;
    const std::int64_t distance = past ? from - bounded : bounded - from;
    for (const Unit& unit : units) {
        const std::int64_t count = (distance + unit.seconds / 2) / unit.seconds;
        if (count <= unit.most) {
            const std::string text = std::to_string(count) + ' ' + unit.name;
            return past ? text + " ago" : "in " + text;
        }
    }
    constexpr std::size_t dateLength = 10;
    return isoText(bounded).substr(0, dateLength);
}

std::string isoText(std::int64_t moment) {
    // Not by the C library, whose time ends in 2038 where it has 32 bits.
    const std::chrono::sys_seconds time{
        std::chrono::seconds(std::clamp(moment, firstMoment, lastMoment))};
    const auto day = std::chrono::floor<std::chrono::days>(time);
    const std::chrono::year_month_day date(day);
    const std::chrono::hh_mm_ss clock(time - day);
    std::string text = padded(static_cast<int>(date.year()), 4);
    text += '-' + padded(static_cast<unsigned>(date.month()), 2);
    text += '-' + padded(static_cast<unsigned>(date.day()), 2);
    text += 'T' + padded(clock.hours().count(), 2);
    text += ':' + padded(clock.minutes().count(), 2);
    text += ':' + padded(clock.seconds().count(), 2);
    return text + 'Z';
}

}  // namespace cimdhcp
