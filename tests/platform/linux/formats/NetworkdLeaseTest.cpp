#include "formats/NetworkdLease.h"

#include <gtest/gtest.h>

#include "LinuxSupport.h"
#include "formats/TimeSpan.h"

namespace ZR::Live {
namespace {

TEST(NetworkdLease, CapturedByVersion252) {
    EXPECT_EQ(parseNetworkdLease(sample("networkd/run-systemd-netif-leases-2.txt")),
              (NetworkdLease{
                  .address = "198.51.100.110"_ip, .server = "198.51.100.1"_ip, .lifetime = 600}));
}

TEST(NetworkdLease, CapturedInfiniteByVersion252) {
    EXPECT_EQ(parseNetworkdLease(sample("networkd/run-systemd-netif-leases-3.infinite.txt")),
              (NetworkdLease{.address = "198.51.100.110"_ip,
                             .server = "198.51.100.1"_ip,
                             .lifetime = infiniteTime}));
}

TEST(NetworkdLease, CapturedByVersion257) {
    EXPECT_EQ(parseNetworkdLease(sample("networkd-257/run-systemd-netif-leases-2.txt")),
              (NetworkdLease{
                  .address = "198.51.100.111"_ip, .server = "198.51.100.1"_ip, .lifetime = 600}));
}

TEST(NetworkdLease, CapturedInfiniteByVersion257) {
    EXPECT_EQ(parseNetworkdLease(sample("networkd-257/run-systemd-netif-leases-2.infinite.txt")),
              (NetworkdLease{.address = "198.51.100.111"_ip,
                             .server = "198.51.100.1"_ip,
                             .lifetime = infiniteTime}));
}

TEST(NetworkdLease, WhatIsNotAnAddressOrTimeIsLeftOut) {
    EXPECT_EQ(parseNetworkdLease("ADDRESS=host\nSERVER_ADDRESS=1.2.3\nT1=soon\nLIFETIME=\n\0x=\n"),
              NetworkdLease{});
}

}  // namespace
}  // namespace ZR::Live
