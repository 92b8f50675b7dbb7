#include "text/Times.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <ctime>

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
    const std::time_t time = std::clamp(moment, firstMoment, lastMoment);
    std::tm parts{};
    if (::gmtime_r(&time, &parts) == nullptr) {
        return {};  // not of a year within these bounds
    }
    std::array<char, 32> text{};
    return {text.data(), std::strftime(text.data(), text.size(), "%Y-%m-%dT%H:%M:%SZ", &parts)};
}

}  // namespace cimdhcp
