#include "configuration/Ifupdown.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pair;
using testing::UnorderedElementsAre;

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

}  // namespace
}  // namespace ZR::Live
