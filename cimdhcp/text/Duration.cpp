#include "text/Duration.h"

#include <algorithm>
#include <cstdint>

namespace cimdhcp {

std::string durationText(std::chrono::duration<double> duration) {
    using std::chrono::milliseconds;
    const auto whole = std::max(std::chrono::round<milliseconds>(duration), milliseconds::zero());
    constexpr std::int64_t perSecond = 1000;
    std::string fraction = std::to_string(whole.count() % perSecond);
    fraction.insert(0, 3 - fraction.size(), '0');
    return std::to_string(whole.count() / perSecond) + '.' + fraction + " s";
}

}  // namespace cimdhcp
