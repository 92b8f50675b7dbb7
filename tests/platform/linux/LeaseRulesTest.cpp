// Which lease holds, whose word is taken first, and who reads it.
#include <gtest/gtest.h>

#include <map>
#include <set>

#include "LeaseRules.h"
#include "LinuxSupport.h"
#include "Precedence.h"
#include "StateReaders.h"
#include "clients/Processes.h"

namespace ZR::Live {
namespace {

using NodeLexicon::Properties;

constexpr std::int64_t year = std::int64_t{365} * 24 * 3600;

Lease leaseOf(Client client, std::optional<std::int64_t> expires) {
    return {.client = client,
            .interfaceName = "eth0"_name,
            .address = "192.0.2.7"_ip,
            .server = {},
            .expires = expires};
}

Address addressFor(std::uint32_t seconds) {
    return {.ifindex = 2, .ip = "192.0.2.7"_ip, .validLifetime = seconds};
}

Standing standingOf(Lease lease, std::uint32_t seconds) {
    return settle(lease, addressFor(seconds), now);
}

TEST(LeaseRules, ALeaseStandsUntilItsEnd) {
    EXPECT_EQ(standingOf(leaseOf(Client::Dhclient, now + 1), 1), Standing::Live);
    EXPECT_EQ(standingOf(leaseOf(Client::Dhclient, now), 0), Standing::Ended);
    EXPECT_EQ(standingOf(leaseOf(Client::Udhcpc, now + 1), Address::infinite), Standing::Live);
    EXPECT_EQ(standingOf(leaseOf(Client::Udhcpc, now), Address::infinite), Standing::Ended);
}

TEST(LeaseRules, AnAddressWithoutAnEndIsNotThatOfALeaseWithOne) {
    EXPECT_EQ(standingOf(leaseOf(Client::Networkd, now + 600), Address::infinite),
              Standing::Foreign);
    Lease lease = leaseOf(Client::Dhclient, now + 600);
    lease.clientAlive = true;
    EXPECT_EQ(standingOf(lease, Address::infinite), Standing::Foreign);
    lease.bootp = true;
    EXPECT_EQ(standingOf(lease, Address::infinite), Standing::Live);
    lease.bootp = false;
    lease.outlivesEnd = true;
    EXPECT_EQ(standingOf(lease, Address::infinite), Standing::Live);
}

TEST(LeaseRules, AnAddressWithAnEndIsNotThatOfALeaseWithoutOne) {
    EXPECT_EQ(standingOf(leaseOf(Client::Dhclient, Lease::never), 600), Standing::Foreign);
    EXPECT_EQ(standingOf(leaseOf(Client::Dhclient, now + 136 * year), 600), Standing::Foreign);
    EXPECT_EQ(standingOf(leaseOf(Client::Dhclient, now + 136 * year), Address::infinite),
              Standing::Live);
}

TEST(LeaseRules, WithoutAKnownEndTheAddressTellsIt) {
    Lease lease = leaseOf(Client::Networkd, std::nullopt);
    EXPECT_EQ(settle(lease, addressFor(600), now), Standing::Live);
    EXPECT_EQ(lease.expires, now + 600);
    EXPECT_EQ(standingOf(leaseOf(Client::Networkd, std::nullopt), Address::infinite),
              Standing::Foreign);
    lease = leaseOf(Client::Networkd, std::nullopt);
    lease.clientAlive = true;
    EXPECT_EQ(settle(lease, addressFor(Address::infinite), now), Standing::Live);
    EXPECT_EQ(lease.expires, std::nullopt);
}

TEST(LeaseRules, AfterTheClockWasSetAllTimesMoveToTheKernels) {
    for (const std::int64_t by : {-5 * year, std::int64_t{-11}, std::int64_t{11}, 5 * year}) {
        Lease lease = leaseOf(Client::Dhclient, now + 300 + by);
        lease.clientAlive = true;
        lease.obtained = now - 300 + by;
        lease.renews = now + by;
        lease.rebinds = now + 225 + by;
        EXPECT_EQ(settle(lease, addressFor(300), now), Standing::Live) << by;
        EXPECT_EQ(lease.expires, now + 300) << by;
        EXPECT_EQ(lease.obtained, now - 300) << by;
        EXPECT_EQ(lease.renews, now) << by;
        EXPECT_EQ(lease.rebinds, now + 225) << by;
    }
    Lease over = leaseOf(Client::Dhclient, now + year);
    EXPECT_EQ(settle(over, addressFor(0), now), Standing::Ended) << "the kernel is taking it away";
    Lease near = leaseOf(Client::Dhclient, now + 302);
    EXPECT_EQ(settle(near, addressFor(300), now), Standing::Live);
    EXPECT_EQ(near.expires, now + 302) << "the client's own word is the finer one";
    Lease again = leaseOf(Client::Dhclient, now + 290);
    again.clientAlive = true;
    EXPECT_EQ(settle(again, addressFor(300), now), Standing::Live);
    EXPECT_EQ(again.expires, now + 300) << "the client was given it again";
    Lease dead = leaseOf(Client::Dhclient, now + 290);
    dead.clientAlive = false;
    EXPECT_EQ(settle(dead, addressFor(300), now), Standing::Live);
    EXPECT_EQ(dead.expires, now + 290) << "it does not last longer";
}

TEST(LeaseRules, AnOldLeaseOfAClientThatIsGoneIsNotThatOfANewAddress) {
    EXPECT_EQ(standingOf(leaseOf(Client::Dhclient, now - year), 300), Standing::Foreign);
    Lease lease = leaseOf(Client::Dhclient, now + 1);
    EXPECT_EQ(settle(lease, addressFor(300), now), Standing::Live);
    EXPECT_EQ(lease.expires, now + 1) << "it does not last longer";
    lease.expires = now + year;
    EXPECT_EQ(settle(lease, addressFor(300), now), Standing::Live);
    EXPECT_EQ(lease.expires, now + 300);
}

TEST(LeaseRules, TimesThatNoClockShowsAreTakenOut) {
    constexpr std::int64_t least = std::numeric_limits<std::int64_t>::min();
    constexpr std::int64_t most = std::numeric_limits<std::int64_t>::max();
    Lease lease = leaseOf(Client::Dhclient, least);
    lease.clientAlive = true;
    lease.obtained = least;
    lease.renews = most;
    lease.rebinds = most;
    EXPECT_EQ(settle(lease, addressFor(300), now), Standing::Live);
    EXPECT_EQ(lease.expires, now + 300);
    EXPECT_EQ(lease.obtained, std::nullopt);
    EXPECT_EQ(lease.renews, std::nullopt);
    EXPECT_EQ(lease.rebinds, std::nullopt);
    lease.expires = most - 1;
    EXPECT_EQ(settle(lease, addressFor(Address::infinite), now), Standing::Live);
    EXPECT_TRUE(isEndless(lease, now));
    EXPECT_FALSE(endsTogether(leaseOf(Client::Dhclient, least), addressFor(300), now));
}

TEST(LeaseRules, ALeaseAndItsAddressEndTogether) {
    EXPECT_TRUE(endsTogether(leaseOf(Client::Dhclient, now + 310), addressFor(300), now));
    EXPECT_FALSE(endsTogether(leaseOf(Client::Dhclient, now + 311), addressFor(300), now));
    EXPECT_FALSE(endsTogether(leaseOf(Client::Dhclient, std::nullopt), addressFor(300), now));
    EXPECT_FALSE(endsTogether(leaseOf(Client::Dhclient, Lease::never), addressFor(300), now));
    Lease endless = leaseOf(Client::Dhclient, Lease::never);
    EXPECT_FALSE(endsTogether(endless, addressFor(Address::infinite), now));
    endless.clientAlive = true;
    EXPECT_TRUE(endsTogether(endless, addressFor(Address::infinite), now));
}

TEST(LeaseRules, WickedsAddressesAreItsOwnWhileItRuns) {
    Lease lease = leaseOf(Client::Wicked, now + 600);
    EXPECT_EQ(standingOf(lease, Address::infinite), Standing::Foreign);
    lease.clientAlive = true;
    EXPECT_EQ(standingOf(lease, Address::infinite), Standing::Live);
}

TEST(Precedence, RowsOfAPropertyStandTogether) {
    std::set<Properties> finished;
    Properties last{};
    for (const DecisionRow& row : precedence()) {
        if (row.property != last) {
            EXPECT_TRUE(finished.insert(row.property).second) << row.reason;
            last = row.property;
        }
        EXPECT_FALSE(row.reason.empty());
    }
    EXPECT_EQ(finished, (std::set<Properties>{Properties::Name, Properties::NameMaxLength,
                                              Properties::InterfaceState, Properties::IPv4Address,
                                              Properties::DHCPEnabled, Properties::AddressSource,
                                              Properties::DHCPServerAddresses}));
}

TEST(Precedence, TheLastRowOfEachPropertyFindsAValueForAnyInterface) {
    const Link link{.ifindex = 1, .name = "e"_name, .kind = "", .slaveKind = "", .carrier = {}};
    std::map<Properties, bool> found;
    for (const DecisionRow& row : precedence()) {
        InterfaceView view;
        view.link = &link;
        found[row.property] = row.find(view).has_value();
    }
    // An interface need not have an address; all else is always told.
    EXPECT_FALSE(found.at(Properties::IPv4Address));
    found.erase(Properties::IPv4Address);
    for (const auto& [property, has] : found) {
        EXPECT_TRUE(has) << static_cast<int>(property);
    }
}

TEST(StateReaders, ProcessesAreReadFirst) {
    ASSERT_FALSE(stateReaders().empty());
    EXPECT_EQ(stateReaders().front().read, &readProcesses);
}

TEST(StateReaders, EachPlaceIsAnAbsoluteDirectoryAndStandsOnce) {
    std::set<std::pair<std::string_view, std::string_view>> places;
    for (const StateReader& reader : stateReaders()) {
        for (const StatePlace& place : reader.places) {
            EXPECT_TRUE(place.directory.starts_with('/')) << place.directory;
            EXPECT_FALSE(place.directory.ends_with('/')) << place.directory;
            EXPECT_TRUE(places.emplace(place.directory, place.namePrefix).second)
                << place.directory;
        }
    }
    EXPECT_FALSE(places.empty());
}

TEST(StateReaders, OnAnEmptyMachineTheyFindNothing) {
    const TemporaryDirectory root;
    std::filesystem::create_directories(root.path("/proc/thread-self/ns"));
    ClientFacts facts;
    for (const StateReader& reader : stateReaders()) {
        reader.read({.files = root.path(), .proc = root.path("/proc")}, facts);
    }
    EXPECT_EQ(facts, ClientFacts{});
}

}  // namespace
}  // namespace ZR::Live
