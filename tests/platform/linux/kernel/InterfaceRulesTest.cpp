#include "kernel/InterfaceRules.h"

#include <gtest/gtest.h>
#include <linux/if.h>
#include <linux/if_arp.h>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

Link linkOf(const char* kind, const char* slaveKind = "") {
    return {.ifindex = 2,
            .name = "l"_name,
            .arphrdType = ARPHRD_ETHER,
            .kind = kind,
            .slaveKind = slaveKind,
            .master = std::string_view{slaveKind}.empty() ? 0U : 9U,
            .carrier = {}};
}

bool isActiveWith(std::uint32_t flags, std::uint8_t operstate) {
    Link link = linkOf("");
    link.flags = flags;
    link.operstate = operstate;
    return isActive(link);
}

TEST(InterfaceRules, LoopbackIsNotAnInterface) {
    Link link = linkOf("");
    link.flags = IFF_LOOPBACK;
    EXPECT_FALSE(isNetworkInterface(link, true));
    link.flags = 0;
    link.arphrdType = ARPHRD_LOOPBACK;
    EXPECT_FALSE(isNetworkInterface(link, true));
}

TEST(InterfaceRules, DevicesOnABusAreAlwaysInterfaces) {
    for (const char* slaveKind : {"", "bond", "bridge"}) {
        Link link = linkOf("", slaveKind);
        link.hasParentDevice = true;
        EXPECT_TRUE(isNetworkInterface(link, false)) << slaveKind;
    }
    Link tunnel = linkOf("wireguard");
    tunnel.hasParentDevice = true;
    EXPECT_TRUE(isNetworkInterface(tunnel, false));
}

TEST(InterfaceRules, LinksOfUnknownDriversAreInterfaces) {
    EXPECT_TRUE(isNetworkInterface(linkOf(""), false));
}

TEST(InterfaceRules, VirtualLinksThatHoldAddressesAreInterfaces) {
    for (const char* kind : {"bridge", "bond", "team", "vlan", "macvlan", "ipvlan", "ipoib"}) {
        EXPECT_TRUE(isNetworkInterface(linkOf(kind), false)) << kind;
    }
}

TEST(InterfaceRules, TunnelsTestDevicesAndUnknownKindsAreNone) {
    for (const char* kind :
         {"vrf", "tun", "wireguard", "ppp", "gre", "gretap", "sit", "ip6tnl", "vti", "xfrm",
          "vxlan", "geneve", "dummy", "ifb", "nlmon", "netdevsim", "can", "something-new"}) {
        EXPECT_FALSE(isNetworkInterface(linkOf(kind), true)) << kind;
    }
}

TEST(InterfaceRules, AnEndOfAVirtualCableIsAnInterfaceWhereItHasAnAddress) {
    EXPECT_TRUE(isNetworkInterface(linkOf("veth"), true));
    EXPECT_FALSE(isNetworkInterface(linkOf("veth"), false));
    EXPECT_FALSE(isNetworkInterface(linkOf("veth", "bridge"), true));
    EXPECT_FALSE(isNetworkInterface(linkOf("veth", "openvswitch"), true));
    EXPECT_TRUE(isNetworkInterface(linkOf("veth", "vrf"), true));
}

/// Cables with these indexes, which lead to these namespaces.
Link cable(std::uint32_t ifindex, std::optional<std::int32_t> farNamespace,
           const char* slaveKind = "") {
    Link link = linkOf("veth", slaveKind);
    link.ifindex = ifindex;
    link.farNamespace = farNamespace;
    return link;
}

TEST(WayOut, OfAContainerIsByTheCableThatHasAnAddressAndThoseBesideIt) {
    const Link first = cable(2, 7);
    const Link addressed = cable(3, 0);
    const Link beside = cable(4, 0);
    WayOut way;
    way.add(first, false);
    way.add(addressed, true);
    way.add(beside, false);
    way.add(cable(5, 7), true);
    EXPECT_FALSE(way.isBy(first)) << "leads to a container within the container";
    EXPECT_TRUE(way.isBy(addressed));
    EXPECT_TRUE(way.isBy(beside));
}

TEST(WayOut, OfAContainerWithoutAnAddressIsByTheFirstCable) {
    WayOut way;
    way.add(cable(2, 0), false);
    way.add(cable(3, 7), false);
    EXPECT_TRUE(way.isBy(cable(2, 0)));
    EXPECT_FALSE(way.isBy(cable(3, 7)));
}

TEST(WayOut, OfAMachineWithADeviceIsNotByACable) {
    WayOut way;
    way.add(cable(2, 0), true);
    way.add(linkOf(""), false);
    EXPECT_FALSE(way.isBy(cable(2, 0)));
}

TEST(WayOut, IsNotByACableWithinTheNamespaceOrAPort) {
    Link loopback = linkOf("");
    loopback.flags = IFF_LOOPBACK;
    WayOut way;
    way.add(loopback, true);
    way.add(cable(2, std::nullopt), true);
    way.add(cable(3, 5, "bridge"), true);
    EXPECT_FALSE(way.isBy(cable(2, std::nullopt)));
    EXPECT_FALSE(way.isBy(cable(3, 5, "bridge")));
    way.add(linkOf("bridge"), true);
    way.add(cable(4, 5), false);
    EXPECT_TRUE(way.isBy(cable(4, 5)));
    EXPECT_FALSE(way.isBy(cable(3, 5, "openvswitch")));
}

TEST(InterfaceRules, PortsOfLinksThatOwnTheirAddressesAreEnslaved) {
    for (const char* master : {"bond", "bridge", "team", "openvswitch"}) {
        EXPECT_TRUE(isEnslaved(linkOf("", master))) << master;
    }
    EXPECT_FALSE(isEnslaved(linkOf("", "vrf")));
    EXPECT_FALSE(isEnslaved(linkOf("")));
}

TEST(InterfaceRules, ActiveIsUpWithAnOperationalStateOfUp) {
    constexpr std::uint32_t up = IFF_UP;
    constexpr std::uint32_t lower = IFF_LOWER_UP;
    EXPECT_TRUE(isActiveWith(up | lower, IF_OPER_UP));
    EXPECT_FALSE(isActiveWith(lower, IF_OPER_UP));
    EXPECT_FALSE(isActiveWith(up, IF_OPER_DOWN));
    EXPECT_FALSE(isActiveWith(up, IF_OPER_LOWERLAYERDOWN));
    EXPECT_FALSE(isActiveWith(up | lower, IF_OPER_DORMANT));
    EXPECT_FALSE(isActiveWith(0, IF_OPER_DOWN));
}

TEST(InterfaceRules, DriversThatReportNoStateAreActiveWithTheirLowerLayerUp) {
    EXPECT_TRUE(isActiveWith(std::uint32_t{IFF_UP} | IFF_LOWER_UP, IF_OPER_UNKNOWN));
    EXPECT_FALSE(isActiveWith(IFF_UP, IF_OPER_UNKNOWN));
    EXPECT_FALSE(isActiveWith(IFF_LOWER_UP, IF_OPER_UNKNOWN));
    Link carrier = linkOf("");
    carrier.flags = IFF_UP;
    carrier.carrier = true;
    EXPECT_TRUE(isActive(carrier));
}

TEST(InterfaceRules, DescriptionsAreForPeople) {
    EXPECT_EQ(describe(linkOf("")), "Ethernet interface");
    EXPECT_EQ(describe(linkOf("bridge")), "Bridge");
    EXPECT_EQ(describe(linkOf("bond")), "Bond");
    EXPECT_EQ(describe(linkOf("vlan")), "VLAN");
    EXPECT_EQ(describe(linkOf("veth")), "Virtual Ethernet interface");
    Link wireless = linkOf("");
    wireless.wireless = true;
    EXPECT_EQ(describe(wireless), "Wireless interface");
    Link other = linkOf("");
    other.arphrdType = ARPHRD_INFINIBAND;
    EXPECT_EQ(describe(other), "InfiniBand interface");
    other.arphrdType = ARPHRD_NONE;
    EXPECT_EQ(describe(other), "Network interface");
}

}  // namespace
}  // namespace ZR::Live
