#include "Decide.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <linux/if.h>
#include <linux/if_addr.h>
#include <linux/if_arp.h>
#include <linux/rtnetlink.h>
#include <sys/socket.h>

#include <map>

#include "LinuxSupport.h"
#include "kit/Diagnostics.h"

namespace ZR::Live {
namespace {

using NodeLexicon::Properties;
using testing::ElementsAre;
using testing::IsEmpty;

constexpr std::uint32_t index = 2;
constexpr const char* leased = "198.51.100.7";
constexpr const char* server = "198.51.100.1";

using Servers = std::vector<std::string>;

/// None for an empty text.
std::optional<IpAddress> optionalAddress(const std::string& text) {
    return text.empty() ? std::nullopt : std::optional{ipAddress(text)};
}

/// One Ethernet interface eth0 that is up, and whatever a test adds to it.
class DecideTest : public testing::Test {
  protected:
    DecideTest() {
        facts_.hostName = "host";
        facts_.links.push_back({.ifindex = index,
                                .name = "eth0"_name,
                                .flags = std::uint32_t{IFF_UP} | IFF_BROADCAST | IFF_LOWER_UP,
                                .operstate = IF_OPER_UP,
                                .arphrdType = ARPHRD_ETHER,
                                .kind = "",
                                .slaveKind = "",
                                .hasParentDevice = true,
                                .carrier = true});
    }

    Address& address(const std::string& text, std::uint32_t validLifetime = Address::infinite,
                     std::uint32_t flags = IFA_F_PERMANENT,
                     std::uint8_t scope = RT_SCOPE_UNIVERSE) {
        facts_.addresses.push_back({.ifindex = index,
                                    .ip = ipAddress(text),
                                    .flags = flags,
                                    .scope = scope,
                                    .validLifetime = validLifetime});
        return facts_.addresses.back();
    }
    Lease& lease(const std::string& text = leased, const std::string& from = server) {
        facts_.clients.leases.push_back({.client = Client::Dhclient,
                                         .interfaceName = "eth0"_name,
                                         .address = ipAddress(text),
                                         .server = optionalAddress(from),
                                         .expires = now + 600});
        return facts_.clients.leases.back();
    }
    LinkConfiguration& management(std::optional<bool> dhcp4, std::optional<bool> dhcp6 = false) {
        facts_.clients.managements.push_back({.client = Client::Networkd,
                                              .ifindex = index,
                                              .dhcp4 = dhcp4,
                                              .dhcp6 = dhcp6,
                                              .staticAddresses = {}});
        return facts_.clients.managements.back();
    }
    ClientProcess& process(bool ipv6 = false) {
        facts_.clients.processes.push_back({.client = Client::Dhclient,
                                            .interfaces = {"eth0"_name},
                                            .leaseFile = "",
                                            .ipv6 = ipv6});
        return facts_.clients.processes.back();
    }
    LinkConfiguration& configuration(std::optional<bool> dhcp4) {
        facts_.clients.configurations.push_back({.client = Client::Ifcfg,
                                                 .interfaceName = "eth0"_name,
                                                 .dhcp4 = dhcp4,
                                                 .dhcp6 = {},
                                                 .staticAddresses = {}});
        return facts_.clients.configurations.back();
    }
    Link& link() { return facts_.links.front(); }
    void enslave(const char* masterKind) {
        link().master = 9;
        link().slaveKind = masterKind;
    }

    [[nodiscard]] PropertyValue value(Properties property, const char* name = "eth0") const {
        return valueOf(*decide(facts_, now), name, property);
    }
    [[nodiscard]] PropertyValue source() const { return value(Properties::AddressSource); }
    [[nodiscard]] PropertyValue enabled() const { return value(Properties::DHCPEnabled); }
    [[nodiscard]] PropertyValue servers() const { return value(Properties::DHCPServerAddresses); }
    [[nodiscard]] PropertyValue ipv4() const { return value(Properties::IPv4Address); }
    [[nodiscard]] std::vector<std::string> diagnostics() const {
        const auto tree = decide(facts_, now);
        return ZR::Testing::textsOf(tree->diagnostics());
    }
    [[nodiscard]] std::vector<Diagnostic::Kind> kinds() const {
        std::vector<Diagnostic::Kind> kinds;
        const auto tree = decide(facts_, now);
        for (const Diagnostic& diagnostic : tree->diagnostics()) {
            kinds.push_back(diagnostic.kind);
        }
        return kinds;
    }

    MachineFacts facts_;
};

TEST_F(DecideTest, TheTreeIsAComputerWithANetworkWithItsInterfaces) {
    address(leased, 600, 0);
    lease().clientAlive = true;
    process();
    const auto tree = decide(facts_, now);
    ASSERT_EQ(tree->nodes().size(), 4U) << "the last is a lease";
    EXPECT_EQ(tree->node(0).type, "ComputerSystem");
    EXPECT_EQ(tree->node(0).description, "Computer");
    EXPECT_EQ(tree->node(0).parent, Snapshot::none);
    EXPECT_EQ(tree->node(1).type, "Network");
    EXPECT_EQ(tree->node(1).description, "Network");
    EXPECT_EQ(tree->node(1).parent, 0U);
    EXPECT_EQ(tree->node(2).type, "NetworkInterface");
    EXPECT_EQ(tree->node(2).description, "Ethernet interface");
    EXPECT_EQ(tree->node(2).parent, 1U);
    EXPECT_THAT(tree->properties(0),
                ElementsAre(SnapshotProperty{Properties::Name, false, "host"},
                            SnapshotProperty{Properties::NameMaxLength, false, number(64)}));
    EXPECT_THAT(tree->properties(1), IsEmpty());
    EXPECT_THAT(
        tree->properties(2),
        ElementsAre(SnapshotProperty{Properties::Name, true, "eth0"},
                    SnapshotProperty{Properties::NameMaxLength, false, number(15)},
                    SnapshotProperty{Properties::InterfaceState, false, number(1)},
                    SnapshotProperty{Properties::IPv4Address, false, leased},
                    SnapshotProperty{Properties::DHCPEnabled, false, true},
                    SnapshotProperty{Properties::AddressSource, false, number(1)},
                    SnapshotProperty{Properties::DHCPServerAddresses, false, Servers{server}}));
}

TEST_F(DecideTest, AMachineWithoutLinksIsAComputerWithAnEmptyNetwork) {
    facts_.links.clear();
    address(leased);
    lease();
    EXPECT_EQ(decide(facts_, now)->nodes().size(), 2U);
}

TEST_F(DecideTest, InterfacesStandInTheOrderOfTheirIndexes) {
    for (const std::uint32_t other : {7U, 1U, 30U, 4U}) {
        Link more = link();
        more.ifindex = other;
        more.name = interfaceName("eth" + std::to_string(other));
        facts_.links.push_back(more);
    }
    EXPECT_THAT(interfaceNames(*decide(facts_, now)),
                ElementsAre("eth1", "eth0", "eth4", "eth7", "eth30"));
}

TEST_F(DecideTest, AddressesBelongToTheLinkOfTheirIndex) {
    Link more = link();
    more.ifindex = 5;
    more.name = "eth5"_name;
    facts_.links.push_back(more);
    address("192.0.2.5").ifindex = 5;
    address("192.0.2.2");
    address("192.0.2.99").ifindex = 99;  // of a link that went meanwhile
    EXPECT_EQ(value(Properties::IPv4Address, "eth5"), PropertyValue{"192.0.2.5"});
    EXPECT_EQ(ipv4(), PropertyValue{"192.0.2.2"});
}

TEST_F(DecideTest, AnInterfaceThatIsDownIsNotActive) {
    link().flags = 0;
    EXPECT_EQ(value(Properties::InterfaceState), number(0));
}

// --- IPv4Address

TEST_F(DecideTest, WithoutAnAddressThePropertyIsLeftOut) {
    const auto tree = decide(facts_, now);
    EXPECT_EQ(tree->find(interfaceNode(*tree, "eth0"), Properties::IPv4Address), nullptr);
}

TEST_F(DecideTest, IPv6AddressesAreNotAnIPv4Address) {
    address("2001:db8::1");
    EXPECT_EQ(ipv4(), PropertyValue{});
}

TEST_F(DecideTest, TheLeasedAddressComesFirst) {
    address("192.0.2.1");
    address(leased, 600, IFA_F_SECONDARY);
    lease();
    EXPECT_EQ(ipv4(), PropertyValue{leased});
}

TEST_F(DecideTest, ThenTheFirstOfGlobalScopeThenFurtherOnesThenLinkLocal) {
    address("169.254.3.4", Address::infinite, IFA_F_PERMANENT, RT_SCOPE_LINK);
    EXPECT_EQ(ipv4(), PropertyValue{"169.254.3.4"});
    address("192.0.2.3", Address::infinite, IFA_F_PERMANENT, RT_SCOPE_SITE);
    EXPECT_EQ(ipv4(), PropertyValue{"192.0.2.3"});
    address("192.0.2.2");
    EXPECT_EQ(ipv4(), PropertyValue{"192.0.2.2"});
    facts_.addresses.back().flags |= IFA_F_SECONDARY;
    EXPECT_EQ(ipv4(), PropertyValue{"192.0.2.3"});
}

TEST_F(DecideTest, AddressesOfHostScopeOrInDoubtAreNone) {
    address("192.0.2.1", Address::infinite, IFA_F_PERMANENT, RT_SCOPE_HOST);
    address("192.0.2.2", Address::infinite, IFA_F_PERMANENT | IFA_F_TENTATIVE);
    address("192.0.2.3", Address::infinite, IFA_F_PERMANENT | IFA_F_DADFAILED);
    EXPECT_EQ(ipv4(), PropertyValue{});
}

// --- live leases

TEST_F(DecideTest, ALeaseIsLiveOnlyWithItsAddressOnItsLink) {
    lease();
    EXPECT_EQ(servers(), PropertyValue{Servers{}});
    address("198.51.100.8", 600, 0);
    EXPECT_EQ(servers(), PropertyValue{Servers{}});
    address(leased, 600, 0).ifindex = 77;
    EXPECT_EQ(servers(), PropertyValue{Servers{}});
    address(leased, 600, 0);
    EXPECT_EQ(servers(), PropertyValue{Servers{server}});
}

TEST_F(DecideTest, AnExpiredLeaseIsNotLive) {
    address(leased, 1, 0);
    lease().expires = now;
    EXPECT_EQ(servers(), PropertyValue{Servers{}});
    facts_.clients.leases.back().expires = now + 1;
    EXPECT_EQ(servers(), PropertyValue{Servers{server}});
}

TEST_F(DecideTest, ALeaseWithAnEndIsNotThatOfAnAddressWithoutOne) {
    address(leased);
    lease();
    EXPECT_EQ(servers(), PropertyValue{Servers{}}) << "set by hand";
    EXPECT_EQ(source(), number(3));
    EXPECT_EQ(enabled(), PropertyValue{false});
    for (const Client client : {Client::Udhcpc, Client::Ipconfig, Client::Connman}) {
        facts_.clients.leases.back().client = client;
        EXPECT_EQ(servers(), PropertyValue{Servers{server}}) << nameOf(client);
        EXPECT_EQ(source(), number(1)) << nameOf(client);
        EXPECT_EQ(enabled(), PropertyValue{true}) << nameOf(client);
    }
    facts_.clients.leases.back().client = Client::Dhclient;
    facts_.clients.leases.back().bootp = true;
    EXPECT_EQ(source(), number(2)) << "BOOTP knows no ends";
}

TEST_F(DecideTest, AClientThatRunsDoesNotMakeAnAddressWithoutAnEndItsOwn) {
    address(leased);
    lease().clientAlive = true;
    process();
    EXPECT_EQ(servers(), PropertyValue{Servers{}});
    EXPECT_EQ(enabled(), PropertyValue{true}) << "it asks";
    EXPECT_EQ(source(), number(0));
}

TEST_F(DecideTest, ALeaseWithoutAnEndIsLive) {
    address(leased);
    lease().expires = Lease::never;
    EXPECT_EQ(servers(), PropertyValue{Servers{server}});
    facts_.clients.leases.back().expires = std::nullopt;
    EXPECT_EQ(servers(), PropertyValue{Servers{}}) << "the client would take it back";
    facts_.clients.leases.back().clientAlive = true;
    EXPECT_EQ(servers(), PropertyValue{Servers{server}});
}

TEST_F(DecideTest, AnEnd136YearsHenceIsNone) {
    address(leased);
    lease().expires = now + UINT32_MAX;
    EXPECT_EQ(servers(), PropertyValue{Servers{server}});
}

TEST_F(DecideTest, AfterTheClockWasSetTheKernelTellsHowLongALeaseLasts) {
    constexpr std::int64_t years = std::int64_t{5} * 365 * 24 * 3600;
    address(leased, 600, 0);
    lease().clientAlive = true;
    for (const std::int64_t by : {-years, years}) {
        facts_.clients.leases.back().expires = now + 600 + by;
        EXPECT_EQ(servers(), PropertyValue{Servers{server}}) << by;
        EXPECT_EQ(Machine(facts_, now).changesAt(), now + 600) << by;
    }
    facts_.clients.leases.back().clientAlive = false;
    EXPECT_EQ(servers(), PropertyValue{Servers{server}});
    facts_.clients.leases.back().expires = now - years;
    EXPECT_EQ(servers(), PropertyValue{Servers{}}) << "of an earlier year";
}

TEST_F(DecideTest, AReleasedLeaseIsNotLive) {
    address(leased, 600, 0);
    lease().released = true;
    EXPECT_EQ(servers(), PropertyValue{Servers{}});
}

TEST_F(DecideTest, ALeaseOfALinkThatIsGoneShowsNowhere) {
    address(leased, 900, 0);  // leased anew, by another link
    lease().interfaceName = "eth9"_name;
    EXPECT_EQ(servers(), PropertyValue{Servers{}});
    facts_.clients.leases.back().expires = Lease::never;
    EXPECT_EQ(servers(), PropertyValue{Servers{}});
    facts_.addresses.back().validLifetime = Address::infinite;
    EXPECT_EQ(servers(), PropertyValue{Servers{}});
}

TEST_F(DecideTest, ALeaseByNameFollowsARename) {
    address(leased, 598, 0);
    lease().interfaceName = "before"_name;
    EXPECT_EQ(servers(), PropertyValue{Servers{server}});
    EXPECT_EQ(source(), number(1));
    // Two links with the address: nothing tells which of them was called so.
    Link twin = link();
    twin.ifindex = 5;
    twin.name = "eth5"_name;
    facts_.links.push_back(twin);
    address(leased, 598, 0).ifindex = 5;
    EXPECT_EQ(servers(), PropertyValue{Servers{}});
}

TEST_F(DecideTest, ALeaseByNameWithoutAnEndFollowsARenameWhileItsClientRuns) {
    address(leased);
    lease().interfaceName = "before"_name;
    facts_.clients.leases.back().expires = Lease::never;
    EXPECT_EQ(servers(), PropertyValue{Servers{}});
    EXPECT_EQ(enabled(), PropertyValue{false});
    facts_.clients.leases.back().clientAlive = true;
    EXPECT_EQ(servers(), PropertyValue{Servers{server}});
    EXPECT_EQ(enabled(), PropertyValue{true});
}

TEST_F(DecideTest, ALeaseThatNamesItsLinkTwiceMustNameOneLink) {
    address(leased, 600, 0);
    lease().ifindex = index;
    EXPECT_EQ(servers(), PropertyValue{Servers{server}});
    facts_.clients.leases.back().interfaceName = "renamed"_name;
    EXPECT_EQ(servers(), PropertyValue{Servers{}});
}

TEST_F(DecideTest, ALeaseByIndexFollowsARename) {
    address(leased, 600, 0);
    lease() = {.client = Client::Networkd,
               .interfaceName = {},
               .ifindex = index,
               .address = ipAddress(leased),
               .server = ipAddress(server),
               .expires = {}};
    link().name = "lan0"_name;
    EXPECT_EQ(value(Properties::DHCPServerAddresses, "lan0"), PropertyValue{Servers{server}});
}

TEST_F(DecideTest, ADhcpv6LeaseNamesNoServer) {
    address("2001:db8::7", 600, 0);
    lease("2001:db8::7", "");
    EXPECT_EQ(servers(), PropertyValue{Servers{}});
}

TEST_F(DecideTest, OfTwoClaimsOnOneAddressTheRunningClientsIsHeard) {
    address(leased, 600, 0);
    lease(leased, "192.0.2.66");
    lease(leased, server).clientAlive = true;
    EXPECT_EQ(servers(), PropertyValue{Servers{server}});
}

TEST_F(DecideTest, EachServerStandsOnceThatOfTheShownAddressFirst) {
    address(leased, 600, 0);
    address("198.51.100.8", 600, IFA_F_SECONDARY);
    address("198.51.100.9", 600, IFA_F_SECONDARY);
    lease();
    lease("198.51.100.8", "192.0.2.2");
    lease("198.51.100.9", server);
    EXPECT_EQ(servers(), (PropertyValue{Servers{server, "192.0.2.2"}}));
}

TEST_F(DecideTest, ALeaseWithoutAServerGivesNone) {
    address(leased, 600, 0);
    lease(leased, "");
    EXPECT_EQ(servers(), PropertyValue{Servers{}});
    EXPECT_EQ(source(), number(1));
}

// --- DHCPEnabled

TEST_F(DecideTest, WithoutAnyHintDhcpIsOff) {
    EXPECT_EQ(enabled(), PropertyValue{false});
    address(leased);
    EXPECT_EQ(enabled(), PropertyValue{false});
}

TEST_F(DecideTest, TheManagersConfigurationDecides) {
    management(true);
    EXPECT_EQ(enabled(), PropertyValue{true});
    facts_.clients.managements.back().dhcp4 = false;
    EXPECT_EQ(enabled(), PropertyValue{false});
    facts_.clients.managements.back().dhcp6 = true;
    EXPECT_EQ(enabled(), PropertyValue{true});
}

TEST_F(DecideTest, AManagementMayNameItsLink) {
    management(true).ifindex = 0;
    facts_.clients.managements.back().interfaceName = "eth0"_name;
    EXPECT_EQ(enabled(), PropertyValue{true});
    facts_.clients.managements.back().interfaceName = "eth9"_name;
    EXPECT_EQ(enabled(), PropertyValue{false});
}

TEST_F(DecideTest, OfTwoManagersTheOneThatUsesDhcpCounts) {
    management(true);
    management(false).client = Client::NetworkManager;
    EXPECT_EQ(enabled(), PropertyValue{true});
    std::swap(facts_.clients.managements[0], facts_.clients.managements[1]);
    EXPECT_EQ(enabled(), PropertyValue{true});
}

TEST_F(DecideTest, TheManagersWordStandsAboveALifetime) {
    management(false);
    address(leased, 600, 0);
    EXPECT_EQ(enabled(), PropertyValue{false});
}

TEST_F(DecideTest, AClientThatWasStartedBesideTheManagerHasTheLinkAllTheSame) {
    management(false);
    process();
    EXPECT_EQ(enabled(), PropertyValue{true});
}

TEST_F(DecideTest, TheWordOfAClientItselfStandsAboveItsProcess) {
    process().client = Client::Dhcpcd;
    management(false).client = Client::Dhcpcd;
    EXPECT_EQ(enabled(), PropertyValue{false}) << "it was told a static address";
    facts_.clients.managements.back().dhcp4 = std::nullopt;
    EXPECT_EQ(enabled(), PropertyValue{true});
    facts_.clients.managements.back() = {.client = Client::Dhcpcd,
                                         .interfaceName = "eth1"_name,
                                         .dhcp4 = false,
                                         .dhcp6 = {},
                                         .staticAddresses = {}};
    EXPECT_EQ(enabled(), PropertyValue{true}) << "it speaks of another link";
}

TEST_F(DecideTest, TheManagersLeaseStandsAboveItsConfiguration) {
    management(false);
    address(leased, 600, 0);
    lease() = {.client = Client::Networkd,
               .interfaceName = {},
               .ifindex = index,
               .address = ipAddress(leased),
               .server = ipAddress(server),
               .clientAlive = true,
               .expires = {}};
    EXPECT_EQ(enabled(), PropertyValue{true});
}

TEST_F(DecideTest, AManagerWhoseConfigurationIsUnknownSaysNothing) {
    management(std::nullopt, std::nullopt);
    EXPECT_EQ(enabled(), PropertyValue{false});
    process();
    EXPECT_EQ(enabled(), PropertyValue{true});
}

TEST_F(DecideTest, AClientOfEitherProtocolOnTheLinkEnables) {
    process(true);
    EXPECT_EQ(enabled(), PropertyValue{true});
    facts_.clients.processes.back().interfaces = {"eth1"_name};
    EXPECT_EQ(enabled(), PropertyValue{false});
}

TEST_F(DecideTest, AClientOfAllLinksHasThoseThatItHears) {
    process().interfaces = {};
    facts_.clients.processes.back().heardLinks = {index + 1};
    EXPECT_EQ(enabled(), PropertyValue{false});
    facts_.clients.processes.back().heardLinks = {index};
    EXPECT_EQ(enabled(), PropertyValue{true});
    facts_.clients.processes.back().heardLinks.reset();
    EXPECT_EQ(enabled(), PropertyValue{false});
    facts_.clients.sockets.packetLinks = {index};
    EXPECT_EQ(enabled(), PropertyValue{true}) << "whose sockets they are is not to be known";
}

TEST_F(DecideTest, AClientOfAllLinksHasThoseOfWhichItHoldsALease) {
    process(true).interfaces = {};
    address("2001:db8::7", 600, 0);
    lease("2001:db8::7", "");
    EXPECT_EQ(Machine(facts_, now).interfaces()[0].processes.size(), 0U) << "of an earlier client";
    facts_.clients.leases.back().clientAlive = true;
    EXPECT_EQ(Machine(facts_, now).interfaces()[0].processes.size(), 1U);
    facts_.clients.processes.back().ipv6 = false;
    EXPECT_EQ(Machine(facts_, now).interfaces()[0].processes.size(), 0U);
}

TEST_F(DecideTest, AClientKeepsItsLinkWhenThatIsRenamed) {
    process().heardLinks = {index};
    link().name = "lan0"_name;
    EXPECT_EQ(value(Properties::DHCPEnabled, "lan0"), PropertyValue{true});
    Link other = link();
    other.ifindex = 7;
    other.name = "eth0"_name;
    facts_.links.push_back(other);
    EXPECT_EQ(enabled(), PropertyValue{false}) << "which has its name now";
    EXPECT_EQ(value(Properties::DHCPEnabled, "lan0"), PropertyValue{true});
}

TEST_F(DecideTest, AClientThatHearsFewerLinksThanItWasToldHasThoseAsWell) {
    process().interfaces = {"eth0"_name, "eth1"_name};
    facts_.clients.processes.back().heardLinks.emplace();
    EXPECT_EQ(enabled(), PropertyValue{true}) << "bound, it needs no socket";
}

TEST_F(DecideTest, WhetherAnAddressWithAnEndIsFromDhcpIsNotKnownWithoutAClient) {
    address(leased, 600, 0);
    EXPECT_EQ(enabled(), PropertyValue{});
    EXPECT_EQ(source(), number(0));
    EXPECT_THAT(diagnostics(), ElementsAre(testing::HasSubstr("eth0: 198.51.100.7 has an end")));
    process();
    EXPECT_EQ(enabled(), PropertyValue{true});
    EXPECT_EQ(source(), number(1));
    EXPECT_THAT(diagnostics(), IsEmpty());
}

// --- what this user may not see

TEST_F(DecideTest, WhereClientsAreHiddenNothingIsSaidOfDhcp) {
    facts_.clients.processesHidden = true;
    address(leased);
    configuration(true);
    lease().expires = now - 1;
    EXPECT_EQ(enabled(), PropertyValue{});
    EXPECT_EQ(source(), number(0));
    management(false);
    EXPECT_EQ(enabled(), PropertyValue{}) << "another client may run besides";
    EXPECT_THAT(diagnostics(), IsEmpty()) << "one may run";
}

TEST_F(DecideTest, WhereClientsAreHiddenOtherEvidenceSaysOn) {
    facts_.clients.processesHidden = true;
    address(leased, 600, 0);
    EXPECT_EQ(enabled(), PropertyValue{true});
    EXPECT_EQ(source(), number(1));
    facts_.addresses.clear();
    facts_.clients.sockets.bound = {{.address = {}, .peer = {}}};
    facts_.clients.sockets.packetLinks = {index};
    EXPECT_EQ(enabled(), PropertyValue{true});
    facts_.clients.sockets = {};
    management(true);
    EXPECT_EQ(enabled(), PropertyValue{true});
}

TEST_F(DecideTest, AHiddenClientHidesTheLinksThatItWasToldAlone) {
    process();
    facts_.clients.hiddenClients.swap(facts_.clients.processes);
    EXPECT_EQ(enabled(), PropertyValue{});
    facts_.clients.hiddenClients.back().interfaces = {"eth1"_name};
    EXPECT_EQ(enabled(), PropertyValue{false});
    facts_.clients.hiddenClients.back().interfaces = {};
    EXPECT_EQ(enabled(), PropertyValue{});
    link().flags = IFF_UP;
    EXPECT_EQ(enabled(), PropertyValue{false}) << "it cannot broadcast";
}

TEST_F(DecideTest, AnIPv6AddressWithAnEndEnablesNothing) {
    address("2001:db8::1", 600, 0);
    EXPECT_EQ(enabled(), PropertyValue{false});
}

// --- AddressSource

TEST_F(DecideTest, ALiveLeaseOfTheAddressIsDhcpOrBootp) {
    address(leased, 600, 0);
    lease();
    EXPECT_EQ(source(), number(1));
    facts_.clients.leases.back().bootp = true;
    EXPECT_EQ(source(), number(2));
}

TEST_F(DecideTest, AnAddressThatTheManagerWasToldIsStatic) {
    management(true).staticAddresses = {"192.0.2.1"_ip};
    address("192.0.2.1");
    EXPECT_EQ(source(), number(3));
}

TEST_F(DecideTest, LinkScopeIn169254IsLinkLocal) {
    address("169.254.3.4", Address::infinite, IFA_F_PERMANENT, RT_SCOPE_LINK);
    EXPECT_EQ(source(), number(4));
    facts_.addresses.back().ip = "192.0.2.1"_ip;
    EXPECT_EQ(source(), number(3));
    facts_.addresses.back().ip = "169.254.3.4"_ip;
    facts_.addresses.back().scope = RT_SCOPE_UNIVERSE;
    EXPECT_EQ(source(), number(3));
}

TEST_F(DecideTest, APermanentAddressWithoutAClientIsStatic) {
    address(leased);
    EXPECT_EQ(source(), number(3));
    process(true);
    EXPECT_EQ(source(), number(3));
}

TEST_F(DecideTest, PermanentDoesNotMeanStaticWhereAClientRuns) {
    address(leased);
    process();
    EXPECT_EQ(source(), number(0));
}

TEST_F(DecideTest, PermanentDoesNotMeanStaticWhereTheManagerUsesDhcp) {
    address(leased);
    management(true);
    EXPECT_EQ(source(), number(0));
    facts_.clients.managements.back().dhcp4 = false;
    EXPECT_EQ(source(), number(3));
}

TEST_F(DecideTest, WithoutAnAddressThereIsNoSourceWhoeverAsksForOne) {
    EXPECT_EQ(source(), number(0));
    LinkConfiguration& told = management(false);
    told.linkLocal4 = true;
    told.staticAddresses = {"192.0.2.1"_ip};
    EXPECT_EQ(source(), number(0));
    told.dhcp4 = true;
    process();
    configuration(true);
    EXPECT_EQ(source(), number(0));
    EXPECT_EQ(enabled(), PropertyValue{true});
}

TEST_F(DecideTest, ADhcpv6LeaseIsASourceWithoutAnIPv4Address) {
    address("2001:db8::7", 600, 0);
    lease("2001:db8::7", "");
    EXPECT_EQ(source(), number(1));
    EXPECT_EQ(enabled(), PropertyValue{true});
    address("192.0.2.1");
    EXPECT_EQ(source(), number(3)) << "that of the IPv4 address";
}

TEST_F(DecideTest, ALeaseOfAnAddressThatWasTakenAwayIsNoSource) {
    lease().clientAlive = true;
    process();
    EXPECT_EQ(source(), number(0));
    EXPECT_EQ(enabled(), PropertyValue{true});
    EXPECT_EQ(servers(), PropertyValue{Servers{}});
}

TEST_F(DecideTest, AStaleLeaseGivesNoSource) {
    lease();
    EXPECT_EQ(source(), number(0));
    EXPECT_EQ(enabled(), PropertyValue{false});
}

TEST_F(DecideTest, LeaseWithoutItsClientStaysDhcpUntilTheKernelEndsIt) {
    address(leased, 600, 0);
    lease();
    EXPECT_EQ(source(), number(1));
    EXPECT_EQ(servers(), PropertyValue{Servers{server}});
    EXPECT_EQ(enabled(), PropertyValue{true}) << "a client obtained the address";
    EXPECT_THAT(diagnostics(), ElementsAre("eth0: the client that leased 198.51.100.7 (dhclient) "
                                           "does not run: nothing renews the lease"));
    EXPECT_EQ(kinds(), std::vector{Diagnostic::Kind::ClientGone});
    facts_.clients.leases.back().clientAlive = true;
    EXPECT_THAT(diagnostics(), IsEmpty());
}

// --- what clients leave besides leases

TEST_F(DecideTest, AConfigurationThatNothingExecutesIsNotAFact) {
    configuration(true).origin = "/etc/network/interfaces";
    address(leased);
    EXPECT_EQ(enabled(), PropertyValue{false});
    EXPECT_EQ(source(), number(3));
    EXPECT_THAT(diagnostics(),
                ElementsAre("eth0: /etc/network/interfaces asks for DHCP, and no client runs"));
    EXPECT_EQ(kinds(), std::vector{Diagnostic::Kind::NotApplied});
    facts_.addresses.clear();
    EXPECT_EQ(enabled(), PropertyValue{false});
    EXPECT_EQ(source(), number(0));
    process();
    EXPECT_THAT(diagnostics(), IsEmpty()) << "it is executed";
}

TEST_F(DecideTest, WhatAManagerDoesNotUseOfItsOwnFilesIsNotTold) {
    configuration(true).client = Client::NetworkManager;
    management(false).client = Client::NetworkManager;
    EXPECT_THAT(diagnostics(), IsEmpty());
    facts_.clients.managements.back().client = Client::Networkd;
    EXPECT_THAT(diagnostics(), ElementsAre(testing::HasSubstr("NetworkManager asks for DHCP")));
}

TEST_F(DecideTest, ConfigurationsThatDoNotAskForDhcpAreNotTold) {
    configuration(false);
    configuration(std::nullopt);
    EXPECT_THAT(diagnostics(), IsEmpty());
    facts_.clients.configurations.back().bootp4 = true;
    facts_.clients.configurations.back().origin = "ifcfg-eth0";
    EXPECT_THAT(diagnostics(), ElementsAre(testing::HasSubstr("eth0: ifcfg-eth0 asks for DHCP")));
}

TEST_F(DecideTest, AnAddressThatTheConfigurationNamesIsStatic) {
    address(leased, 600, 0);
    process();
    EXPECT_EQ(source(), number(1));
    address("192.0.2.1", Address::infinite, IFA_F_PERMANENT);
    std::swap(facts_.addresses[0], facts_.addresses[1]);
    EXPECT_EQ(source(), number(0)) << "a client runs that could have set it";
    configuration(false).staticAddresses = {"192.0.2.1"_ip};
    EXPECT_EQ(source(), number(3));
}

TEST_F(DecideTest, AnAddressThatTheManagerSharesIsOfAnotherKind) {
    address(leased);
    management(false).other4 = true;
    EXPECT_EQ(source(), number(5));
}

TEST_F(DecideTest, UdhcpcLeavesPermanentAddresses) {
    address(leased);
    process().client = Client::Udhcpc;
    EXPECT_EQ(source(), number(1));
    EXPECT_EQ(enabled(), PropertyValue{true});
    EXPECT_EQ(servers(), PropertyValue{Servers{}});
    facts_.clients.processes.back().heardLinks = {index};
    EXPECT_EQ(source(), number(0)) << "it asks for an address, so this is not its own";
    facts_.clients.processes.back().heardLinks.emplace();
    EXPECT_EQ(source(), number(1));
    facts_.clients.processes.back().ipv6 = true;
    EXPECT_EQ(source(), number(3));
}

TEST_F(DecideTest, AnAddressOfTheSystemsStartStaysWhatItWas) {
    address(leased);
    Lease& former = lease();
    former.client = Client::Ipconfig;
    former.outlivesEnd = true;
    former.expires = now - 1;
    EXPECT_EQ(source(), number(1));
    EXPECT_EQ(servers(), PropertyValue{Servers{}}) << "it may be another's by now";
    EXPECT_EQ(enabled(), PropertyValue{false}) << "no client renews it";
    EXPECT_THAT(diagnostics(), ElementsAre("eth0: the lease of 198.51.100.7 (ipconfig) has ended, "
                                           "and no client asks for another one"));
    EXPECT_EQ(kinds(), std::vector{Diagnostic::Kind::LeaseEnded});
    former.bootp = true;
    EXPECT_EQ(source(), number(2));
    former.bootp = false;
    process();
    EXPECT_EQ(source(), number(0)) << "a client asks anew";
    EXPECT_THAT(diagnostics(), IsEmpty());
    facts_.clients.processes.clear();
    address("192.0.2.1");
    facts_.addresses.erase(facts_.addresses.begin());
    EXPECT_EQ(source(), number(3));
}

TEST_F(DecideTest, ASocketAtTheAddressTellsOfAClientAndItsServer) {
    address(leased, 600, 0);
    facts_.clients.sockets.bound = {{.address = ipAddress(leased), .peer = ipAddress(server)}};
    EXPECT_EQ(enabled(), PropertyValue{true});
    EXPECT_EQ(source(), number(1));
    EXPECT_EQ(servers(), PropertyValue{Servers{server}});
    lease(leased, "192.0.2.66");
    EXPECT_EQ(servers(), PropertyValue{Servers{"192.0.2.66"}}) << "a lease says it itself";
}

TEST_F(DecideTest, ASocketOfAllLinksTellsOfTheLinkThatIsHeard) {
    facts_.clients.sockets.bound = {{.address = {}, .peer = {}}};
    EXPECT_EQ(enabled(), PropertyValue{false});
    facts_.clients.sockets.packetLinks = {index};
    EXPECT_EQ(enabled(), PropertyValue{true});
    EXPECT_EQ(source(), number(0));
}

TEST_F(DecideTest, ServersOfIPv6StandBehindThoseOfIPv4) {
    address("2001:db8::7", 600, 0);
    address(leased, 600, 0);
    lease("2001:db8::7", "fe80::1");
    EXPECT_EQ(servers(), PropertyValue{Servers{"fe80::1"}});
    lease();
    EXPECT_EQ(servers(), (PropertyValue{Servers{server, "fe80::1"}}));
}

// --- ports

TEST_F(DecideTest, WhatAManagerThatIsNotHeardMayDoIsNotKnown) {
    facts_.clients.unheardManagers = {Client::NetworkManager};
    EXPECT_EQ(enabled(), PropertyValue{});
    EXPECT_EQ(source(), number(0)) << "there is no address";
    EXPECT_THAT(diagnostics(), ElementsAre("eth0: NetworkManager does not respond: whether it uses "
                                           "DHCP here cannot be told"));
    EXPECT_EQ(kinds(), std::vector{Diagnostic::Kind::Note});
    configuration(true);
    EXPECT_EQ(diagnostics().size(), 1U) << "it may have applied it";
    management(true).client = Client::NetworkManager;
    EXPECT_EQ(enabled(), PropertyValue{true});
    EXPECT_THAT(diagnostics(), IsEmpty());
    facts_.clients.managements.back().dhcp4 = false;
    EXPECT_EQ(enabled(), PropertyValue{false});
}

TEST_F(DecideTest, WhetherDhcpv6GaveAnAddressAManagerThatIsNotHeardDoesNotTell) {
    facts_.clients.unheardManagers = {Client::Networkd};
    management(false, std::nullopt);
    EXPECT_EQ(enabled(), PropertyValue{false});
    address("2001:db8::7", 600, 0);
    EXPECT_EQ(enabled(), PropertyValue{});
    EXPECT_EQ(source(), PropertyValue{});
    EXPECT_THAT(diagnostics(), ElementsAre("eth0: systemd-networkd does not respond: whether it "
                                           "uses DHCP here cannot be told"));
    facts_.clients.managements.back().dhcp6 = true;
    EXPECT_EQ(enabled(), PropertyValue{true});
    EXPECT_EQ(source(), PropertyValue{});
    EXPECT_THAT(diagnostics(), ElementsAre("eth0: systemd-networkd does not respond: whether it "
                                           "has a lease cannot be told"));
    address("192.0.2.7");
    EXPECT_EQ(source(), number(3)) << "that of the IPv4 address";
}

TEST_F(DecideTest, PortsOfBridgesAndBondsHaveNoDhcpOfTheirOwn) {
    for (const char* master : {"bridge", "bond"}) {
        enslave(master);
        address(leased, 600, 0);
        lease();
        process();
        management(true);
        EXPECT_EQ(enabled(), PropertyValue{false}) << master;
        EXPECT_EQ(source(), number(0)) << master;
        EXPECT_EQ(servers(), PropertyValue{Servers{}}) << master;
    }
}

TEST_F(DecideTest, AClientOnAPortIsTold) {
    enslave("bridge");
    process().pid = 17;
    const std::string text = "eth0: dhclient, process 17 runs on a port of ";
    EXPECT_THAT(diagnostics(), ElementsAre(text + "another link, which owns the port's addresses"));
    EXPECT_EQ(kinds(), std::vector{Diagnostic::Kind::Note});
    facts_.links.push_back(link());
    facts_.links.back().ifindex = 9;
    facts_.links.back().name = "br0"_name;
    EXPECT_THAT(diagnostics(), ElementsAre(text + "br0, which owns the port's addresses"));
}

TEST_F(DecideTest, PortsOfAVrfKeepTheirDhcp) {
    enslave("vrf");
    address(leased, 600, 0);
    lease();
    EXPECT_EQ(enabled(), PropertyValue{true});
    EXPECT_EQ(source(), number(1));
}

TEST_F(DecideTest, ADecisionNamesItsReasonAndWhereItIsFrom) {
    address(leased, 600, 0);
    lease().origin = "/var/lib/dhcp/dhclient.leases";
    process().pid = 17;
    configuration(true).origin = "/etc/sysconfig/network/ifcfg-eth0";
    const auto origins = [&] {
        const auto tree = decide(facts_, now, Explain::Yes);
        std::map<Properties, std::string> found;
        for (const DecisionRow& row : precedence()) {
            found[row.property] = tree->origin(2, row.property);
        }
        return found;
    };
    EXPECT_EQ(origins(),
              (std::map<Properties, std::string>{
                  {Properties::Name, "kernel: the kernel's name of the link"},
                  {Properties::NameMaxLength, "kernel: the kernel takes no longer names"},
                  {Properties::InterfaceState,
                   "kernel: administrative and operational state of the link"},
                  {Properties::IPv4Address,
                   "dhclient /var/lib/dhcp/dhclient.leases: the address that a DHCP server leased"},
                  {Properties::DHCPEnabled, "dhclient, process 17: a client runs on the link"},
                  {Properties::AddressSource,
                   "dhclient /var/lib/dhcp/dhclient.leases: a live lease names this very address"},
                  {Properties::DHCPServerAddresses,
                   "dhclient /var/lib/dhcp/dhclient.leases: the servers of the live leases"}}));
    facts_.clients.leases.clear();
    facts_.clients.processes.clear();
    facts_.addresses.clear();
    EXPECT_EQ(origins().at(Properties::DHCPEnabled),
              "kernel: no client has the link, and no address of it is leased");
    EXPECT_EQ(decide(facts_, now)->origin(2, Properties::Name), "") << "it was not asked for";
}

TEST_F(DecideTest, TenThousandInterfacesTakeNoQuadraticTime) {
    // Counted in links per time would be a stopwatch; here 10000 links with an
    // address and a lease each simply must not take the minutes that a search of
    // every list for every link would.
    facts_.links.clear();
    for (std::uint32_t i = 1; i <= 10'000; ++i) {
        const std::string name = "eth" + std::to_string(i);
        facts_.links.push_back({.ifindex = i,
                                .name = interfaceName(name),
                                .flags = IFF_UP,
                                .kind = "",
                                .slaveKind = "",
                                .carrier = {}});
        const std::string text = "10." + std::to_string(i / 250) + ".1." + std::to_string(i % 250);
        address(text, 600, 0).ifindex = i;
        lease(text).interfaceName = interfaceName(name);
    }
    const auto tree = decide(facts_, now);
    EXPECT_EQ(tree->nodes().size(), 20'002U) << "an interface and a lease each";
    EXPECT_EQ(valueOf(*tree, "eth9999", Properties::DHCPServerAddresses),
              PropertyValue{Servers{server}});
}

}  // namespace
}  // namespace ZR::Live
