#include "clients/ManagerBuses.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "LinuxSupport.h"
#include "kit/Diagnostics.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class ManagerBusesTest : public testing::Test {
  protected:
    ManagerBuses::Ask asked(std::string name) {
        return [this, name = std::move(name)](BusRequests::Deadline deadline) {
            EXPECT_LE(deadline - std::chrono::steady_clock::now(), std::chrono::milliseconds{250});
            asked_.push_back(name);
            return response_;
        };
    }
    ClientFacts consult(ClientFacts facts) {
        asked_.clear();
        buses_.consult(facts, now_);
        return facts;
    }

    ManagerBuses::Time now_{std::chrono::hours{1}};
    BusResponse response_;
    std::vector<std::string> asked_;
    ManagerBuses buses_{{.networkd = asked("networkd"),
                         .networkManager = asked("NetworkManager"),
                         .connman = asked("connman")}};
};

ClientFacts managing(Client client) {
    ClientFacts facts = running(client);
    facts.managements = {
        {.client = client, .ifindex = 2, .dhcp4 = {}, .dhcp6 = {}, .staticAddresses = {}}};
    return facts;
}

TEST_F(ManagerBusesTest, OnlyThoseThatRunAreAsked) {
    consult({});
    EXPECT_THAT(asked_, IsEmpty());
    consult(running(Client::NetworkManager));
    EXPECT_THAT(asked_, ElementsAre("NetworkManager"));
    consult(running(Client::Connman));
    EXPECT_THAT(asked_, ElementsAre("connman"));
    consult(running(Client::Networkd));
    EXPECT_THAT(asked_, IsEmpty()) << "it has no links";
    consult(managing(Client::Networkd));
    EXPECT_THAT(asked_, ElementsAre("networkd"));
    consult(running(Client::NetworkManager, ManagerProcess::Where::Elsewhere));
    EXPECT_THAT(asked_, IsEmpty());
}

TEST_F(ManagerBusesTest, OneThatIsNotOnTheBusIsNoTroubleButUnheard) {
    ClientFacts unheard = running(Client::Connman);
    unheard.unheardManagers = {Client::Connman};
    EXPECT_EQ(consult(running(Client::Connman)), unheard);
    consult(running(Client::Connman));
    EXPECT_THAT(asked_, ElementsAre("connman"));
}

TEST_F(ManagerBusesTest, OneThatDoesNotRespondRestsAndTheOthersDoNot) {
    response_.reason = "connman cannot be asked: Connection timed out";
    const auto isAsked = [this] {
        const ClientFacts facts = consult(running(Client::Connman));
        EXPECT_THAT(facts.unheardManagers, ElementsAre(Client::Connman));
        EXPECT_THAT(ZR::Testing::textsOf(facts.diagnostics),
                    ElementsAre("connman cannot be asked: Connection timed out"));
        return !asked_.empty();
    };
    EXPECT_TRUE(isAsked());
    for (const int pause : {1, 2, 4, 8, 16, 30, 30}) {
        now_ += std::chrono::seconds{pause} - std::chrono::milliseconds{1};
        EXPECT_FALSE(isAsked()) << pause;
        consult(running(Client::NetworkManager));
        EXPECT_THAT(asked_, ElementsAre("NetworkManager")) << pause;
        now_ += std::chrono::milliseconds{1};
        EXPECT_TRUE(isAsked()) << pause;
    }
}

TEST_F(ManagerBusesTest, OneThatRespondsAgainIsHeardAtOnce) {
    response_.reason = "connman cannot be asked: Connection timed out";
    consult(running(Client::Connman));
    now_ += std::chrono::seconds{1};
    consult(running(Client::Connman));
    now_ += std::chrono::seconds{2};
    response_ = {.json = sample("connman/services-asking.json"), .reason = ""};
    const ClientFacts heard = consult(running(Client::Connman));
    EXPECT_THAT(heard.unheardManagers, IsEmpty());
    EXPECT_THAT(heard.diagnostics, IsEmpty());
    EXPECT_EQ(heard.managements.size(), 1U);
    response_ = {.json = "", .reason = "connman cannot be asked: Connection timed out"};
    consult(running(Client::Connman));
    now_ += std::chrono::seconds{1};
    consult(running(Client::Connman));
    EXPECT_THAT(asked_, ElementsAre("connman")) << "the pauses begin with the shortest again";
}

TEST_F(ManagerBusesTest, WhatCannotBeUsedIsTold) {
    response_.json = "scrap";
    for (const auto& [client, reason] :
         {std::pair{Client::Connman, "connman says: not an array of services"},
          std::pair{Client::NetworkManager, "NetworkManager says: not an object with objects"},
          std::pair{Client::Networkd, "systemd-networkd says: not a JSON object"}}) {
        const ClientFacts facts = consult(managing(client));
        EXPECT_THAT(ZR::Testing::textsOf(facts.diagnostics),
                    ElementsAre(std::string{"cannot use what "} + reason));
        EXPECT_THAT(facts.unheardManagers, ElementsAre(client));
    }
}

TEST_F(ManagerBusesTest, WhatTheySayIsAdded) {
    response_.json = sample("connman/services-asking.json");
    EXPECT_EQ(consult(running(Client::Connman)).managements.at(0).dhcp4, true);
    response_.json = sample("networkmanager-bus/asking.json");
    EXPECT_EQ(consult(running(Client::NetworkManager)).managements.at(0).dhcp4, true);
    response_.json = sample("networkd/networkctl-status-eth1.json");
    EXPECT_EQ(consult(managing(Client::Networkd)).leases.size(), 2U);
}

}  // namespace
}  // namespace ZR::Live
