#include "zrcommon/PlatformUtilities.h"

#include "zrcommon/PlatformSettings.h"

namespace ZR {

std::string PlatformUtilities::getKestraDataDir() {
    return PlatformSettings::process().dataDir;
}

}  // namespace ZR
