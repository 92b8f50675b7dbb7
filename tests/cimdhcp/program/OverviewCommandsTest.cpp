#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <chrono>
#include <cstdint>
#include <nlohmann/json.hpp>

#include "ProgramRun.h"

namespace {

using test::Ended;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

class OverviewCommands : public test::ProgramTest {};

TEST_F(OverviewCommands, ShowListsTheInterfaces) {
    writeConfiguration("eth0", "CONFIG_NAME=office\n");
    EXPECT_EQ(run({"show"}),
              (Ended{0,
                     "INTERFACE  DHCP  STATE  CLIENT    ADDRESS       EXPIRES  SERVERS           "
                     "      CONFIGURATION NAME\n"
                     "eth0       on    bound  dhclient  192.0.2.17    never    192.0.2.1, "
                     "2001:db8::1  office\n"
                     "eth1       off   off    -         198.51.100.4  -        -                 "
                     "      -\n",
                     ""}));
}

TEST_F(OverviewCommands, ShowFitsATerminalUnlessToldOtherwise) {
    writeConfiguration("eth0", "CONFIG_NAME=office\n");
    EXPECT_EQ(
        runOnTerminal(80, {"--color", "never", "show"}),
        (Ended{0,
               "INTERFACE  DHCP  STATE  ADDRESS       EXPIRES  SERVERS      CONFIGURATION NAME\n"
               "eth0       on    bound  192.0.2.17    never    192.0.2.1,   office\n"
               "                                               2001:db8::1\n"
               "eth1       off   off    198.51.100.4  -        -            -\n"
               "(without CLIENT: --wide shows all)\n",
               ""}));
    EXPECT_EQ(runOnTerminal(80, {"--color", "never", "--wide", "show"}), run({"show"}));
    EXPECT_EQ(run({"show"}, {{"COLUMNS", "60"}}), run({"show"}));
}

/// An interface of a tree with the nodes of its leases.
std::string interfaceWith(const std::string& properties, const std::string& leases) {
    return R"({"type": "NetworkInterface", "description": "", "properties": {"Name": "eth0", )" +
           properties + R"(}, "children": [)" + leases + "]}";
}

std::string leaseNode(const std::string& properties) {
    return R"({"type": "DHCPLease", "description": "DHCP lease", "properties": {)" + properties +
           "}}";
}

std::string inSeconds(std::int64_t distance) {
    const auto now = std::chrono::system_clock::now().time_since_epoch();
    return std::to_string(std::chrono::floor<std::chrono::seconds>(now).count() + distance);
}

TEST_F(OverviewCommands, ShowTellsTimesFromNow) {
    const std::string on = R"("DHCPEnabled": true, "AddressSource": 1, "InterfaceState": 1,
                              "IPv4Address": "192.0.2.17")";
    const auto row = [&](std::int64_t renews, std::int64_t rebinds, std::int64_t ends) {
        setTree(test::computer(
            "Computer",
            interfaceWith(
                on, leaseNode(R"("Family": "IPv4", "ClientState": 8, "Client": "dhclient",
                                           "Address": "192.0.2.17", "RenewalTime": )" +
                              inSeconds(renews) + R"(, "RebindingTime": )" + inSeconds(rebinds) +
                              R"(, "LeaseExpires": )" + inSeconds(ends)))));
        return run({"show", "--no-header"}).out;
    };
    constexpr std::int64_t hour = 3600;
    EXPECT_EQ(row(hour, 2 * hour, 4 * hour),
              "eth0  on  bound  dhclient  192.0.2.17  in 4 h  -  -\n");
    EXPECT_EQ(row(-hour, hour, 3 * hour),
              "eth0  on  renewing  dhclient  192.0.2.17  in 3 h  -  -\n");
    EXPECT_EQ(row(-2 * hour, -hour, 2 * hour),
              "eth0  on  rebinding  dhclient  192.0.2.17  in 2 h  -  -\n");
    EXPECT_EQ(row(-9 * hour, -8 * hour, -5 * hour),
              "eth0  on  expired  dhclient  192.0.2.17  5 h ago  -  -\n");
}

TEST_F(OverviewCommands, ShowTellsOfAClientThatAsks) {
    setTree(test::computer(
        "Computer",
        interfaceWith(R"("DHCPEnabled": true, "AddressSource": 0, "InterfaceState": 1)",
                      leaseNode(R"("Family": "IPv4", "ClientState": 0, "Client": "udhcpc")"))));
    EXPECT_EQ(run({"show", "--no-header"}),
              (Ended{0, "eth0  on  asking  udhcpc  -  -  -  -\n", ""}));
    setTree(test::computer(
        "Computer",
        interfaceWith(R"("DHCPEnabled": true, "AddressSource": 0, "InterfaceState": 0)",
                      leaseNode(R"("Family": "IPv4", "ClientState": 0, "Client": "udhcpc")"))));
    EXPECT_EQ(run({"show", "--no-header"}),
              (Ended{0, "eth0  on  no link  udhcpc  -  -  -  -\n", ""}));
}

TEST_F(OverviewCommands, ShowHasTheAddressOfADhcpv6LeaseWithoutIPv4) {
    setTree(test::computer(
        "Computer",
        interfaceWith(R"("DHCPEnabled": true, "AddressSource": 1, "InterfaceState": 1)",
                      leaseNode(R"("Family": "IPv4", "ClientState": 0, "Client": "dhcpcd")") + "," +
                          leaseNode(R"("Family": "IPv6", "ClientState": 8, "Client": "dhcpcd",
                                       "Address": "2001:db8::17",
                                       "LeaseExpires": 253402300799)"))));
    EXPECT_EQ(run({"show", "--no-header"}),
              (Ended{0, "eth0  on  bound  dhcpcd  2001:db8::17  never  -  -\n", ""}));
}

TEST_F(OverviewCommands, ShowTellsWhatIsNotKnown) {
    setTree(test::computer("Computer", interfaceWith(R"("InterfaceState": 1)", "")));
    EXPECT_EQ(run({"show", "--no-header"}),
              (Ended{0, "eth0  ?  ?  ?  -  ?  -  -\n",
                     "cimdhcp: note: eth0: nothing tells DHCP, STATE, CLIENT and EXPIRES\n"}));
    const auto json = nlohmann::json::parse(run({"--format", "json", "show"}).out)["interfaces"][0];
    EXPECT_TRUE(json["dhcp"].is_null());
    EXPECT_TRUE(json["state"].is_null());
    EXPECT_EQ(json["unknown"], nlohmann::json({"dhcp", "state", "client", "expires"}));
}

TEST_F(OverviewCommands, ColorsAreForTerminals) {
    const std::string bold = "\x1B[1mINTERFACE";
    EXPECT_THAT(runOnTerminal(100, {"show"}).out, StartsWith(bold));
    EXPECT_THAT(runOnTerminal(100, {"show"}, {{"NO_COLOR", "1"}}).out, StartsWith("INTERFACE"));
    EXPECT_THAT(run({"show"}).out, StartsWith("INTERFACE"));
    EXPECT_THAT(run({"show", "--color", "always"}, {{"NO_COLOR", "1"}}).out, StartsWith(bold));
}

TEST_F(OverviewCommands, ShowTellsOneInterfaceInDetail) {
    writeConfiguration("eth0", "CONFIG_NAME=office\n");
    const Ended ended = run({"show", "eth0"});
    EXPECT_EQ(ended.status, 0);
    EXPECT_EQ(ended.err, "");
    for (const char* text :
         {"  DHCP:               on\n", "  State:              bound (there is a lease)\n",
          "  Address:            192.0.2.17 (by DHCP)\n",
          "  Servers:            192.0.2.1, 2001:db8::1\n", "  Configuration name: office\n",
          "\n  Lease, IPv4\n", "    Expires:           never\n", "    Client:            dhclient",
          "\n  DHCP endpoint\n", "ClientState             = 8 (Bound)\n", "\n  DHCP server\n",
          "AccessContext           = 7 (SMTP Server)\n",
          "\"7 (SMTP Server)\" is what the class holds for one)\n", "\n  Setting\n"}) {
        EXPECT_THAT(ended.out, HasSubstr(text));
    }
    EXPECT_THAT(ended.out, StartsWith("eth0\n"));
    EXPECT_THAT(ended.out, Not(HasSubstr("eth1")));
    const Ended both = run({"show", "eth1", "Computer%eth0"});
    EXPECT_THAT(both.out, StartsWith("eth1\n"));
    EXPECT_THAT(both.out, HasSubstr("\n\neth0\n"));
    const auto json = nlohmann::json::parse(run({"--format", "json", "show", "eth1"}).out);
    ASSERT_EQ(json.at("interfaces").size(), 1U);
    EXPECT_EQ(json["interfaces"][0]["interface"], "eth1");
    EXPECT_EQ(json["interfaces"][0]["endpoint"], nullptr);
    EXPECT_EQ(json["interfaces"][0]["setting"]["class"], "QVXZR_DHCPSettingData");
    EXPECT_EQ(
        run({"show", "eth7"}),
        (Ended{1, "", "cimdhcp: there is no interface \"eth7\"; this machine has: eth0, eth1\n"}));
}

TEST_F(OverviewCommands, ShowHasColumnsForProgramsAndPeople) {
    EXPECT_EQ(run({"show", "--format", "tsv", "--columns", "interface,dhcp,servers,client"}),
              (Ended{0,
                     "INTERFACE\tDHCP\tSERVERS\tCLIENT\n"
                     "eth0\ton\t192.0.2.1,2001:db8::1\tdhclient\n"
                     "eth1\toff\t\t\n",
                     ""}));
    EXPECT_EQ(run({"show", "eth1", "--columns", "state,interface", "--no-header"}),
              (Ended{0, "off  eth1\n", ""}));
    EXPECT_EQ(
        run({"show", "--columns", "stat"}).err,
        "cimdhcp: --columns: there is no column \"stat\"; there are: SYSTEM, INTERFACE, DHCP, "
        "STATE, CLIENT, ADDRESS, EXPIRES, SERVERS, CONFIGURATION NAME; did you mean STATE?\n");
}

TEST_F(OverviewCommands, RowsAreSortedAndCounted) {
    const std::string sorted = run({"show", "--sort", "dhcp", "--no-header"}).out;
    EXPECT_LT(sorted.find("eth1"), sorted.find("eth0"));
    EXPECT_EQ(sorted.find("INTERFACE"), std::string::npos);
    EXPECT_EQ(run({"show", "--count"}), (Ended{0, "2\n", ""}));
    EXPECT_EQ(run({"show", "--sort", "nothing"}),
              (Ended{2, "",
                     "cimdhcp: --sort: there is no column \"nothing\"; there are: SYSTEM, "
                     "INTERFACE, DHCP, STATE, CLIENT, ADDRESS, EXPIRES, SERVERS, "
                     "CONFIGURATION NAME\n"}));
}

TEST_F(OverviewCommands, ShowIsJsonWhenAsked) {
    EXPECT_EQ(run({"--format", "json", "show"}), (Ended{0, R"({
  "interfaces": [
    {
      "interface": "eth0",
      "system": "Computer",
      "dhcp": true,
      "state": "bound",
      "link": true,
      "client": "dhclient",
      "address": "192.0.2.17",
      "expires": {
        "seconds": 253402300799,
        "time": "9999-12-31T23:59:59Z"
      },
      "servers": [
        "192.0.2.1",
        "2001:db8::1"
      ],
      "configurationName": null,
      "leases": [
        {
          "state": "bound",
          "family": "IPv4",
          "clientState": 8,
          "address": "192.0.2.17",
          "serverAddress": "192.0.2.1",
          "leaseObtained": null,
          "renewalTime": null,
          "rebindingTime": null,
          "leaseExpires": {
            "seconds": 253402300799,
            "time": "9999-12-31T23:59:59Z"
          },
          "optionsReceived": [],
          "clientIdentifier": null,
          "client": "dhclient",
          "process": null,
          "source": null
        }
      ],
      "unknown": []
    },
    {
      "interface": "eth1",
      "system": "Computer",
      "dhcp": false,
      "state": "off",
      "link": true,
      "client": null,
      "address": "198.51.100.4",
      "expires": null,
      "servers": [],
      "configurationName": null,
      "leases": [],
      "unknown": []
    }
  ]
}
)",
                                                        ""}));
}

TEST_F(OverviewCommands, ShowKnowsTheServiceProcessor) {
    setTree(test::computer("Computer", test::dhcpInterface("eth0", "192.0.2.1")) + "," +
            test::computer("BMC", test::dhcpInterface("eth0", "192.0.2.9")));
    EXPECT_EQ(run({"show"}),
              (Ended{0,
                     "SYSTEM    INTERFACE  DHCP  STATE  CLIENT  ADDRESS  EXPIRES  SERVERS    "
                     "CONFIGURATION NAME\n"
                     "Computer  eth0       on    ?      ?       -        ?        192.0.2.1  -\n"
                     "BMC       eth0       on    ?      ?       -        ?        192.0.2.9  -\n",
                     "cimdhcp: note: eth0, eth0 of BMC: nothing tells STATE, CLIENT and "
                     "EXPIRES\n"}));
}

TEST_F(OverviewCommands, ShowSaysThatNothingUsesDhcp) {
    setTree(test::computer("Computer", R"({"type": "NetworkInterface", "description": "",
                                           "properties": {"Name": "eth1",
                                                          "DHCPEnabled": false}})"));
    EXPECT_EQ(run({"show"}), (Ended{0,
                                    "INTERFACE  DHCP  STATE  CLIENT  ADDRESS  EXPIRES  SERVERS  "
                                    "CONFIGURATION NAME\n"
                                    "eth1       off   off    -       -        -        -        -\n"
                                    "No interface of this machine uses DHCP.\n",
                                    ""}));
}

TEST_F(OverviewCommands, ShowSaysThatAMachineIsEmpty) {
    setTree("");
    EXPECT_EQ(run({"show"}), (Ended{0, "This machine has no network interfaces.\n", ""}));
    EXPECT_EQ(run({"--format", "json", "show"}), (Ended{0, "{\n  \"interfaces\": []\n}\n", ""}));
}

TEST_F(OverviewCommands, WhatIsNotServedIsNotKnown) {
    const auto registered = [](const std::string& name, const std::string& provider,
                               const std::string& library) {
        return '[' + name + "]\nprovider: " + provider + "\nlocation: " + library +
               "\ntype: instance\nnamespace: root/cimv2\n";
    };
    const std::string file = directory() / "some.registration";
    ZR::Testing::writeFile(
        file, registered("QVXZR_DHCPCapabilities", "DHCPClientProvider", "DHCPClientProvider"));
    EXPECT_EQ(run({"--registration-dir", directory().path(), "show"}),
              (Ended{1, "",
                     "cimdhcp: nothing tells of interfaces: no provider serves "
                     "QVXZR_DHCPInterface or QVXZR_DHCPSettingData\n"}));
    ZR::Testing::writeFile(
        file, registered("QVXZR_DHCPLease", "DHCPClientExtensions", "DHCPClient") +
                  registered("QVXZR_DHCPInterface", "DHCPClientExtensions", "DHCPClient"));
    EXPECT_EQ(run({"--registration-dir", directory().path(), "show"}),
              (Ended{0,
                     "INTERFACE  DHCP  STATE  CLIENT    ADDRESS       EXPIRES  SERVERS  "
                     "CONFIGURATION NAME\n"
                     "eth0       on    bound  dhclient  192.0.2.17    never    ?        ?\n"
                     "eth1       off   off    -         198.51.100.4  -        ?        ?\n",
                     "cimdhcp: note: eth0, eth1: nothing tells SERVERS and CONFIGURATION NAME\n"}));
}

TEST_F(OverviewCommands, ShowTellsWhatTheStandardsClassesTellWhereNoOthersAreServed) {
    EXPECT_EQ(run({"--exact", "show"}),
              (Ended{0,
                     "INTERFACE  DHCP  STATE  CLIENT  ADDRESS       EXPIRES  SERVERS             "
                     "    CONFIGURATION NAME\n"
                     "eth0       on    bound  ?       192.0.2.17    ?        192.0.2.1, "
                     "2001:db8::1  -\n"
                     "eth1       off   off    -       198.51.100.4  -        -                   "
                     "    -\n",
                     "cimdhcp: note: the server does not tell CLIENT and EXPIRES\n"}));
}

TEST_F(OverviewCommands, ShowFailsInANamespaceThatIsNotServed) {
    const Ended ended = run({"--namespace", "root/other", "show"});
    EXPECT_EQ(ended.status, 1);
    EXPECT_EQ(ended.out, "");
    EXPECT_EQ(ended.err, "cimdhcp: CIM_ERR_INVALID_NAMESPACE: no namespace \"root/other\"\n");
}

TEST_F(OverviewCommands, TreePrintsAJsonTreeThatCanBeReadBack) {
    const Ended first = run({"tree"});
    EXPECT_EQ(first.status, 0);
    EXPECT_EQ(first.err, "");
    const auto json = nlohmann::json::parse(first.out);
    EXPECT_EQ(json["nodes"][0]["properties"]["Name"], "${HOSTNAME}") << "whole on any machine";
    EXPECT_EQ(json["nodes"][0]["children"][0]["children"][0]["properties"]["DHCPServerAddresses"],
              nlohmann::json({"192.0.2.1", "2001:db8::1"}));
    ZR::Testing::writeFile(tree(), first.out);
    EXPECT_EQ(run({"tree"}), first);
}

TEST_F(OverviewCommands, ATreeOfThisMachineIsWholeOnAnother) {
    if (::geteuid() != 0) {
        GTEST_SKIP() << "needs root, to be another machine";
    }
    ZR::Testing::writeFile(tree(), run({"tree"}).out);
    // With the instances of a machine of that name.
    EXPECT_EQ(runAs("/usr/bin/unshare",
                    {"--uts", "/bin/sh", "-c",
                     "hostname elsewhere && " + program() + " --tree " + tree() + " --data-dir " +
                         dataDir() + " names --count QVXZR_HostedDHCPPoint"}),
              (Ended{0, "1\n", ""}));
}

TEST_F(OverviewCommands, ATreeOfAnotherMachineIsToldByShowAndTree) {
    std::string other = ZR::Testing::readFile(tree());
    other.replace(other.find("${HOSTNAME}"), 11, "elsewhere");
    ZR::Testing::writeFile(tree(), other);
    const std::string told =
        tree() + ":2:82: the computer is called \"elsewhere\" and this machine \"" + hostName() +
        "\", which the instances of its interfaces name as their system: QVXZR_HostedDHCPPoint "
        "and QVXZR_DHCPRemoteHostedAccessPoint have no instance for it; \"${HOSTNAME}\" stands "
        "for the name of any machine\n";
    EXPECT_THAT(run({"show"}).err, testing::EndsWith(told));
    const Ended shown = run({"tree"});
    EXPECT_EQ(shown.err, "cimdhcp: " + told);
    EXPECT_EQ(nlohmann::json::parse(shown.out)["nodes"][0]["properties"]["Name"], "elsewhere");
    // And so it is.
    for (const char* association : {"QVXZR_HostedDHCPPoint", "QVXZR_DHCPRemoteHostedAccessPoint"}) {
        EXPECT_EQ(run({"names", "--count", association}), (Ended{0, "0\n", "cimdhcp: " + told}));
    }
    EXPECT_EQ(run({"names", "--count", "QVXZR_SAPSAPDependency"}).out, "1\n");
}

TEST_F(OverviewCommands, SlipsInATreeAreToldWithTheirPlaces) {
    setTree(test::computer("Computer", "\n" + test::dhcpInterface("eth0", "nowhere") + ",\n" +
                                           test::dhcpInterface("eth0", "192.0.2.1")));
    const std::string told =
        "cimdhcp: " + tree() + ":2:184: \"nowhere\" is not an IP address\ncimdhcp: " + tree() +
        ":3:90: there is an interface \"eth0\" already: the instances of both have the same "
        "keys\n";
    EXPECT_EQ(run({"tree"}).err, told);
    EXPECT_EQ(run({"names", "--count", "QVXZR_DHCPCapabilities"}), (Ended{0, "2\n", told}))
        << "the tree is used as it is";
}

TEST_F(OverviewCommands, AnExplainedTreeSaysWhereEachPropertyOfTheLiveMachineCameFrom) {
    const Ended explained = runAs(program(), {"tree", "--explain"});
    EXPECT_EQ(explained.status, 0);
    const auto json = nlohmann::json::parse(explained.out);
    const auto& computer = json["nodes"][0];
    ASSERT_FALSE(computer["properties"].empty());
    for (const auto& [name, value] : computer["properties"].items()) {
        EXPECT_EQ(computer["origins"].value(name, ""), "kernel: the name of the system") << name;
    }
    const Ended refused = run({"tree", "--explain"});
    EXPECT_EQ(refused.status, 2);
    EXPECT_EQ(refused.out, "");
    EXPECT_EQ(refused.err,
              "cimdhcp: the sources of properties are known for the live machine alone\n");
}

TEST_F(OverviewCommands, ClassesListsWhatIsServed) {
    const Ended ended = run({"classes"});
    EXPECT_EQ(ended.status, 0);
    EXPECT_EQ(ended.err, "");
    EXPECT_EQ(ended.out.substr(0, ended.out.find(' ')), "CLASS");
    const auto json = nlohmann::json::parse(run({"--format", "json", "classes"}).out)["classes"];
    const auto has = [&json](const nlohmann::json& entry) {
        return std::find(json.begin(), json.end(), entry) != json.end();
    };
    EXPECT_TRUE(has({{"class", "QVXZR_DHCPSettingData"},
                     {"superclass", "CIM_DHCPSettingData"},
                     {"kind", "element"},
                     {"provider", "DHCPClientGateway"},
                     {"namespaces", {"root/cimv2"}}}));
    EXPECT_TRUE(has({{"class", "QVXZR_DHCPOrderedComponent"},
                     {"superclass", "CIM_OrderedComponent"},
                     {"kind", "association"},
                     {"provider", "DHCPClientGateway"},
                     {"namespaces", {"root/cimv2"}}}));
    for (const auto& entry : json) {
        EXPECT_NE(ended.out.find('\n' + entry["class"].get<std::string>() + ' '),
                  std::string::npos);
    }
}

TEST_F(OverviewCommands, ClassesAsATable) {
    ZR::Testing::writeFile(directory() / "some.registration",
                           "[QVXZR_DHCPElementCapabilities]\nprovider: DHCPClientProvider\n"
                           "location: DHCPClientProvider\ntype: instance association\n"
                           "namespace: root/cimv2\n");
    EXPECT_EQ(
        run({"--registration-dir", directory().path(), "classes"}),
        (Ended{0,
               "CLASS                          SUPERCLASS               KIND         PROVIDER\n"
               "QVXZR_DHCPElementCapabilities  CIM_ElementCapabilities  association  "
               "DHCPClientProvider\n",
               ""}));
}

TEST_F(OverviewCommands, LiveMachineShowsTheInterfacesOfItsTree) {
    const Ended tree = runAs(program(), {"tree"});
    EXPECT_EQ(tree.status, 0);
    EXPECT_EQ(tree.err, "");
    std::vector<std::string> expected;
    const auto document = nlohmann::json::parse(tree.out);
    for (const auto& system : document["nodes"]) {
        for (const auto& network : system.value("children", nlohmann::json::array())) {
            for (const auto& node : network.value("children", nlohmann::json::array())) {
                if (node["type"] == "NetworkInterface") {
                    expected.push_back(node["properties"]["Name"]);
                }
            }
        }
    }
    const Ended show = runAs(program(), {"--format", "json", "show"});
    EXPECT_EQ(show.status, 0);
    std::vector<std::string> shown;
    const auto overview = nlohmann::json::parse(show.out);
    for (const auto& interface : overview["interfaces"]) {
        shown.push_back(interface["interface"]);
        EXPECT_TRUE(interface["dhcp"].is_boolean() || interface["unknown"][0] == "dhcp");
    }
    EXPECT_EQ(shown, expected);
    EXPECT_EQ(runAs(program(), {"show"}).status, 0);
}

}  // namespace
