#include "facts/NamePatterns.h"

#include <fnmatch.h>

#include <algorithm>

namespace ZR::Live {

bool NamePatterns::take(const InterfaceName& name) const {
    const std::string text{name.view()};
    const auto matches = [&text](const std::string& pattern) {
        return ::fnmatch(pattern.c_str(), text.c_str(), 0) == 0;
    };
    return (taken.empty() || std::any_of(taken.begin(), taken.end(), matches)) &&
           std::none_of(left.begin(), left.end(), matches);
}

}  // namespace ZR::Live
