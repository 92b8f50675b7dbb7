// Each kind of file that says how interfaces are to be configured.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include "LinuxSupport.h"
#include "configuration/ConfigurationFiles.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pair;
using testing::UnorderedElementsAre;

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

IfaceStanza stanza(std::string name, std::string family, std::string method, bool dhcp = false) {
    return {.name = std::move(name),
            .family = std::move(family),
            .method = std::move(method),
            .addresses = {},
            .dhcp = dhcp};
}

TEST(InterfacesFile, Captured) {
    EXPECT_EQ(parseInterfaces(sample("ifupdown/interfaces")),
              (InterfacesFile{
                  .stanzas = {stanza("lo", "inet", "loopback"), stanza("eth1", "inet", "dhcp"),
                              stanza("eth1", "inet6", "auto", true)},
                  .sources = {},
                  .directories = {}}));
}

TEST(InterfacesFile, CommentsContinuationsAndOtherStanzas) {
    const InterfacesFile file = parseInterfaces(
        "# iface eth9 inet dhcp\n"
        "iface eth1 \\\n  inet static\n"
        "\taddress 192.0.2.1/24\n  # address 192.0.2.9\n"
        "  gateway 192.0.2.254\n"
        "allow-hotplug eth2\n"
        "    address 192.0.2.8\n"
        "iface eth2 inet6 static\n    address 2001:db8::1/64\n"
        "source /etc/network/interfaces.d/*\nsource-directory more\nsource\n");
    IfaceStanza first = stanza("eth1", "inet", "static");
    first.addresses = {"192.0.2.1"_ip};
    EXPECT_EQ(file, (InterfacesFile{.stanzas = {first, stanza("eth2", "inet6", "static")},
                                    .sources = {"/etc/network/interfaces.d/*"},
                                    .directories = {"more"}}));
}

TEST(InterfacesFile, AnyTextGivesFacts) {
    EXPECT_EQ(parseInterfaces("iface").stanzas, std::vector{stanza("", "", "")});
    EXPECT_THAT(parseInterfaces("\\").stanzas, IsEmpty());
    EXPECT_THAT(parseInterfaces("address 192.0.2.1\n\n\\\n").stanzas, IsEmpty());
}

TEST(Ifstate, Captured) {
    EXPECT_THAT(parseIfstate(sample("ifupdown/run-network-ifstate.txt")),
                ElementsAre(Pair("eth1"_name, "eth1")));
    EXPECT_THAT(parseIfstate("eth1=home\nnothing\n=x\na b=c\nlo=lo"),
                ElementsAre(Pair("eth1"_name, "home"), Pair("lo"_name, "lo")));
}

class IfupdownTest : public testing::Test {
  protected:
    [[nodiscard]] ClientFacts read() const { return readWith(readIfupdown, root_); }
    void write(const std::string& text) const { root_.write("/etc/network/interfaces", text); }
    [[nodiscard]] LinkConfiguration configuration(const std::string& name,
                                                  std::optional<bool> dhcp4,
                                                  std::optional<bool> dhcp6 = {}) const {
        return {.client = Client::Ifupdown,
                .interfaceName = interfaceName(name),
                .dhcp4 = dhcp4,
                .dhcp6 = dhcp6,
                .staticAddresses = {},
                .origin = root_.path("/etc/network/interfaces")};
    }

    TemporaryDirectory root_;
};

TEST_F(IfupdownTest, OnAMachineWithoutItThereIsNothing) {
    EXPECT_EQ(read(), ClientFacts{});
}

TEST_F(IfupdownTest, StanzasOfOneInterfaceAddUp) {
    write(sample("ifupdown/interfaces"));
    EXPECT_THAT(read().configurations, ElementsAre(configuration("eth1", true, true)));
}

TEST_F(IfupdownTest, EachMethodHasItsMeaning) {
    write(
        "iface a inet static\n address 192.0.2.1\niface b inet bootp\niface c inet ipv4ll\n"
        "iface d inet ppp\niface e inet manual\niface f inet6 dhcp\niface g inet6 auto\n");
    LinkConfiguration a = configuration("a", false);
    a.staticAddresses = {"192.0.2.1"_ip};
    LinkConfiguration b = configuration("b", false);
    b.bootp4 = true;
    LinkConfiguration c = configuration("c", false);
    c.linkLocal4 = true;
    LinkConfiguration d = configuration("d", false);
    d.other4 = true;
    EXPECT_THAT(read().configurations, ElementsAre(a, b, c, d, configuration("f", {}, true)));
}

TEST_F(IfupdownTest, AnInterfaceThatIsUpMayHaveAnotherLogicalName) {
    write("iface home inet dhcp\niface eth2 inet dhcp\n");
    root_.write("/run/network/ifstate", "eth1=home\n");
    LinkConfiguration up = configuration("eth1", true);
    up.applied = true;
    EXPECT_THAT(read().configurations, ElementsAre(up, configuration("eth2", true)));
}

TEST_F(IfupdownTest, AConfigurationIsAppliedFromIfupToIfdown) {
    write("iface eth1 inet dhcp\n");
    root_.write("/run/network/ifstate", "lo=lo\n");
    EXPECT_THAT(read().configurations, ElementsAre(configuration("eth1", true)));
    root_.write("/run/network/ifstate", "lo=lo\neth1=eth1\n");
    LinkConfiguration up = configuration("eth1", true);
    up.applied = true;
    EXPECT_THAT(read().configurations, ElementsAre(up));
    ASSERT_EQ(::chmod(root_.path("").c_str(), 0755), 0);
    ASSERT_EQ(::chmod(root_.path("/run/network/ifstate").c_str(), 0666), 0);
    EXPECT_THAT(read().configurations, ElementsAre(configuration("eth1", true)))
        << "any user could have written that";
    EXPECT_EQ(read().diagnostics.size(), 1U);
}

TEST_F(IfupdownTest, FurtherFilesAreReadAndWatched) {
    write("source interfaces.d/*.conf\nsource-directory /etc/more\nsource /etc/one\n");
    root_.write("/etc/network/interfaces.d/a.conf", "iface a inet dhcp\n");
    root_.write("/etc/network/interfaces.d/a.save", "iface x inet dhcp\n");
    root_.write("/etc/more/b", "iface b inet dhcp\nsource /etc/network/interfaces\n");
    root_.write("/etc/one", "iface c inet dhcp\n");
    std::vector<std::pair<std::optional<InterfaceName>, std::string>> found;
    const ClientFacts facts = read();
    for (const LinkConfiguration& each : facts.configurations) {
        found.emplace_back(each.interfaceName, each.origin);
    }
    EXPECT_THAT(found, ElementsAre(Pair("a"_name, root_.path("/etc/network/interfaces.d/a.conf")),
                                   Pair("b"_name, root_.path("/etc/more/b")),
                                   Pair("c"_name, root_.path("/etc/one"))));
    EXPECT_THAT(facts.places,
                testing::IsSupersetOf({WatchedPlace{root_.path("/etc/network/interfaces.d"), ""},
                                       WatchedPlace{root_.path("/etc/more"), ""},
                                       WatchedPlace{root_.path("/etc"), "one"}}));
}

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
