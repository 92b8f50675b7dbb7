#include "client/InterfaceState.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <set>

namespace cimdhcp {
namespace {

using ZR::NodeLexicon::AddressSource;
using ZR::NodeLexicon::ClientState;

constexpr std::int64_t now = 1'000'000;

std::uint64_t number(ClientState state) {
    return static_cast<std::uint64_t>(state);
}

/// A lease of an hour that was confirmed now.
LeaseOverview lease() {
    LeaseOverview lease;
    lease.family = "IPv4";
    lease.clientState = number(ClientState::Bound);
    lease.address = "192.0.2.17";
    lease.obtained = now;
    lease.renews = now + 1800;
    lease.rebinds = now + 3150;
    lease.expires = now + 3600;
    lease.client = "dhclient";
    return lease;
}

/// A client without a lease.
LeaseOverview client(std::string family = "IPv4") {
    LeaseOverview lease;
    lease.family = std::move(family);
    lease.clientState = 0;
    lease.client = "dhclient";
    return lease;
}

InterfaceOverview interface(std::vector<LeaseOverview> leases) {
    InterfaceOverview interface;
    interface.system = hostSystem;
    interface.name = "eth0";
    interface.dhcp = true;
    interface.active = true;
    interface.address = "";
    interface.leases = std::move(leases);
    return interface;
}

std::string_view wordFor(const InterfaceOverview& interface, std::int64_t at = now) {
    return wordOf(stateOf(interface, at));
}

TEST(InterfaceState, FollowsTheTimesOfTheLease) {
    const InterfaceOverview one = interface({lease()});
    EXPECT_EQ(wordFor(one), "bound");
    EXPECT_EQ(wordFor(one, now + 1799), "bound");
    EXPECT_EQ(wordFor(one, now + 1800), "renewing");
    EXPECT_EQ(wordFor(one, now + 3149), "renewing");
    EXPECT_EQ(wordFor(one, now + 3150), "rebinding");
    EXPECT_EQ(wordFor(one, now + 3599), "rebinding");
    EXPECT_EQ(wordFor(one, now + 3600), "expired");
}

TEST(InterfaceState, NoClientRenewsWhereNoneRuns) {
    LeaseOverview left = lease();
    left.clientRuns = false;
    EXPECT_EQ(wordFor(interface({left}), now + 2000), "bound");
    EXPECT_EQ(wordFor(interface({left}), now + 3200), "bound");
    EXPECT_EQ(wordFor(interface({left}), now + 3600), "expired");
}

TEST(InterfaceState, ALeaseWithoutTimesIsBoundWhenTheClientSaysSo) {
    LeaseOverview bare = lease();
    bare.renews = bare.rebinds = bare.expires = std::nullopt;
    EXPECT_EQ(wordFor(interface({bare})), "bound");
    bare.clientState = number(ClientState::Rebinding);
    EXPECT_EQ(wordFor(interface({bare})), "rebinding");
    bare.clientState = 0;
    EXPECT_EQ(wordFor(interface({bare})), "?");
    bare.clientState = std::nullopt;
    EXPECT_EQ(wordFor(interface({bare})), "?");
}

TEST(InterfaceState, ALeaseWithoutAnEndNeverExpires) {
    LeaseOverview endless = lease();
    endless.renews = endless.rebinds = std::nullopt;
    endless.expires = static_cast<std::int64_t>(ZR::NodeLexicon::never);
    EXPECT_EQ(wordFor(interface({endless}), now + 1'000'000'000), "bound");
}

TEST(InterfaceState, AClientWithoutALeaseAsks) {
    EXPECT_EQ(wordFor(interface({client()})), "asking");
    EXPECT_EQ(wordFor(interface({client("IPv6")})), "asking");
    for (const ClientState state :
         {ClientState::Init, ClientState::Selecting, ClientState::Requesting,
          ClientState::InitReboot, ClientState::Rebooting}) {
        LeaseOverview asking = client();
        asking.clientState = number(state);
        EXPECT_EQ(wordFor(interface({asking})), "asking");
        // It tells this of itself, and may keep the address of its last lease.
        asking = lease();
        asking.clientState = number(state);
        EXPECT_EQ(wordFor(interface({asking})), "asking");
    }
}

TEST(InterfaceState, OfAClientThatKeepsNoFileTheAddressTells) {
    InterfaceOverview one = interface({client()});
    one.address = "192.0.2.17";
    const auto with = [&one](AddressSource source) {
        one.addressSource = static_cast<std::uint64_t>(source);
        return wordFor(one);
    };
    EXPECT_EQ(with(AddressSource::DHCP), "bound");
    EXPECT_EQ(with(AddressSource::BOOTP), "bound");
    EXPECT_EQ(with(AddressSource::Static), "asking");
    EXPECT_EQ(with(AddressSource::LinkLocal), "asking");
    // Who set the address is not known: it may have been the client.
    EXPECT_EQ(with(AddressSource::Unknown), "?");
    one.addressSource = std::nullopt;
    EXPECT_EQ(wordFor(one), "?");
    // The node may have that address, too.
    one.leases->front().address = "192.0.2.17";
    EXPECT_EQ(wordFor(one), "?");
    EXPECT_EQ(with(AddressSource::DHCP), "bound");
    EXPECT_EQ(with(AddressSource::Static), "?");
    one.leases->front().address = "192.0.2.18";
    EXPECT_EQ(with(AddressSource::DHCP), "?");
    // An IPv4 address says nothing about a client for IPv6.
    one.leases = {client("IPv6")};
    EXPECT_EQ(wordFor(one), "asking");
}

TEST(InterfaceState, IsOffWhereDhcpIs) {
    InterfaceOverview one = interface({lease()});
    one.dhcp = false;
    EXPECT_EQ(wordFor(one), "off");
    one.active = false;
    EXPECT_EQ(wordFor(one), "off");
}

TEST(InterfaceState, IsNotKnownWhereDhcpIsNot) {
    InterfaceOverview one = interface({lease()});
    one.dhcp = std::nullopt;
    EXPECT_EQ(wordFor(one), "?");
}

TEST(InterfaceState, TellsThatThereIsNoLink) {
    InterfaceOverview one = interface({lease()});
    one.active = false;
    EXPECT_EQ(wordFor(one), "no link");
    one.leases->clear();
    EXPECT_EQ(wordFor(one), "no link");
    one.active = std::nullopt;
    one.leases = {lease()};
    EXPECT_EQ(wordFor(one), "bound");
}

TEST(InterfaceState, WithoutLeasesIsWhatTheEndpointTells) {
    InterfaceOverview one = interface({});
    one.clientState = number(ClientState::Bound);
    EXPECT_EQ(wordFor(one), "?") << "there is nothing that could be bound";
    one.address = "192.0.2.17";
    EXPECT_EQ(wordFor(one), "bound");
    one.leases = std::nullopt;
    one.clientState = std::nullopt;
    EXPECT_EQ(wordFor(one), "?");
    one.clientState = 0;
    EXPECT_EQ(wordFor(one), "?");
    one.clientState = number(ClientState::Bound);
    EXPECT_EQ(wordFor(one), "bound");
    one.clientState = number(ClientState::Rebinding);
    EXPECT_EQ(wordFor(one), "rebinding");
    one.clientState = number(ClientState::Selecting);
    EXPECT_EQ(wordFor(one), "asking");
    one.clientState = 99;
    EXPECT_EQ(wordFor(one), "?");
}

TEST(LeadingLease, IsOneThatIsHeldAndIPv4First) {
    LeaseOverview six = lease();
    six.family = "IPv6";
    six.address = "2001:db8::17";
    LeaseOverview other = lease();
    other.address = "192.0.2.18";
    const auto leading = [](InterfaceOverview one) {
        one.address = "192.0.2.18";
        const LeaseOverview* const found = leadingLease(one);
        return found == nullptr ? LeaseOverview() : *found;
    };
    EXPECT_EQ(leading(interface({})), LeaseOverview());
    EXPECT_EQ(leading(interface({client("IPv6"), client()})), client());
    EXPECT_EQ(leading(interface({client(), six})), six);
    EXPECT_EQ(leading(interface({six, lease()})), lease());
    EXPECT_EQ(leading(interface({lease(), other})), other) << "it is the interface's address";
    EXPECT_EQ(leading(interface({lease(), six})), lease());
    InterfaceOverview remote;
    EXPECT_EQ(leadingLease(remote), nullptr);
}

TEST(StateWords, NameEveryStateOnce) {
    std::set<std::string_view> words;
    for (const StateWord& each : stateWords) {
        EXPECT_EQ(wordOf(each.state), each.word);
        EXPECT_FALSE(each.meaning.empty()) << each.word;
        words.insert(each.word);
    }
    EXPECT_EQ(words.size(), stateWords.size());
}

}  // namespace
}  // namespace cimdhcp
