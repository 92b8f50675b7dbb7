#include "kit/HostNameFake.h"

#include <cerrno>
#include <cstddef>

namespace {

ZR::Testing::HostName current = ZR::Testing::HostName::real;

}  // namespace

// The linker's --wrap names these.
// NOLINTBEGIN(bugprone-reserved-identifier)
extern "C" int __real_gethostname(char* name, std::size_t size);
extern "C" int __wrap_gethostname(char* name, std::size_t size);

int __wrap_gethostname(char* name, std::size_t size) {
    if (current == ZR::Testing::HostName::fails) {
        errno = EFAULT;
        return -1;
    }
    if (current == ZR::Testing::HostName::isEmpty && size > 0) {
        *name = '\0';
        return 0;
    }
    return __real_gethostname(name, size);
}
// NOLINTEND(bugprone-reserved-identifier)

namespace ZR::Testing {

FakeHostName::FakeHostName(HostName behaviour) {
    current = behaviour;
}
FakeHostName::~FakeHostName() {
    current = HostName::real;
}

}  // namespace ZR::Testing
