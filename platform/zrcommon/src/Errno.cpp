#include "zrcommon/Errno.h"

#include <cerrno>
#include <system_error>

namespace ZR {

std::string reasonOf(int error) {
    return std::generic_category().message(error);
}

bool isAbsent(int error) noexcept {
    return error == ENOENT || error == ENOTDIR;
}

}  // namespace ZR
