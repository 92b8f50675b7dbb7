#include "configuration/KernelBoot.h"

#include <gtest/gtest.h>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

TEST(KernelBoot, TheProtocolStandsInTheFirstLine) {
    EXPECT_EQ(parseKernelBoot("#DHCP\n"),
              (BootResponse{.bootp = false, .server = {}, .origin = ""}));
    EXPECT_EQ(parseKernelBoot("#PROTO: BOOTP\ndomain example\nnameserver 192.0.2.1\n"
                              "bootserver 192.0.2.99\n"),
              (BootResponse{.bootp = true, .server = "192.0.2.99"_ip, .origin = ""}));
}

TEST(KernelBoot, AKernelThatWasToldItsAddressAskedNoServer) {
    for (const char* text : {"#MANUAL\n", "#MANUAL\nbootserver 192.0.2.99\n", "#PROTO: RARP\n", "",
                             "DHCP\n", "bootserver 192.0.2.99\n#DHCP\n"}) {
        EXPECT_EQ(parseKernelBoot(text), std::nullopt) << text;
    }
}

TEST(KernelBoot, AServerThatIsNotAnAddressIsNone) {
    EXPECT_EQ(parseKernelBoot("#DHCP\nbootserver nobody"),
              (BootResponse{.bootp = false, .server = {}, .origin = ""}));
}

TEST(KernelBoot, OfThisNetworkNamespace) {
    const TemporaryDirectory root;
    EXPECT_EQ(readWith(readKernelBoot, root), ClientFacts{});
    root.write("/proc/thread-self/net/pnp", "#DHCP\nbootserver 192.0.2.99\n");
    const ClientFacts facts = readWith(readKernelBoot, root);
    EXPECT_EQ(facts.boot, (BootResponse{.bootp = false,
                                        .server = "192.0.2.99"_ip,
                                        .origin = root.path("/proc/thread-self/net/pnp")}));
}

}  // namespace
}  // namespace ZR::Live
