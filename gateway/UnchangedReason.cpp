#include "Modification.h"

#include <string_view>

#include "zrcommon/InterfaceFile.h"
#include "zrcommon/PlatformUtilities.h"

namespace ZR::DHCPClientGateway {

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
    if (const auto obstacle = InterfaceFile::obstacle(*path)) {
        return {obstacle->denied ? CMPI_RC_ERR_ACCESS_DENIED : CMPI_RC_ERR_FAILED, obstacle->text};
    }
    return {CMPI_RC_ERR_FAILED, *path + " gives the name \"" + now + "\", not \"" + wanted +
                                    "\": blanks around a name and quotation marks do not count, "
                                    "and the log of the provider tells of a failed write"};
}

}  // namespace ZR::DHCPClientGateway
