#pragma once

#include <string>

namespace ZR {

struct PlatformUtilities {
    /// The directory of the interfaces' configuration files, with its end
    /// separator: the DATA_DIR of the platform settings.
    [[nodiscard]] static std::string getKestraDataDir();
};

}  // namespace ZR
