#include "formats/InterfaceName.h"

#include <fnmatch.h>

#include <algorithm>

namespace ZR::Live {

InterfaceName::InterfaceName(std::string_view text) noexcept
    : length_(static_cast<std::uint8_t>(text.size())) {
    std::copy(text.begin(), text.end(), bytes_.begin());
}

std::optional<InterfaceName> InterfaceName::from(std::string_view text) noexcept {
    const bool isName =
        !text.empty() && text.size() <= maxLength && text != "." && text != ".." &&
        std::none_of(text.begin(), text.end(), [](char byte) {
            return byte == '/' || byte == '\0' || byte == ' ' || (byte >= '\t' && byte <= '\r');
        });
    return isName ? std::optional{InterfaceName{text}} : std::nullopt;
}

bool NamePatterns::take(const InterfaceName& name) const {
    const std::string text{name.view()};
    const auto matches = [&text](const std::string& pattern) {
        return ::fnmatch(pattern.c_str(), text.c_str(), 0) == 0;
    };
    return (taken.empty() || std::any_of(taken.begin(), taken.end(), matches)) &&
           std::none_of(left.begin(), left.end(), matches);
}

}  // namespace ZR::Live
