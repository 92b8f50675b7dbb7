#include "facts/ClientFacts.h"

#include <gtest/gtest.h>

#include <set>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

TEST(ClientNames, AreAllDifferent) {
    std::set<std::string_view> names;
    for (const Client client :
         {Client::Networkd, Client::NetworkManager, Client::Wicked, Client::Dhclient,
          Client::Dhcpcd, Client::Udhcpc, Client::Dhcp6c, Client::Ipconfig, Client::Netplan,
          Client::Ifupdown, Client::Ifcfg, Client::Connman, Client::KernelBoot}) {
        EXPECT_TRUE(names.insert(nameOf(client)).second) << nameOf(client);
        EXPECT_NE(nameOf(client), "unknown");
    }
}

TEST(ClientFacts, AManagerOfAnotherNamespaceDoesNotRunHere) {
    using Where = ManagerProcess::Where;
    EXPECT_TRUE(running(Client::Wicked).runs(Client::Wicked));
    EXPECT_TRUE(running(Client::Wicked, Where::Unknown).runs(Client::Wicked));
    EXPECT_FALSE(running(Client::Wicked, Where::Elsewhere).runs(Client::Wicked));
    EXPECT_FALSE(running(Client::Wicked).runs(Client::Networkd));
    EXPECT_FALSE(ClientFacts{}.runs(Client::Wicked));
}

TEST(ClientFacts, AManagerRunsElsewhereWhereItRunsInNoOtherPlace) {
    using Where = ManagerProcess::Where;
    ClientFacts facts = running(Client::Wicked, Where::Elsewhere);
    EXPECT_TRUE(facts.runsElsewhere(Client::Wicked));
    EXPECT_FALSE(facts.runsElsewhere(Client::Networkd));
    facts.managers.push_back({.client = Client::Wicked, .where = Where::Here, .pid = 8});
    EXPECT_FALSE(facts.runsElsewhere(Client::Wicked));
    EXPECT_FALSE(ClientFacts{}.runsElsewhere(Client::Wicked));
}

TEST(ClientProcesses, WithoutAnInterfaceTheyServeAll) {
    ClientProcess process{.client = Client::Dhclient, .interfaces = {}, .leaseFile = ""};
    EXPECT_TRUE(process.serves("eth1"_name));
    process.interfaces = {"eth2"_name, "eth3"_name};
    EXPECT_TRUE(process.serves("eth3"_name));
    EXPECT_FALSE(process.serves("eth1"_name));
}

}  // namespace
}  // namespace ZR::Live
