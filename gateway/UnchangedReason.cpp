#include "UnchangedReason.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/statvfs.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <string_view>

#include "zrcommon/InterfaceFile.h"
#include "zrcommon/PlatformUtilities.h"

namespace ZR::DHCPClientGateway {

namespace {

/// Whether the file system of a file has no room for anybody but its administrator.
bool isFull(const std::string& path) {
    struct statvfs system {};
    return ::statvfs(path.c_str(), &system) == 0 && system.f_bavail == 0;
}

}  // namespace

Refusal whyNameUnchanged(const std::string& interfaceName, const std::string& wanted,
                         const std::string& now) {
    if (wanted.find_first_of(std::string_view("\n\r\0", 3)) != std::string::npos) {
        return {CMPI_RC_ERR_FAILED,
                "a configuration name is one line: it cannot have a line break"};
    }
    const auto path = InterfaceFile::path(PlatformUtilities::getKestraDataDir(), interfaceName);
    if (!path) {
        return {CMPI_RC_ERR_FAILED, "no file can be named after the interface"};
    }
    if (::faccessat(AT_FDCWD, path->c_str(), F_OK, AT_EACCESS) != 0) {
        return {errno == EACCES ? CMPI_RC_ERR_ACCESS_DENIED : CMPI_RC_ERR_FAILED,
                *path + ": " + std::strerror(errno)};
    }
    struct stat status {};
    if (::stat(path->c_str(), &status) == 0 && !S_ISREG(status.st_mode)) {
        return {CMPI_RC_ERR_FAILED, *path + " is not a regular file"};
    }
    for (const int mode : {R_OK, W_OK}) {
        if (::faccessat(AT_FDCWD, path->c_str(), mode, AT_EACCESS) != 0) {
            return {CMPI_RC_ERR_ACCESS_DENIED, *path + " cannot be " +
                                                   (mode == R_OK ? "read" : "written") + ": " +
                                                   std::strerror(errno)};
        }
    }
    if (isFull(*path)) {
        return {CMPI_RC_ERR_FAILED, *path + ": " + std::strerror(ENOSPC)};
    }
    return {CMPI_RC_ERR_FAILED, *path + " gives the name \"" + now + "\", not \"" + wanted +
                                    "\": blanks around a name and quotation marks do not count, "
                                    "and the log of the provider tells of a failed write"};
}

}  // namespace ZR::DHCPClientGateway
