#include "formats/NetworkdLease.h"

#include <gtest/gtest.h>

#include "LinuxSupport.h"
#include "formats/TimeSpan.h"

namespace ZR::Live {
namespace {

TEST(NetworkdLease, CapturedByVersion252) {
    EXPECT_EQ(parseNetworkdLease(sample("networkd/run-systemd-netif-leases-2.txt")),
              (NetworkdLease{.address = "198.51.100.110"_ip,
                             .server = "198.51.100.1"_ip,
                             .lifetime = 600,
                             .options = {1, 3, 54, 28, 51, 6, 42, 15, 12},
                             .clientIdentifier = "fffea6fdf300020000ab1162026949ec04e8a7"}));
}

TEST(NetworkdLease, CapturedInfinite) {
    for (const char* file : {"networkd/run-systemd-netif-leases-3.infinite.txt",
                             "networkd-257/run-systemd-netif-leases-2.infinite.txt"}) {
        const NetworkdLease lease = parseNetworkdLease(sample(file));
        EXPECT_TRUE(lease.address) << file;
        EXPECT_EQ(lease.server, "198.51.100.1"_ip) << file;
        EXPECT_EQ(lease.lifetime, infiniteTime) << file;
        EXPECT_EQ(lease.damage, "") << file;
    }
}

TEST(NetworkdLease, CapturedByVersion257) {
    EXPECT_EQ(parseNetworkdLease(sample("networkd-257/run-systemd-netif-leases-2.txt")),
              (NetworkdLease{.address = "198.51.100.111"_ip,
                             .server = "198.51.100.1"_ip,
                             .lifetime = 600,
                             .options = {1, 3, 54, 28, 51, 6, 42, 15, 12},
                             .clientIdentifier = "ff925a88c400020000ab116c5df15fb1efe9f3"}));
}

TEST(NetworkdLease, WhatIsNotAnAddressOrTimeIsLeftOutAndTheFirstIsTold) {
    const NetworkdLease lease =
        parseNetworkdLease("\nADDRESS=host\nSERVER_ADDRESS=1.2.3\nT1=soon\nLIFETIME=\n");
    EXPECT_FALSE(lease.address || lease.server || lease.lifetime);
    EXPECT_EQ(lease.damage, "line 2: ADDRESS is not an IPv4 address");
    EXPECT_EQ(parseNetworkdLease("ADDRESS=192.0.2.7\nscrap\n").damage,
              "line 2: not of the form KEY=value");
    EXPECT_EQ(parseNetworkdLease("SERVER_ADDRESS=x\n").damage,
              "line 1: SERVER_ADDRESS is not an IPv4 address");
}

}  // namespace
}  // namespace ZR::Live
