#include "zrclient/Snapshot.h"

#include <gtest/gtest.h>
#include <malloc.h>

#include <string>
#include <vector>

namespace ZR {
namespace {

using Index = Snapshot::Index;
using NodeLexicon::NodeType;
using NodeLexicon::Properties;

Index named(SnapshotBuilder& builder, Index parent, const std::string& name) {
    const Index index = builder.add(parent, "NetworkInterface", "an interface");
    builder.property(Properties::Name, name);
    return index;
}

/// Computers in a row, each with ten interfaces below a network; N interfaces.
std::shared_ptr<const Snapshot> machines(unsigned interfaces) {
    SnapshotBuilder builder;
    for (unsigned first = 0; first < interfaces; first += 10) {
        const Index computer = builder.add(Snapshot::none, "ComputerSystem", "Computer");
        builder.property(Properties::Name, "host" + std::to_string(first));
        const Index network = builder.add(computer, "Network", "Network");
        for (unsigned number = 0; number < 10; ++number) {
            named(builder, network, "eth" + std::to_string(number));
        }
    }
    return builder.build();
}

TEST(Snapshot, AnEmptyOneHasNothing) {
    const auto snapshot = SnapshotBuilder().build();
    EXPECT_TRUE(snapshot->nodes().empty());
    EXPECT_EQ(snapshot->first(NodeType::ComputerSystem), Snapshot::none);
    EXPECT_EQ(snapshot->first(NodeType::NetworkInterface), Snapshot::none);
    EXPECT_EQ(snapshot->resolve(""), Snapshot::none);
    EXPECT_EQ(snapshot->resolve("/"), Snapshot::none);
    EXPECT_EQ(snapshot->path(Snapshot::none), "");
}

TEST(Snapshot, ChainsTheNodesOfATypeInDocumentOrder) {
    SnapshotBuilder builder;
    const Index first = builder.add(Snapshot::none, "ComputerSystem", "one");
    const Index below = builder.add(first, "NetworkInterface", "eth");
    const Index deeper = builder.add(below, "NetworkInterface", "vlan");
    const Index second = builder.add(Snapshot::none, "ComputerSystem", "two");
    const Index last = builder.add(second, "NetworkInterface", "eth");
    const auto snapshot = builder.build();
    EXPECT_EQ(snapshot->first(NodeType::ComputerSystem), first);
    EXPECT_EQ(snapshot->node(first).nextOfType, second);
    EXPECT_EQ(snapshot->node(second).nextOfType, Snapshot::none);
    EXPECT_EQ(snapshot->first(NodeType::NetworkInterface), below);
    EXPECT_EQ(snapshot->node(below).nextOfType, deeper);
    EXPECT_EQ(snapshot->node(deeper).nextOfType, last);
    EXPECT_EQ(snapshot->node(last).nextOfType, Snapshot::none);
}

TEST(Snapshot, ANodeOfAForeignTypeIsNotSelected) {
    SnapshotBuilder builder;
    builder.add(Snapshot::none, "networkinterface", "the lexicon minds the case");
    builder.add(Snapshot::none, "Fan", "");
    const auto snapshot = builder.build();
    EXPECT_EQ(snapshot->first(NodeType::NetworkInterface), Snapshot::none);
    EXPECT_EQ(snapshot->first(static_cast<NodeType>(1)), Snapshot::none);
    EXPECT_EQ(snapshot->node(0).nextOfType, Snapshot::none);
    EXPECT_EQ(snapshot->resolve("/networkinterface"), Snapshot::none);
}

TEST(Snapshot, ANodeIsKeyedByItsNameElseItsDescription) {
    SnapshotBuilder builder;
    const Index computer = builder.add(Snapshot::none, "ComputerSystem", "Computer");
    builder.property(Properties::Name, std::string("host"));
    const Index network = builder.add(computer, "Network", "The network");
    const Index odd = builder.add(network, "NetworkInterface", "odd");
    builder.property(Properties::Name, std::uint64_t{7});
    const auto snapshot = builder.build();
    EXPECT_EQ(snapshot->path(computer), "/host");
    EXPECT_EQ(snapshot->path(network), "/host/The network");
    EXPECT_EQ(snapshot->path(odd), "/host/The network/odd");
}

TEST(Snapshot, NamesakesAmongSiblingsAreNumbered) {
    SnapshotBuilder builder;
    const Index root = builder.add(Snapshot::none, "Network", "net");
    const Index first = named(builder, root, "eth");
    const Index second = named(builder, root, "eth");
    const Index third = named(builder, root, "eth");
    const Index other = builder.add(Snapshot::none, "Network", "net");
    const Index apart = named(builder, other, "eth");
    const auto snapshot = builder.build();
    EXPECT_EQ(snapshot->path(first), "/net/eth");
    EXPECT_EQ(snapshot->path(second), "/net/eth#2");
    EXPECT_EQ(snapshot->path(third), "/net/eth#3");
    EXPECT_EQ(snapshot->path(other), "/net#2");
    EXPECT_EQ(snapshot->path(apart), "/net#2/eth");
}

TEST(Snapshot, ANumberedKeyNeverHitsASiblingReallyCalledSo) {
    SnapshotBuilder builder;
    const Index a = named(builder, Snapshot::none, "eth");
    const Index b = named(builder, Snapshot::none, "eth#2");
    const Index c = named(builder, Snapshot::none, "eth");
    const Index d = named(builder, Snapshot::none, "eth#2");
    const auto snapshot = builder.build();
    for (const Index index : {a, b, c, d}) {
        EXPECT_EQ(snapshot->resolve(snapshot->path(index)), index) << snapshot->path(index);
    }
    EXPECT_EQ(snapshot->path(c), "/eth#3");
    EXPECT_EQ(snapshot->path(d), "/eth#2#2");
}

TEST(Snapshot, ASlashInAKeyDoesNotSplitAPath) {
    SnapshotBuilder builder;
    const Index plain = named(builder, Snapshot::none, "a");
    const Index below = named(builder, plain, "b");
    const Index slashed = named(builder, Snapshot::none, "a/b");
    const Index spelled = named(builder, Snapshot::none, "a%2Fb");
    const Index bare = named(builder, Snapshot::none, "/");
    const auto snapshot = builder.build();
    EXPECT_EQ(snapshot->path(below), "/a/b");
    EXPECT_EQ(snapshot->path(slashed), "/a%2Fb");
    EXPECT_EQ(snapshot->path(spelled), "/a%252Fb");
    EXPECT_EQ(snapshot->path(bare), "/%2F");
    for (const Index index : {plain, below, slashed, spelled, bare}) {
        EXPECT_EQ(snapshot->resolve(snapshot->path(index)), index);
    }
}

TEST(Snapshot, EmptyKeysAreKeysToo) {
    SnapshotBuilder builder;
    const Index root = builder.add(Snapshot::none, "Network", "");
    const Index below = builder.add(root, "Network", "");
    const Index second = builder.add(root, "Network", "");
    const auto snapshot = builder.build();
    EXPECT_EQ(snapshot->path(root), "/");
    EXPECT_EQ(snapshot->path(below), "//");
    EXPECT_EQ(snapshot->path(second), "//#2");
    EXPECT_EQ(snapshot->resolve("/"), root);
    EXPECT_EQ(snapshot->resolve("//"), below);
    EXPECT_EQ(snapshot->resolve("//#2"), second);
    EXPECT_EQ(snapshot->resolve(""), Snapshot::none);
}

TEST(Snapshot, ResolvesNoPathButItsOwn) {
    const auto snapshot = machines(10);
    EXPECT_NE(snapshot->resolve("/host0/Network/eth3"), Snapshot::none);
    for (const char* path :
         {"", "/", "host0", "host0/Network", "/host", "/host0/", "//host0", "/Network",
          "/host0/Network/eth", "/host0/Network/eth33", "/host0/Network/eth3/", "/eth3",
          "/host0/etwork/eth3", "/host0/Network/ETH3", "/host1/Network/eth3"}) {
        EXPECT_EQ(snapshot->resolve(path), Snapshot::none) << path;
    }
    EXPECT_EQ(snapshot->resolve(std::string("/host0\0", 7)), Snapshot::none);
}

TEST(Snapshot, ResolvesThePathOfEveryNode) {
    const auto snapshot = machines(100);
    for (Index index = 0; index < snapshot->nodes().size(); ++index) {
        const std::string path = snapshot->path(index);
        EXPECT_EQ(snapshot->resolve(path), index) << path;
    }
}

TEST(Snapshot, TenThousandNamesakesGetKeysOfTheirOwn) {
    SnapshotBuilder builder;
    for (unsigned number = 0; number < 10'000; ++number) {
        named(builder, Snapshot::none, "eth");
    }
    const auto snapshot = builder.build();
    EXPECT_EQ(snapshot->path(9'999), "/eth#10000");
    EXPECT_EQ(snapshot->resolve("/eth#10000"), 9'999U);
    EXPECT_EQ(snapshot->resolve("/eth#5000"), 4'999U);
}

TEST(Snapshot, FindsThePropertiesOfTheNodeAlone) {
    SnapshotBuilder builder;
    const Index first = named(builder, Snapshot::none, "eth0");
    builder.property(Properties::DHCPEnabled, true, true);
    const Index second = named(builder, Snapshot::none, "eth1");
    const auto snapshot = builder.build();
    ASSERT_NE(snapshot->find(first, Properties::DHCPEnabled), nullptr);
    EXPECT_EQ(*snapshot->find(first, Properties::DHCPEnabled),
              (SnapshotProperty{Properties::DHCPEnabled, true, true}));
    EXPECT_EQ(snapshot->find(second, Properties::DHCPEnabled), nullptr);
    EXPECT_EQ(snapshot->properties(first).size(), 2U);
    EXPECT_EQ(snapshot->properties(second).size(), 1U);
}

TEST(SnapshotBuilder, ALaterValueOfAPropertyReplacesTheEarlier) {
    SnapshotBuilder builder;
    const Index index = named(builder, Snapshot::none, "old");
    builder.property(Properties::InterfaceState, std::uint64_t{1});
    builder.property(Properties::Name, std::string("new"), true);
    const auto snapshot = builder.build();
    EXPECT_EQ(snapshot->path(index), "/new");
    ASSERT_EQ(snapshot->properties(index).size(), 2U);
    EXPECT_EQ(snapshot->properties(index)[0],
              (SnapshotProperty{Properties::Name, true, std::string("new")}));
}

TEST(SnapshotBuilder, IsEmptyAfterBuilding) {
    SnapshotBuilder builder;
    named(builder, Snapshot::none, "eth0");
    EXPECT_EQ(builder.build()->nodes().size(), 1U);
    builder.property(Properties::Name, std::string("of no node"));
    EXPECT_TRUE(builder.build()->nodes().empty());
    EXPECT_EQ(named(builder, Snapshot::none, "eth1"), 0U);
    EXPECT_EQ(builder.build()->path(0), "/eth1");
}

TEST(Snapshot, TenThousandInterfacesStayUnderTenMegabytes) {
#ifdef ZR_SANITIZERS
    GTEST_SKIP() << "a sanitizer's allocator does not tell what is in use";
#else
    const auto inUse = [] {
        const auto info = ::mallinfo2();
        return info.uordblks + info.hblkhd;
    };
    const std::size_t before = inUse();
    SnapshotBuilder builder;
    const Index computer = builder.add(Snapshot::none, "ComputerSystem", "Computer");
    const Index network = builder.add(computer, "Network", "Network");
    for (unsigned number = 0; number < 10'000; ++number) {
        builder.add(network, "NetworkInterface", "Ethernet interface");
        builder.property(Properties::Name, "enp" + std::to_string(number) + "s0", true);
        builder.property(Properties::NameMaxLength, std::uint64_t{15}, true);
        builder.property(Properties::DHCPEnabled, true);
        builder.property(Properties::AddressSource, std::uint64_t{1});
        builder.property(Properties::InterfaceState, std::uint64_t{1});
        builder.property(Properties::IPv4Address, std::string("192.168.100.117"));
        builder.property(Properties::DHCPServerAddresses,
                         std::vector<std::string>{"192.168.100.1", "2001:db8:1234:5678::1"});
    }
    const auto snapshot = builder.build();
    const std::size_t after = inUse();
    ASSERT_EQ(snapshot->nodes().size(), 10'002U);
    EXPECT_LT(after - before, 9'000'000U);
    RecordProperty("bytes", std::to_string(after - before));
#endif
}

TEST(Snapshot, APropertyMaySayWhereItCameFrom) {
    SnapshotBuilder builder;
    const Index node = builder.add(Snapshot::none, "ComputerSystem", "Computer");
    builder.property(Properties::Name, std::string("host"));
    builder.origin("a file");
    builder.property(Properties::NameMaxLength, std::uint64_t{64});
    builder.property(Properties::DHCPEnabled, true);
    builder.origin("another file");
    builder.property(Properties::NameMaxLength, std::uint64_t{65});
    const auto snapshot = builder.build();
    EXPECT_EQ(snapshot->origin(node, Properties::Name), "");
    EXPECT_EQ(snapshot->origin(node, Properties::NameMaxLength), "another file");
    EXPECT_EQ(snapshot->origin(node, Properties::DHCPEnabled), "a file");
    EXPECT_EQ(snapshot->origin(node, Properties::AddressSource), "");
    // The builder begins anew.
    builder.add(Snapshot::none, "ComputerSystem", "Computer");
    builder.property(Properties::Name, std::string("host"));
    EXPECT_EQ(builder.build()->origin(0, Properties::Name), "");
}

TEST(Snapshot, WhatCouldNotBeReadIsARemark) {
    SnapshotBuilder builder;
    builder.diagnostic(ZR::Diagnostic{"cannot read this"});
    builder.diagnostic(ZR::Diagnostic{"nor that", ZR::Diagnostic::Kind::Denied});
    const auto snapshot = builder.build();
    ASSERT_EQ(snapshot->diagnostics().size(), 2U);
    EXPECT_EQ(snapshot->diagnostics()[1],
              (ZR::Diagnostic{"nor that", ZR::Diagnostic::Kind::Denied}));
    EXPECT_TRUE(builder.build()->diagnostics().empty());
}

}  // namespace
}  // namespace ZR
