#include "http/Connections.h"

#include <arpa/inet.h>
#include <gtest/gtest.h>
#include <netinet/in.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <list>
#include <string>
#include <thread>
#include <utility>

#include "http/FairQueue.h"

namespace cimom::wbem {

namespace {

AddressKey ofAddress(unsigned char number) {
    AddressKey key{};
    key[15] = number;
    return key;
}

/// The two ends of connections: the server has the first.
class Pair {
  public:
    Pair() { EXPECT_EQ(::socketpair(AF_UNIX, SOCK_STREAM, 0, sockets_.data()), 0); }
    ~Pair() {
        ::close(sockets_[0]);
        leave();
    }
    Pair(const Pair&) = delete;
    Pair& operator=(const Pair&) = delete;

    [[nodiscard]] int socket() const { return sockets_[0]; }
    /// The client goes.
    void leave() {
        if (sockets_[1] >= 0) {
            ::close(std::exchange(sockets_[1], -1));
        }
    }
    /// Whether the server has cut it.
    [[nodiscard]] bool isCut() const {
        std::array<char, 1> byte{};
        return ::recv(sockets_[1], byte.data(), byte.size(), MSG_DONTWAIT) == 0;
    }
    /// The same after the client has gone.
    [[nodiscard]] bool isCutAtTheServer() const {
        return ::send(sockets_[0], "x", 1, MSG_NOSIGNAL | MSG_DONTWAIT) < 0 && errno == EPIPE;
    }

  private:
    std::array<int, 2> sockets_{};
};

}  // namespace

/// A connection whose deadline for requests is over at once.
class ConnectionsTest : public testing::Test {
  protected:
    static Limits patience(std::chrono::seconds request) {
        Limits limits;
        limits.request = request;
        limits.response = std::chrono::hours(1);
        return limits;
    }

    Connections::Connection& opened() {
        EXPECT_TRUE(connections.admit(pair.socket(), ofAddress(1), "a"));
        return *connections.find(pair.socket());
    }
    bool isCut() {
        connections.endOverdue();
        return pair.isCut();
    }

    const Limits limits = patience(std::chrono::seconds(0));
    AddressShares shares{limits};
    Connections connections{limits, shares};
    Pair pair;
};

TEST_F(ConnectionsTest, AreCutWhenTheirTimeIsOver) {
    opened();
    EXPECT_TRUE(isCut());
}

TEST_F(ConnectionsTest, HaveTheirTimeForEveryStep) {
    Connections::Connection& connection = opened();
    connections.expectTaking(connection);
    EXPECT_TRUE(connections.isBusy());
    EXPECT_FALSE(isCut());
    connections.expectRequest(connection);
    EXPECT_FALSE(connections.isBusy());
    EXPECT_TRUE(isCut());
}

TEST_F(ConnectionsTest, AreNotCutWhileAWorkerHasTheirRequest) {
    Connections::Connection& connection = opened();
    connections.expectResult(connection,
                             std::make_shared<Exchange>(nullptr, "a", ofAddress(1), shares));
    EXPECT_TRUE(connections.isBusy());
    EXPECT_FALSE(isCut());
    connections.expectRequest(connection);
}

TEST_F(ConnectionsTest, AreForgottenWhenTheyAreClosed) {
    opened();
    connections.closed(pair.socket());
    EXPECT_EQ(connections.find(pair.socket()), nullptr);
    EXPECT_EQ(shares.connections(ofAddress(1)), 0U);
    EXPECT_FALSE(isCut());
}

TEST(ConnectionsOfClientsThatHaveGone, AreCutLongBeforeTheirTime) {
    const Limits limits;
    AddressShares shares(limits);
    Connections connections(limits, shares);
    Pair idle;
    Pair busy;
    Pair present;
    for (const Pair* each : {&idle, &busy, &present}) {
        ASSERT_TRUE(connections.admit(each->socket(), ofAddress(1), "a"));
    }
    connections.expectResult(*connections.find(busy.socket()),
                             std::make_shared<Exchange>(nullptr, "a", ofAddress(1), shares));
    idle.leave();
    busy.leave();
    const auto start = Connections::Clock::now();
    // The time of a request is 30 seconds; this takes a moment, on a loaded machine, too.
    while (!idle.isCutAtTheServer() && Connections::Clock::now() - start < limits.request) {
        connections.endOverdue();
        std::this_thread::yield();
    }
    EXPECT_LT(Connections::Clock::now() - start, limits.request);
    EXPECT_FALSE(present.isCut());
    // Its operation goes on: a client may close its side behind its request.
    EXPECT_NE(connections.find(busy.socket()), nullptr);
    EXPECT_FALSE(connections.find(busy.socket())->ending);
    connections.expectRequest(*connections.find(busy.socket()));
}

/// A server that takes eight connections.
class ConnectionShares : public testing::Test {
  protected:
    static Limits eight() {
        Limits limits;
        limits.connections = 8;
        limits.connectionsEach = 5;
        return limits;
    }
    bool admit(unsigned char address) {
        const Pair& pair = pairs.emplace_back();
        return connections.admit(pair.socket(), ofAddress(address), "a");
    }
    unsigned admitSoMany(unsigned char address, unsigned wanted) {
        unsigned count = 0;
        for (unsigned number = 0; number < wanted; ++number) {
            count += admit(address) ? 1U : 0U;
        }
        return count;
    }
    [[nodiscard]] unsigned cut() const {
        return static_cast<unsigned>(std::count_if(pairs.begin(), pairs.end(),
                                                   [](const Pair& pair) { return pair.isCut(); }));
    }

    const Limits limits = eight();
    AddressShares shares{limits};
    Connections connections{limits, shares};
    std::list<Pair> pairs;
};

TEST_F(ConnectionShares, AnUnknownAddressHasItsShareAndNoMore) {
    EXPECT_EQ(admitSoMany(1, 6), 5U);
    EXPECT_EQ(connections.takeTurnedAway(), 1U);
    connections.closed(pairs.front().socket());
    EXPECT_EQ(admitSoMany(1, 2), 1U);
    EXPECT_EQ(cut(), 0U);
}

TEST_F(ConnectionShares, TheLastQuarterIsForKnownAddresses) {
    shares.admitted(ofAddress(3));
    EXPECT_EQ(admitSoMany(1, 3), 3U);
    EXPECT_EQ(admitSoMany(2, 3), 3U);
    EXPECT_EQ(admitSoMany(2, 1), 0U);
    EXPECT_EQ(admitSoMany(3, 2), 2U);
    EXPECT_EQ(cut(), 0U);
}

TEST_F(ConnectionShares, AnAddressWithFewTakesFromTheOneWithMost) {
    EXPECT_EQ(admitSoMany(1, 5), 5U);
    EXPECT_EQ(admitSoMany(2, 1), 1U);
    // The strangers' part is full: each of the next takes the longest idle one of the first,
    // until both have three.
    EXPECT_EQ(admitSoMany(2, 3), 2U);
    EXPECT_EQ(cut(), 2U);
    EXPECT_TRUE(pairs.front().isCut());
    // The rest is free for one that is known, which gets no nearer to the others.
    shares.admitted(ofAddress(3));
    EXPECT_EQ(admitSoMany(3, 4), 2U);
    EXPECT_EQ(cut(), 2U);
}

TEST_F(ConnectionShares, BusyConnectionsAreNotTaken) {
    EXPECT_EQ(admitSoMany(1, 5), 5U);
    EXPECT_EQ(admitSoMany(2, 1), 1U);
    for (const Pair& pair : pairs) {
        connections.expectTaking(*connections.find(pair.socket()));
    }
    EXPECT_EQ(admitSoMany(2, 1), 0U);
    EXPECT_EQ(cut(), 0U);
}

/// The shares of addresses, at a time that does not pass by itself.
class AddressSharesTest : public testing::Test {
  protected:
    static Limits small() {
        Limits limits;
        limits.connectionsEach = 10;
        limits.connectionRate = 10;
        limits.checksEach = 2;
        limits.refusalsEach = 3;
        limits.memory = 1000;
        return limits;
    }

    AddressShares::Clock::time_point now{std::chrono::hours(1)};
    AddressShares shares{small(), [this] { return now; }};
    const AddressKey first = ofAddress(1);
    const AddressKey second = ofAddress(2);
};

TEST_F(AddressSharesTest, KeysAreWholeIPv4AddressesAndNetworksOfIPv6) {
    const auto four = [](const char* text) {
        sockaddr_in address{};
        address.sin_family = AF_INET;
        EXPECT_EQ(::inet_pton(AF_INET, text, &address.sin_addr), 1);
        return addressKey(reinterpret_cast<const sockaddr*>(&address));
    };
    const auto six = [](const char* text) {
        sockaddr_in6 address{};
        address.sin6_family = AF_INET6;
        EXPECT_EQ(::inet_pton(AF_INET6, text, &address.sin6_addr), 1);
        return addressKey(reinterpret_cast<const sockaddr*>(&address));
    };
    EXPECT_EQ(four("192.0.2.1"), four("192.0.2.1"));
    EXPECT_NE(four("192.0.2.1"), four("192.0.2.2"));
    EXPECT_EQ(four("192.0.2.1"), six("::ffff:192.0.2.1"));
    EXPECT_NE(six("::ffff:192.0.2.1"), six("::ffff:192.0.2.2"));
    EXPECT_EQ(six("2001:db8::1"), six("2001:db8::ffff:1:2:3"));
    EXPECT_NE(six("2001:db8::1"), six("2001:db8:0:1::1"));
    EXPECT_EQ(addressKey(nullptr), AddressKey());
}

TEST_F(AddressSharesTest, UnknownAddressesConnectAtARate) {
    const auto burst = [this](const AddressKey& key) {
        unsigned count = 0;
        while (count < 100 && shares.addConnection(key)) {
            shares.removeConnection(key);
            ++count;
        }
        return count;
    };
    EXPECT_EQ(burst(first), 20U);
    EXPECT_EQ(burst(second), 20U);
    now += std::chrono::milliseconds(200);
    EXPECT_EQ(burst(first), 2U);
    shares.admitted(first);
    EXPECT_EQ(burst(first), 100U);
    now += std::chrono::minutes(11);
    EXPECT_FALSE(shares.isKnown(first));
    EXPECT_EQ(burst(first), 20U);
}

TEST_F(AddressSharesTest, ChecksAreCounted) {
    EXPECT_TRUE(shares.beginCheck(first));
    EXPECT_TRUE(shares.beginCheck(first));
    EXPECT_FALSE(shares.beginCheck(first));
    EXPECT_TRUE(shares.beginCheck(second));
    shares.endCheck(first);
    EXPECT_TRUE(shares.beginCheck(first));
}

TEST_F(AddressSharesTest, TooManyWrongPasswordsEndTheChecksForAWhile) {
    for (int count = 0; count < 4; ++count) {
        ASSERT_TRUE(shares.beginCheck(first)) << count;
        shares.refused(first);
        shares.endCheck(first);
    }
    EXPECT_FALSE(shares.beginCheck(first));
    EXPECT_TRUE(shares.beginCheck(second));
    now += std::chrono::seconds(20);
    EXPECT_TRUE(shares.beginCheck(first));
}

TEST_F(AddressSharesTest, AnAddressHasHalfOfTheMemory) {
    EXPECT_FALSE(shares.takeMemory(first, 501));
    EXPECT_TRUE(shares.takeMemory(first, 500));
    EXPECT_FALSE(shares.takeMemory(first, 1));
    EXPECT_TRUE(shares.takeMemory(second, 400));
    EXPECT_FALSE(shares.hasMemory(ofAddress(3), 101));
    {
        RequestMemory third(shares, ofAddress(3));
        EXPECT_FALSE(third.growTo(101));
        EXPECT_EQ(third.size(), 0U);
        EXPECT_TRUE(third.growTo(100));
        third.shrinkTo(60);
        EXPECT_TRUE(shares.hasMemory(ofAddress(4), 40));
        EXPECT_FALSE(shares.hasMemory(ofAddress(4), 41));
    }
    EXPECT_TRUE(shares.takeMemory(ofAddress(4), 100));
    shares.giveMemory(first, 500);
    EXPECT_TRUE(shares.takeMemory(first, 500));
}

TEST_F(AddressSharesTest, WhatIsUsedIsNotForgotten) {
    EXPECT_TRUE(shares.beginCheck(first));
    EXPECT_TRUE(shares.beginCheck(first));
    shares.admitted(second);
    now += std::chrono::minutes(1);
    shares.tidy();
    EXPECT_FALSE(shares.beginCheck(first));
    EXPECT_TRUE(shares.isKnown(second));
}

TEST(FairQueue, AddressesTakeTurnsAndKnownOnesAreFirst) {
    FairQueue queue(6);
    std::string order;
    const auto push = [&](unsigned char address, bool known, char name) {
        return queue.push(ofAddress(address), known, [&order, name] { order += name; });
    };
    for (const char name : {'a', 'b', 'c'}) {
        ASSERT_TRUE(push(1, false, name));
    }
    ASSERT_TRUE(push(2, false, 'x'));
    queue.pop()();
    ASSERT_TRUE(push(3, true, 'k'));
    ASSERT_TRUE(push(4, false, 'y'));
    ASSERT_TRUE(push(4, false, 'z'));
    EXPECT_FALSE(push(5, false, '!'));
    for (int count = 0; count < 6; ++count) {
        queue.pop()();
    }
    EXPECT_EQ(order, "akybxzc");
}

}  // namespace cimom::wbem
