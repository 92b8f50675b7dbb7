// The library as an object manager has it: opened, asked, cleaned up and closed,
// again and again.

#include <cmpift.h>
#include <dlfcn.h>
#include <gtest/gtest.h>

#include "cimom/Instance.h"
#include "kit/Host.h"
#include "kit/OpenDescriptors.h"
#include "kit/Tree.h"

namespace {

using ZR::Testing::openDescriptors;

class UnloadTest : public test::TreeTest {};

TEST_F(UnloadTest, AThousandLoadsLoseNoDescriptor) {
    setTree({test::host({test::dhcpInterface("eth0")})});
    test::Host host;
    const char* const library = ZR_BINARY_DIR "/lib/cmpi/libDHCPClientProvider.so";
    const std::ptrdiff_t before = openDescriptors();
    for (int load = 0; load < 1000; ++load) {
        void* handle = ::dlopen(library, RTLD_NOW | RTLD_LOCAL);
        ASSERT_NE(handle, nullptr) << ::dlerror();
        using Factory = CMPIInstanceMI* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
        const auto create =
            reinterpret_cast<Factory>(::dlsym(handle, "DHCPClientProvider_Create_InstanceMI"));
        ASSERT_NE(create, nullptr);
        CMPIStatus status{CMPI_RC_OK, nullptr};
        CMPIInstanceMI* mi = create(host.broker(), nullptr, &status);
        // Watching the machine's files and giving that up again costs the kernel
        // milliseconds; a request now and then is enough to lose something.
        if (load % 50 == 0) {
            const test::Host::Response response =
                host.request(test::Host::Kind::paths, test::pathOf("QVXZR_DHCPProtocolEndpoint"),
                             [mi](auto* context, auto* result, auto* path) {
                                 return mi->ft->enumerateInstanceNames(mi, context, result, path);
                             });
            ASSERT_EQ(response.paths.size(), 1U);
        }
        EXPECT_EQ(mi->ft->cleanup(mi, nullptr, 0).rc, CMPI_RC_OK);
        ASSERT_EQ(::dlclose(handle), 0);
    }
    EXPECT_EQ(openDescriptors(), before);
    EXPECT_EQ(::dlopen(library, RTLD_NOW | RTLD_NOLOAD), nullptr) << "the library is still loaded";
}

}  // namespace
