#include "zrcommon/SystemName.h"

#include <unistd.h>

#include <array>
#include <cerrno>

#include "zrcommon/File.h"

namespace ZR {

SystemName readSystemName() {
    std::array<char, hostNameBufferSize> name{};
    if (::gethostname(name.data(), name.size() - 1) != 0) {
        return {"", "the system does not tell its name: " + reasonOf(errno)};
    }
    if (name.front() == '\0') {
        return {"", "the system has no name"};
    }
    return {name.data(), ""};
}

std::string getSystemName() {
    return readSystemName().name;
}

}  // namespace ZR
