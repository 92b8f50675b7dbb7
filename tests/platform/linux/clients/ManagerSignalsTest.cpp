#include "clients/ManagerSignals.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <poll.h>

#include <deque>
#include <memory>
#include <optional>
#include <set>
#include <vector>

#include "FakeBus.h"
#include "LinuxSupport.h"
#include "LiveMachine.h"
#include "ScriptedTransport.h"

namespace ZR::Live {
namespace {

using testing::Contains;
using testing::HasSubstr;

class ManagerSignalsTest : public testing::Test {
  protected:
    void openBus() {
        bus_.emplace([this](sd_bus_message* request) {
            const char* rule = nullptr;
            if (sd_bus_message_is_method_call(request, "org.freedesktop.DBus", "AddMatch") > 0 &&
                sd_bus_message_read(request, "s", &rule) > 0) {
                const std::lock_guard lock(mutex_);
                rules_.emplace(rule);
            }
            return sd_bus_reply_method_return(request, "");
        });
    }
    /// A device tells of its properties.
    void announce() {
        bus_->announce([](sd_bus* bus) {
            EXPECT_GE(sd_bus_emit_signal(bus, "/d", "org.freedesktop.DBus.Properties",
                                         "PropertiesChanged", "sa{sv}as",
                                         "org.freedesktop.NetworkManager.Device", 0, 0),
                      0);
        });
    }
    bool readable() const {
        pollfd asked{.fd = signals_.descriptor(), .events = POLLIN, .revents = 0};
        return ::poll(&asked, 1, 5'000) > 0;
    }
    /// Whether something is heard, of all that comes.
    bool hears() {
        while (readable()) {
            if (signals_.heard()) {
                return true;
            }
        }
        return false;
    }
    std::set<std::string> rules() {
        const std::lock_guard lock(mutex_);
        return rules_;
    }

    std::mutex mutex_;
    std::set<std::string> rules_;
    std::optional<FakeBus> bus_;
    ManagerSignals::Time now_{std::chrono::hours{1}};
    ManagerSignals signals_;
};

TEST_F(ManagerSignalsTest, WhereNoManagerRunsThatIsToBeHeardThereIsNoConnection) {
    openBus();
    for (const ClientFacts& facts :
         {ClientFacts(), running(Client::Networkd),
          running(Client::NetworkManager, ManagerProcess::Where::Elsewhere)}) {
        signals_.follow(facts);
        EXPECT_FALSE(signals_.connect(now_));
        EXPECT_EQ(signals_.descriptor(), -1);
        EXPECT_FALSE(signals_.heard());
    }
}

TEST_F(ManagerSignalsTest, WhatAManagerAnnouncesIsHeardOnce) {
    openBus();
    signals_.follow(running(Client::NetworkManager));
    EXPECT_TRUE(signals_.connect(now_));
    EXPECT_FALSE(signals_.connect(now_)) << "there is one already";
    EXPECT_FALSE(signals_.heard());
    announce();
    EXPECT_TRUE(hears());
    EXPECT_FALSE(signals_.heard());
    EXPECT_THAT(rules(), Contains(HasSubstr("arg0='org.freedesktop.NetworkManager.Device'")));
    EXPECT_THAT(rules(), Contains(HasSubstr("arg0='org.freedesktop.NetworkManager.DHCP4Config'")));
    EXPECT_THAT(rules(), Contains(HasSubstr("sender='net.connman'")));
}

TEST_F(ManagerSignalsTest, WhatTheBusItselfSaysIsNotHeard) {
    openBus();
    signals_.follow(running(Client::Connman));
    ASSERT_TRUE(signals_.connect(now_));
    bus_->announce([](sd_bus* bus) {
        EXPECT_GE(sd_bus_emit_signal(bus, "/org/freedesktop/DBus", "org.freedesktop.DBus",
                                     "NameAcquired", "s", ":1.7"),
                  0);
        EXPECT_GE(sd_bus_emit_signal(bus, "/s", "net.connman.Service", "PropertyChanged", "sv",
                                     "State", "s", "ready"),
                  0);
    });
    int heard = 0;
    while (heard == 0 && readable()) {
        heard += signals_.heard() ? 1 : 0;
    }
    EXPECT_EQ(heard, 1);
    bus_->announce([](sd_bus* bus) {
        EXPECT_GE(sd_bus_emit_signal(bus, "/org/freedesktop/DBus", "org.freedesktop.DBus",
                                     "NameLost", "s", ":1.7"),
                  0);
    });
    ASSERT_TRUE(readable());
    EXPECT_FALSE(signals_.heard());
}

TEST_F(ManagerSignalsTest, ABrokenConnectionIsHeardAndMadeAnew) {
    openBus();
    signals_.follow(running(Client::NetworkManager));
    ASSERT_TRUE(signals_.connect(now_));
    bus_.reset();
    EXPECT_TRUE(hears()) << "something may have been announced meanwhile";
    EXPECT_EQ(signals_.descriptor(), -1);
    EXPECT_FALSE(signals_.heard());
    openBus();
    EXPECT_TRUE(signals_.connect(now_));
    announce();
    EXPECT_TRUE(hears());
}

TEST_F(ManagerSignalsTest, ABusThatIsNotThereIsNotTriedAgainSoon) {
    openBus();
    bus_.reset();
    signals_.follow(running(Client::NetworkManager));
    EXPECT_FALSE(signals_.connect(now_));
    openBus();
    EXPECT_FALSE(signals_.connect(now_ + std::chrono::seconds{29}));
    EXPECT_TRUE(signals_.connect(now_ + std::chrono::seconds{30}));
}

TEST_F(ManagerSignalsTest, TheConnectionEndsWithTheManager) {
    openBus();
    signals_.follow(running(Client::NetworkManager));
    ASSERT_TRUE(signals_.connect(now_));
    signals_.follow({});
    EXPECT_EQ(signals_.descriptor(), -1);
    EXPECT_FALSE(signals_.heard());
}

TEST_F(ManagerSignalsTest, WhatIsAnnouncedIsASignOfAMachine) {
    const Message end{NLMSG_DONE, NLM_F_MULTI, std::int32_t{0}};
    const std::vector<Step> links{Step{{linkMessage(2, "eth1", 0x11043), end}}};
    const std::vector<Step> addresses{Step{{addressMessage(2, {192, 0, 2, 1}), end}}};
    const TemporaryDirectory root;
    root.write("/proc/7/comm", "NetworkManager\n");
    root.write("/proc/7/status",
               "Name:\tNetworkManager\nState:\tS (sleeping)\nPPid:\t1\n"
               "Uid:\t0\t0\t0\t0\nCapEff:\t000001ffffffffff\n");
    Surroundings surroundings;
    surroundings.roots = {.files = root.path(), .proc = root.path("/proc")};
    surroundings.transport = std::make_unique<ScriptedTransport>(
        std::deque<std::vector<Step>>{links, addresses, links, addresses});
    surroundings.realProcesses = false;
    surroundings.buses.networkManager = [](auto /*deadline*/) { return BusResponse(); };
    surroundings.report = [](std::string_view /*text*/) {};
    openBus();
    LiveMachine machine{std::move(surroundings)};
    static_cast<void>(machine.read());
    static_cast<void>(machine.signs());
    EXPECT_TRUE(machine.changed()) << "what was announced before was not heard";
    static_cast<void>(machine.read());
    const ChangeSigns signs = machine.signs();
    EXPECT_FALSE(machine.changed());
    announce();
    bool changed = false;
    pollfd asked{.fd = signs.descriptor.get(), .events = POLLIN, .revents = 0};
    while (!changed && ::poll(&asked, 1, 5'000) > 0) {
        changed = machine.changed();
    }
    EXPECT_TRUE(changed);
    EXPECT_TRUE(machine.changed()) << "until the next reading";
}

}  // namespace
}  // namespace ZR::Live
