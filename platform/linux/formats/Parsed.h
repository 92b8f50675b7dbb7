#pragma once

#include <string_view>
#include <variant>

namespace ZR::Live {

/// Facts, or the reason why there are none.
template <typename Facts>
using Parsed = std::variant<Facts, std::string_view>;

}  // namespace ZR::Live
