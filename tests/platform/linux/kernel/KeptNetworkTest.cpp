// What is kept of the kernel's links and addresses, beside a whole reading of the same
// moment: over random changes in a namespace, and where the kernel's words are not enough.

#include "kernel/KeptNetwork.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <linux/rtnetlink.h>
#include <poll.h>
#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <iostream>
#include <random>

#include "LinuxSupport.h"
#include "ScriptedTransport.h"
#include "kernel/ChangeMonitor.h"
#include "kit/Diagnostics.h"
#include "kit/Namespaces.h"

namespace ZR::Live {
namespace {

using testing::IsEmpty;

constexpr Deadline noDeadline = Deadline::max();

/// The kernel's transport, that counts how often all links were asked for.
class CountingTransport final : public NetlinkTransport {
  public:
    explicit CountingTransport(int& wholeReadings) : wholeReadings_(wholeReadings) {}

    int open() override { return transport_->open(); }
    int send(std::span<const std::byte> message) override {
        nlmsghdr request{};
        std::memcpy(&request, message.data(), sizeof request);
        if (request.nlmsg_type == RTM_GETLINK && (request.nlmsg_flags & NLM_F_DUMP) != 0) {
            ++wholeReadings_;
        }
        return transport_->send(message);
    }
    Datagram receive(std::span<std::byte> buffer, Deadline deadline) override {
        return transport_->receive(buffer, deadline);
    }

  private:
    int& wholeReadings_;
    std::unique_ptr<NetlinkTransport> transport_ = kernelTransport();
};

/// Both ways to the same state.
class BothReadings {
  public:
    BothReadings() {
        monitor_.begin({}, diagnostics_);
        EXPECT_THAT(ZR::Testing::textsOf(diagnostics_), IsEmpty());
    }

    /// Reads both ways until they agree. The kernel computes states by and by, and tells of
    /// them when it has: what is kept may be behind for so long as it has not.
    void agree() {
        for (;;) {
            const UniqueFd sign = monitor_.sign();
            monitor_.begin({}, diagnostics_);
            const NetworkState kept = kept_.read(monitor_.takeNetworkChanges(), noDeadline);
            NetworkState whole = whole_.read(noDeadline);
            std::ranges::stable_sort(whole.links, {}, &Link::ifindex);
            std::ranges::stable_sort(whole.addresses, {}, &Address::ifindex);
            if (kept.certain && whole.certain && kept == whole) {
                return;
            }
            pollfd told{.fd = sign.get(), .events = POLLIN, .revents = 0};
            if (::poll(&told, 1, kept.certain && whole.certain ? 5000 : 0) == 0 && kept.certain &&
                whole.certain) {
                EXPECT_EQ(kept.links, whole.links);
                EXPECT_EQ(kept.addresses, whole.addresses);
                return;
            }
        }
    }

    [[nodiscard]] int wholeReadings() const { return wholeReadings_; }

  private:
    int wholeReadings_ = 0;
    std::vector<Diagnostic> diagnostics_;
    ChangeMonitor monitor_;
    KeptNetwork kept_{RtnetlinkReader{std::make_unique<CountingTransport>(wholeReadings_)}, 1};
    RtnetlinkReader whole_;
};

/// Random commands of ip(8) on few of many links. Some of them fail, as a user's do.
class RandomCommands {
  public:
    RandomCommands(unsigned seed, std::string otherNamespace)
        : random_(seed), otherNamespace_(std::move(otherNamespace)) {}

    std::string next() {
        const std::string link = "d" + std::to_string(below(8));
        const std::string other = "d" + std::to_string(below(8));
        const std::string number = std::to_string(1 + below(4));
        switch (below(16)) {
            case 0:
            case 1:
                return "ip link add " + link + " link base type macvlan mode bridge";
            case 2:
                return "ip link add " + link + " type bridge";
            case 3:
                return "ip link del " + link;
            case 4:
                return "ip link set " + link + " name " + other;
            case 5:
                return "ip link set " + link + " down";
            case 6:
                return "ip addr add 192.0.2." + number + "/24 dev " + link;
            case 7:
                return "ip addr add 198.51.100." + number + "/32 dev " + link;
            case 8:
                return "ip addr del 192.0.2." + number + "/24 dev " + link;
            case 9:
                return "ip addr flush dev " + link;
            case 10:
                return "ip addr replace 203.0.113.1/24 dev d0 valid_lft 600 preferred_lft 600";
            case 11:
                return "ip addr add 2001:db8::" + number + "/64 dev " + link;
            case 12:
                return "ip link set " + link + " master " + other;
            case 13:
                return "ip link set " + link + " nomaster";
            case 14:
                return "ip link set " + link + " netns " + otherNamespace_;
            default:
                return "ip link set " + link + " up";
        }
    }

  private:
    unsigned below(unsigned end) {
        return std::uniform_int_distribution<unsigned>{0, end - 1}(random_);
    }

    std::mt19937 random_;
    std::string otherNamespace_;
};

// Some 200 programs are started in it, one after the other: 2 s.
TEST(KeptNetwork, RandomChangesLeaveWhatAWholeReadingFinds) {
    ZR_NEEDS_NAMESPACES();
    const char* const wanted = std::getenv("ZR_TEST_SEED");
    const unsigned seed = wanted != nullptr
                              ? static_cast<unsigned>(std::strtoul(wanted, nullptr, 10))
                              : std::random_device{}();
    std::cout << "ZR_TEST_SEED=" << seed << '\n';
    EXPECT_TRUE(passesInNamespaces(120, [seed] {
        constexpr int steps = 200;
        std::string batch = "link add base type bridge\n";
        for (int i = 0; i < 60; ++i) {
            batch += "link add m" + std::to_string(i) + " link base type macvlan mode bridge\n";
        }
        const TemporaryDirectory directory;
        directory.write("/batch", batch);
        run("ip -batch " + directory.path("/batch"));
        const OtherNamespace other;
        RandomCommands commands{seed, other.process()};
        BothReadings readings;
        readings.agree();
        std::string done;
        for (int step = 0; step < steps && !testing::Test::HasFailure(); ++step) {
            const std::string command = commands.next();
            run(command + " 2>/dev/null || true");
            done += command + '\n';
            readings.agree();
        }
        EXPECT_FALSE(testing::Test::HasFailure()) << "seed " << seed << ", after\n" << done;
        // A reading that an event falls into, and the end of a bridge with many ports.
        EXPECT_LT(readings.wholeReadings(), steps / 4);
    }));
}

TEST(KeptNetwork, TheFarEndOfACableMovesWithoutAMessage) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(30, [] {
        const OtherNamespace other;
        run("ip link add base type bridge");
        run("for i in 1 2 3 4 5 6 7 8; do ip link add m$i link base type macvlan; done");
        run("ip link add near type veth peer name far");
        BothReadings readings;
        readings.agree();
        run("ip link set far netns " + other.process());
        readings.agree();
        run("nsenter -t " + other.process() + " -n ip link set far netns " +
            std::to_string(::getpid()));
        readings.agree();
    }));
}

class ScriptedNetwork : public testing::Test {
  protected:
    static Message link(int ifindex) {
        return linkMessage(ifindex, "eth" + std::to_string(ifindex), 0x11043);
    }
    static Message end() { return Message{NLMSG_DONE, NLM_F_MULTI, std::int32_t{0}}; }
    static Message error(int number) {
        nlmsgerr response{};
        response.error = -number;
        return Message{NLMSG_ERROR, 0, response};
    }
    /// A whole reading of sixteen links, each with an address.
    static std::deque<std::vector<Step>> whole() {
        std::vector<Message> links;
        std::vector<Message> addresses;
        for (int i = 1; i <= 16; ++i) {
            links.push_back(link(i));
            addresses.push_back(addressMessage(static_cast<unsigned>(i), {192, 0, 2, 1}));
        }
        links.push_back(end());
        addresses.push_back(end());
        return {{Step{links}}, {Step{addresses}}};
    }

    /// Reads with these responses behind those of a whole reading.
    NetworkState readAgain(std::deque<std::vector<Step>> responses, NetworkChanges changes) {
        std::deque<std::vector<Step>> all = whole();
        all.insert(all.end(), responses.begin(), responses.end());
        auto transport = std::make_unique<ScriptedTransport>(std::move(all));
        transport_ = transport.get();
        network_.emplace(RtnetlinkReader{std::move(transport)}, 1);
        EXPECT_EQ(network_->read({}, noDeadline).links.size(), 16U);
        return network_->read(changes, noDeadline);
    }

    std::optional<KeptNetwork> network_;
    const ScriptedTransport* transport_ = nullptr;
};

TEST_F(ScriptedNetwork, NothingIsAskedWhereNothingChanged) {
    EXPECT_EQ(readAgain({}, {.all = false}).links.size(), 16U);
    EXPECT_EQ(transport_->asked(), 2);
}

TEST_F(ScriptedNetwork, OnlyTheLinkThatChangedIsAskedFor) {
    Message renamed = linkMessage(3, "lan0", 0x11043);
    const NetworkState state =
        readAgain({{Step{{renamed, error(0)}}},
                   // An old kernel sends those of others, too.
                   {Step{{addressMessage(2, {192, 0, 2, 9}), addressMessage(3, {192, 0, 2, 7}),
                          addressMessage(3, {192, 0, 2, 8}), end()}}}},
                  {.all = false, .links = {3}});
    EXPECT_EQ(transport_->asked(), 4);
    ASSERT_EQ(state.links.size(), 16U);
    EXPECT_EQ(state.links[2].name.view(), "lan0");
    ASSERT_EQ(state.addresses.size(), 17U);
    EXPECT_EQ(state.addresses[1].ip, "192.0.2.1"_ip);
    EXPECT_EQ(state.addresses[2].ip, "192.0.2.7"_ip);
    EXPECT_EQ(state.addresses[3].ip, "192.0.2.8"_ip);
    EXPECT_EQ(state.addresses[4].ip, "192.0.2.1"_ip);
    EXPECT_TRUE(state.certain);
}

TEST_F(ScriptedNetwork, ALinkThatIsGoneTakesItsAddressesAlong) {
    const NetworkState state = readAgain({{Step{{error(ENODEV)}}}}, {.all = false, .links = {16}});
    EXPECT_EQ(state.links.size(), 15U);
    EXPECT_EQ(state.addresses.size(), 15U);
    EXPECT_TRUE(state.certain);
}

TEST_F(ScriptedNetwork, AllIsReadWhereOneLinkCannotBe) {
    std::deque<std::vector<Step>> responses{{Step{{error(EBUSY)}}}};
    for (std::vector<Step>& step : whole()) {
        responses.push_back(std::move(step));
    }
    const NetworkState state = readAgain(std::move(responses), {.all = false, .links = {16}});
    EXPECT_EQ(state.links.size(), 16U);
    EXPECT_TRUE(state.certain);
    EXPECT_EQ(transport_->asked(), 5);
}

TEST_F(ScriptedNetwork, AllIsReadWhereManyLinksChanged) {
    EXPECT_EQ(readAgain(whole(), {.all = false, .links = {1, 2, 3}}).links.size(), 16U);
    EXPECT_EQ(transport_->asked(), 4);
}

TEST(NetworkChangesTest, TooManyLinksAreAll) {
    NetworkChanges changes{.all = false};
    for (std::uint32_t ifindex = 1; ifindex <= NetworkChanges::most; ++ifindex) {
        changes.add(ifindex);
    }
    EXPECT_FALSE(changes.all);
    EXPECT_EQ(changes.links.size(), NetworkChanges::most);
    changes.add(1);
    EXPECT_FALSE(changes.all);
    changes.add(NetworkChanges::most + 1);
    EXPECT_TRUE(changes.all);
    EXPECT_THAT(changes.links, IsEmpty());
}

}  // namespace
}  // namespace ZR::Live
