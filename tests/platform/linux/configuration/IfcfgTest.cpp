#include "configuration/Ifcfg.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

TEST(IfcfgFile, KeysThatTellOfAddresses) {
    EXPECT_EQ(parseIfcfg("DEVICE=\"eth1\"\nBOOTPROTO='DHCP'  # as ever\nexport ONBOOT=yes\n"
                         "DHCPV6C=Yes\nHWADDR=52:54:00:00:00:01\n"),
              (IfcfgFile{.device = "eth1",
                         .hardware = "52:54:00:00:00:01",
                         .bootProtocol = "dhcp",
                         .addresses = {},
                         .dhcp6 = true}));
}

TEST(IfcfgFile, AddressesMayBeNumberedOrNamed) {
    EXPECT_THAT(parseIfcfg("IPADDR=192.0.2.1\nIPADDR0='192.0.2.2/24'\nIPADDR_office=192.0.2.3\n"
                           "IPADDRS=192.0.2.9\nIPADDR1=x\n")
                    .addresses,
                ElementsAre("192.0.2.1"_ip, "192.0.2.2"_ip, "192.0.2.3"_ip));
}

TEST(IfcfgNames, WhatEditorsAndPackagesLeaveDoesNotCount) {
    EXPECT_TRUE(isIfcfgName("ifcfg-eth1"));
    EXPECT_TRUE(isIfcfgName("ifcfg-eth1.100"));
    for (const char* name : {"ifcfg-", "ifcfg-eth1.bak", "ifcfg-eth1~", "ifcfg-eth1.rpmsave",
                             "ifcfg-eth1.rpmnew", "ifcfg-eth1.orig", "ifcfg-eth1.old",
                             "ifcfg-eth1.tmp", "ifcfg-eth1.swp", "keys-eth1", "route-eth1"}) {
        EXPECT_FALSE(isIfcfgName(name)) << name;
    }
}

class IfcfgTest : public testing::Test {
  protected:
    static constexpr const char* file = "/etc/sysconfig/network-scripts/ifcfg-office";

    [[nodiscard]] std::vector<LinkConfiguration> read() const {
        return readWith(readIfcfg, root_).configurations;
    }
    [[nodiscard]] LinkConfiguration configuration(std::optional<bool> dhcp4) const {
        return {.client = Client::Ifcfg,
                .interfaceName = "eth1"_name,
                .dhcp4 = dhcp4,
                .dhcp6 = {},
                .staticAddresses = {},
                .origin = root_.path(file)};
    }
    [[nodiscard]] LinkConfiguration withProtocol(const std::string& protocol) const {
        root_.write(file, "DEVICE=eth1\nBOOTPROTO=" + protocol + "\n");
        return read().at(0);
    }

    TemporaryDirectory root_;
};

TEST_F(IfcfgTest, OnAMachineWithoutThemThereIsNothing) {
    EXPECT_THAT(read(), IsEmpty());
}

TEST_F(IfcfgTest, EachProtocolHasItsMeaning) {
    for (const char* dhcp : {"dhcp", "DHCP", "dhcp4", "dhcp+autoip"}) {
        EXPECT_EQ(withProtocol(dhcp), configuration(true)) << dhcp;
    }
    for (const char* none : {"none", "static", "auto6", "6to4"}) {
        EXPECT_EQ(withProtocol(none), configuration(false)) << none;
    }
    LinkConfiguration bootp = configuration(false);
    bootp.bootp4 = true;
    EXPECT_EQ(withProtocol("bootp"), bootp);
    LinkConfiguration linkLocal = configuration(false);
    linkLocal.linkLocal4 = true;
    EXPECT_EQ(withProtocol("autoip"), linkLocal);
    LinkConfiguration shared = configuration(false);
    shared.other4 = true;
    EXPECT_EQ(withProtocol("shared"), shared);
    LinkConfiguration dhcp6 = configuration(false);
    dhcp6.dhcp6 = true;
    EXPECT_EQ(withProtocol("dhcp6"), dhcp6);
    EXPECT_EQ(withProtocol("ibft"), configuration(std::nullopt));
}

TEST_F(IfcfgTest, WithoutAProtocolOnlyAnAddressTells) {
    EXPECT_EQ(withProtocol(""), configuration(std::nullopt));
    root_.write(file, "DEVICE=eth1\nCONFIG_NAME=office\n");
    EXPECT_THAT(read(), ElementsAre(configuration(std::nullopt)));
    root_.write(file, "DEVICE=eth1\nIPADDR=192.0.2.1\n");
    LinkConfiguration fixed = configuration(false);
    fixed.staticAddresses = {"192.0.2.1"_ip};
    EXPECT_THAT(read(), ElementsAre(fixed));
}

TEST_F(IfcfgTest, WithoutADeviceTheNameOfTheFileIsIt) {
    root_.write("/etc/sysconfig/network/ifcfg-eth7", "BOOTPROTO='dhcp'\n");
    ASSERT_EQ(read().size(), 1U);
    EXPECT_EQ(read()[0].interfaceName, "eth7"_name);
}

TEST_F(IfcfgTest, OneThatIsNamedByItsHardwareIsNotGuessed) {
    root_.write(file, "HWADDR=52:54:00:00:00:01\nBOOTPROTO=dhcp\n");
    EXPECT_THAT(read(), IsEmpty());
    root_.write(file, "DEVICE=../eth1\nBOOTPROTO=dhcp\n");
    EXPECT_THAT(read(), IsEmpty());
}

}  // namespace
}  // namespace ZR::Live
