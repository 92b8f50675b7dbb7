#include "facts/RunningPrograms.h"

#include <algorithm>

namespace ZR::Live {

bool ClientProcess::serves(const InterfaceName& interface) const noexcept {
    return interfaces.empty() ||
           std::find(interfaces.begin(), interfaces.end(), interface) != interfaces.end();
}

}  // namespace ZR::Live
