#include "zrcommon/SystemName.h"

#include <unistd.h>

#include <array>

namespace ZR {

std::string getSystemName() {
    std::array<char, hostNameBufferSize> name{};
    if (::gethostname(name.data(), name.size() - 1) != 0) {
        return {};
    }
    return name.data();
}

}  // namespace ZR
