#include "kit/HostNameFake.h"

#include <cerrno>
#include <cstddef>

namespace {

bool fails = false;

}  // namespace

// The linker's --wrap names these.
// NOLINTBEGIN(bugprone-reserved-identifier)
extern "C" int __real_gethostname(char* name, std::size_t size);
extern "C" int __wrap_gethostname(char* name, std::size_t size);

int __wrap_gethostname(char* name, std::size_t size) {
    if (fails) {
        errno = EFAULT;
        return -1;
    }
    return __real_gethostname(name, size);
}
// NOLINTEND(bugprone-reserved-identifier)

namespace ZR::Testing {

HostNameFails::HostNameFails() {
    fails = true;
}
HostNameFails::~HostNameFails() {
    fails = false;
}

}  // namespace ZR::Testing
