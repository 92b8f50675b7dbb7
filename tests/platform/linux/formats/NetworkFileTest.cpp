#include "formats/NetworkFile.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;

NetworkFile networkFile(std::string_view text) {
    NetworkFile settings;
    applyNetworkFile(text, settings);
    return settings;
}

TEST(NetworkFile, CapturedFiles) {
    EXPECT_EQ(networkFile(sample("networkd/10-eth1.network")), (NetworkFile{.dhcp4 = true,
                                                                            .dhcp6 = true,
                                                                            .linkLocal4 = true,
                                                                            .addresses = {},
                                                                            .matchName = "eth1"}));
    EXPECT_EQ(networkFile(sample("networkd-257/10-eth1.network")),
              (NetworkFile{.dhcp4 = true,
                           .dhcp6 = true,
                           .linkLocal4 = false,
                           .addresses = {},
                           .matchName = "eth1"}));
}

TEST(NetworkFile, AllSpellingsOfDhcp) {
    const auto dhcp = [](const std::string& value) {
        const NetworkFile settings = networkFile("[Network]\nDHCP=" + value + "\n");
        return std::pair{settings.dhcp4, settings.dhcp6};
    };
    for (const char* value : {"yes", "true", "1", "on", "Yes", "both"}) {
        EXPECT_EQ(dhcp(value), std::pair(true, true)) << value;
    }
    for (const char* value : {"no", "false", "0", "off", "none"}) {
        EXPECT_EQ(dhcp(value), std::pair(false, false)) << value;
    }
    EXPECT_EQ(dhcp("ipv4"), std::pair(true, false));
    EXPECT_EQ(dhcp("v4"), std::pair(true, false));
    EXPECT_EQ(dhcp("ipv6"), std::pair(false, true));
    EXPECT_EQ(dhcp("v6"), std::pair(false, true));
}

TEST(NetworkFile, AnUnknownValueChangesNothing) {
    EXPECT_TRUE(networkFile("[Network]\nDHCP=yes\nDHCP=maybe\n").dhcp4);
    EXPECT_TRUE(networkFile("[Network]\nDHCP=yes\nDHCP=\n").dhcp4);
}

TEST(NetworkFile, OnlyItsOwnSectionCounts) {
    EXPECT_EQ(networkFile("DHCP=yes\n[Match]\nDHCP=yes\n[DHCPv4]\nDHCP=yes\nAddress=192.0.2.1\n"),
              NetworkFile{});
}

TEST(NetworkFile, CommentsAndBlanksDoNotCount) {
    EXPECT_EQ(networkFile("\r\n[Network]\r\n # DHCP=no\n; DHCP=no\n  DHCP = ipv4 \r\n"),
              (NetworkFile{.dhcp4 = true, .addresses = {}}));
}

TEST(NetworkFile, IPv4AddressesOfBothSections) {
    EXPECT_THAT(networkFile("[Network]\nAddress=192.0.2.1/24\nAddress=2001:db8::1/64\n"
                            "[Address]\nAddress=192.0.2.2/24\n")
                    .addresses,
                ElementsAre("192.0.2.1"_ip, "192.0.2.2"_ip));
}

TEST(NetworkFile, AnEmptyAddressForgetsThoseBefore) {
    EXPECT_THAT(
        networkFile("[Network]\nAddress=192.0.2.1/24\nAddress=\nAddress=192.0.2.3\n").addresses,
        ElementsAre("192.0.2.3"_ip));
}

}  // namespace
}  // namespace ZR::Live
