#include "HostNameFake.h"

#include <cerrno>
#include <cstddef>

#include "zrclient/InstrumentationService.h"

namespace {

test::HostName behaviour = test::HostName::real;

}  // namespace

// The linker's --wrap names these.
// NOLINTBEGIN(bugprone-reserved-identifier)
extern "C" int __real_gethostname(char* name, std::size_t size);
extern "C" int __wrap_gethostname(char* name, std::size_t size);

int __wrap_gethostname(char* name, std::size_t size) {
    if (behaviour == test::HostName::fails) {
        errno = EFAULT;
        return -1;
    }
    if (behaviour == test::HostName::isEmpty && size > 0) {
        *name = '\0';
        return 0;
    }
    return __real_gethostname(name, size);
}
// NOLINTEND(bugprone-reserved-identifier)

namespace test {

FakeHostName::FakeHostName(HostName fake) {
    static_cast<void>(ZR::InstrumentationService::process().current());
    behaviour = fake;
}
FakeHostName::~FakeHostName() {
    behaviour = HostName::real;
}

}  // namespace test
