#include "configuration/Netplan.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr const char* file = "/run/systemd/network/10-netplan-eth1.network";

std::vector<LinkConfiguration> read(const TemporaryDirectory& root) {
    return readWith(readNetplan, root).configurations;
}

TEST(Netplan, CapturedConfigurationForNetworkd) {
    const TemporaryDirectory root;
    root.write(file, sample("netplan/10-netplan-eth1.network"));
    EXPECT_THAT(read(root), ElementsAre(LinkConfiguration{.client = Client::Netplan,
                                                          .interfaceName = "eth1"_name,
                                                          .dhcp4 = true,
                                                          .dhcp6 = false,
                                                          .staticAddresses = {},
                                                          .origin = root.path(file)}));
}

TEST(Netplan, FilesOfOthersAndPatternsAreLeftToNetworkd) {
    const TemporaryDirectory root;
    EXPECT_THAT(read(root), IsEmpty());
    root.write("/run/systemd/network/10-eth1.network", sample("netplan/10-netplan-eth1.network"));
    root.write("/run/systemd/network/10-netplan-all.network", "[Match]\nName=en*\n");
    root.write("/run/systemd/network/10-netplan-two.network", "[Match]\nName=a b\n");
    root.write("/run/systemd/network/10-netplan-mac.network",
               "[Match]\nMACAddress=52:54:0:0:0:1\n");
    root.write("/run/systemd/network/10-netplan-eth1.link", "[Match]\nName=eth1\n");
    EXPECT_THAT(read(root), IsEmpty());
}

}  // namespace
}  // namespace ZR::Live
