#include "clients/DhcpcdSettings.h"

#include <gtest/gtest.h>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

DhcpcdSettings of(std::string_view text) {
    DhcpcdSettings settings;
    applyDhcpcdConf(text, "eth1"_name, settings);
    return settings;
}

TEST(DhcpcdConf, WithoutASettingBothProtocolsAreUsed) {
    EXPECT_EQ(of(""), DhcpcdSettings{});
    EXPECT_EQ(of("# nodhcp\n; nodhcp\nhostname\n\n   \noption domain_name_servers\n"),
              DhcpcdSettings{});
    EXPECT_TRUE(of("").asks4());
    EXPECT_TRUE(of("").asks6());
}

TEST(DhcpcdConf, SettingsOfAllLinksStandBeforeThoseOfOne) {
    EXPECT_FALSE(of("nodhcp\ninterface eth2\n").asks4());
    EXPECT_TRUE(of("nodhcp\ninterface eth1\ndhcp\n").asks4());
    EXPECT_TRUE(of("interface eth2\nnodhcp\n").asks4());
    EXPECT_FALSE(of("interface eth2\nhostname\ninterface eth1\n  nodhcp  \n").asks4());
    // It knows no patterns here.
    EXPECT_TRUE(of("interface eth*\nnodhcp\n").asks4());
}

TEST(DhcpcdConf, WhatHoldsForANetworkOrAProfileIsLeftOut) {
    EXPECT_TRUE(of("ssid office\nstatic ip_address=192.0.2.7/24\n").asks4());
    EXPECT_TRUE(of("profile rescue\nstatic ip_address=192.0.2.7/24\n").asks4());
}

TEST(DhcpcdConf, AnAddressThatItIsToldEndsTheAsking) {
    const DhcpcdSettings found = of("static ip_address=192.0.2.7/24\n");
    EXPECT_FALSE(found.asks4());
    EXPECT_TRUE(found.asks6());
    EXPECT_EQ(found.address, "192.0.2.7"_ip);
    EXPECT_TRUE(of("static routers=192.0.2.1\n").asks4());
}

TEST(DhcpcdConf, WithAnAddressToInformOfItAsksForTheRest) {
    const DhcpcdSettings found = of("inform 192.0.2.7/24\n");
    EXPECT_TRUE(found.asks4());
    EXPECT_TRUE(found.inform);
    EXPECT_EQ(found.address, "192.0.2.7"_ip);
    EXPECT_EQ(of("inform\n").address, std::nullopt);
    EXPECT_FALSE(of("inform\nstatic ip_address=192.0.2.7/24\n").asks4());
}

TEST(DhcpcdConf, ProtocolsCanBeLeftOut) {
    EXPECT_FALSE(of("noipv4\n").asks4());
    EXPECT_FALSE(of("noipv6\n").asks6());
    EXPECT_FALSE(of("ipv4only\n").asks6());
    EXPECT_FALSE(of("ipv6only\n").asks4());
    EXPECT_TRUE(of("ipv6only\n").asks6());
    EXPECT_FALSE(of("nodhcp6\n").asks6());
    EXPECT_TRUE(of("nodhcp6\n").asks4());
}

TEST(DhcpcdConf, LinksAreNamedByPatterns) {
    const auto admits = [](std::string_view text) { return of(text).admits("eth1"_name); };
    EXPECT_TRUE(admits(""));
    EXPECT_FALSE(admits("denyinterfaces wlan0\tet?1\n"));
    EXPECT_FALSE(admits("allowinterfaces wlan*\n"));
    EXPECT_TRUE(admits("allowinterfaces wlan*\nallowinterfaces eth1\n"));
    EXPECT_FALSE(admits("allowinterfaces eth1\ndenyinterfaces eth[0-9]\n"));
}

}  // namespace
}  // namespace ZR::Live
