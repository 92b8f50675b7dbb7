#include "commands/Overview.h"

#include <gtest/gtest.h>

namespace cimdhcp {
namespace {

constexpr std::int64_t moment = 1'795'320'000;  // 2026-11-22T04:00:00Z

LeaseOverview leaseOf(const std::string& client, const std::string& address, std::int64_t expires) {
    LeaseOverview lease;
    lease.family = address.find(':') == std::string::npos ? "IPv4" : "IPv6";
    lease.clientState = 8;
    lease.address = address;
    lease.expires = expires;
    lease.client = client;
    return lease;
}

InterfaceOverview interface(const std::string& name, bool dhcp, const std::string& address) {
    InterfaceOverview interface;
    interface.system = hostSystem;
    interface.name = name;
    interface.dhcp = dhcp;
    interface.active = true;
    interface.address = address;
    interface.leases.emplace();
    interface.servers.emplace();
    interface.configurationName = "";
    return interface;
}

InterfaceOverview bound() {
    InterfaceOverview bound = interface("eth0", true, "192.0.2.17");
    bound.leases = {leaseOf("dhclient", "192.0.2.17", moment + 4 * 3600)};
    bound.servers = {"192.0.2.1", "2001:db8::1"};
    bound.configurationName = "office";
    return bound;
}

InterfaceOverview fixed() {
    return interface("eth1", false, "198.51.100.4");
}

InterfaceOverview asking() {
    InterfaceOverview asking = interface("eth2", true, "");
    LeaseOverview client;
    client.family = "IPv4";
    client.clientState = 0;
    client.client = "udhcpc";
    asking.leases = {client};
    return asking;
}

/// Nothing is known but its name.
InterfaceOverview untold() {
    InterfaceOverview untold;
    untold.system = hostSystem;
    untold.name = "eth3";
    return untold;
}

InterfaceOverview ofProcessor() {
    InterfaceOverview interface = cimdhcp::interface("eth0", true, "192.0.2.200");
    interface.system = serviceProcessorSystem;
    interface.clientState = 8;
    return interface;
}

std::string rowOf(const InterfaceOverview& interface) {
    return overviewTable({interface}, moment, std::nullopt, {false, false});
}

TEST(Overview, IsATable) {
    EXPECT_EQ(overviewTable({bound(), fixed(), asking(), untold()}, moment, std::nullopt),
              "INTERFACE  DHCP  STATE   CLIENT    ADDRESS       EXPIRES  SERVERS                 "
              "CONFIGURATION NAME\n"
              "eth0       on    bound   dhclient  192.0.2.17    in 4 h   192.0.2.1, 2001:db8::1  "
              "office\n"
              "eth1       off   off     -         198.51.100.4  -        -                       "
              "-\n"
              "eth2       on    asking  udhcpc    -             -        -                       "
              "-\n"
              "eth3       ?     ?       ?         ?             ?        ?                       "
              "?\n");
}

TEST(Overview, HasTheSystemWhereThereAreTwo) {
    EXPECT_EQ(overviewTable({fixed(), ofProcessor()}, moment, std::nullopt),
              "SYSTEM    INTERFACE  DHCP  STATE  CLIENT  ADDRESS       EXPIRES  SERVERS  "
              "CONFIGURATION NAME\n"
              "Computer  eth1       off   off    -       198.51.100.4  -        -        -\n"
              "BMC       eth0       on    bound  ?       192.0.2.200   ?        -        -\n");
}

TEST(Overview, SaysThatNoInterfaceUsesDhcp) {
    const std::string text = overviewTable({fixed()}, moment, std::nullopt);
    EXPECT_EQ(text.substr(text.find('\n', text.find("eth1")) + 1),
              "No interface of this machine uses DHCP.\n");
    // It would be a guess when it is not known.
    EXPECT_EQ(overviewTable({untold()}, moment, std::nullopt).find("No interface"),
              std::string::npos);
}

TEST(Overview, SaysThatThereAreNoInterfaces) {
    EXPECT_EQ(overviewTable({}, moment, std::nullopt), "This machine has no network interfaces.\n");
}

TEST(Overview, FitsATerminal) {
    EXPECT_EQ(overviewTable({bound()}, moment, 80),
              "INTERFACE  DHCP  STATE  ADDRESS     EXPIRES  SERVERS      CONFIGURATION NAME\n"
              "eth0       on    bound  192.0.2.17  in 4 h   192.0.2.1,   office\n"
              "                                             2001:db8::1\n"
              "(without CLIENT: --wide shows all)\n");
}

TEST(Overview, HeadingsAreStrongWhereThereAreColors) {
    EXPECT_EQ(overviewTable({fixed()}, moment, std::nullopt, {true, true}).substr(0, 13),
              "\x1B[1mINTERFACE");
    EXPECT_EQ(overviewTable({fixed()}, moment, std::nullopt, {true, false}).substr(0, 9),
              "INTERFACE");
}

TEST(Overview, WithoutHeadingsIsRowsAlone) {
    const Style bare{false, false};
    EXPECT_EQ(overviewTable({}, moment, std::nullopt, bare), "");
    EXPECT_EQ(rowOf(interface("eth0", false, "")), "eth0  off  off  -  -  -  -  -\n");
}

TEST(Overview, TellsWhenALeaseEnds) {
    InterfaceOverview one = bound();
    LeaseOverview& lease = one.leases->front();
    lease.expires = static_cast<std::int64_t>(ZR::NodeLexicon::never);
    EXPECT_EQ(rowOf(one),
              "eth0  on  bound  dhclient  192.0.2.17  never  192.0.2.1, 2001:db8::1  office\n");
    lease.expires = moment - 7200;
    EXPECT_EQ(rowOf(one),
              "eth0  on  expired  dhclient  192.0.2.17  2 h ago  192.0.2.1, 2001:db8::1  office\n");
    lease.expires = std::nullopt;
    EXPECT_EQ(rowOf(one),
              "eth0  on  bound  dhclient  192.0.2.17  ?  192.0.2.1, 2001:db8::1  office\n");
}

TEST(Overview, OfAClientThatKeepsNoLeaseTheEndIsNotKnown) {
    InterfaceOverview one = asking();
    one.address = "192.0.2.17";
    one.addressSource = 1;
    EXPECT_EQ(rowOf(one), "eth2  on  bound  udhcpc  192.0.2.17  ?  -  -\n");
}

TEST(Overview, ShowsTheLeaseThatThereIsWithoutALink) {
    InterfaceOverview one = bound();
    one.active = false;
    EXPECT_EQ(rowOf(one),
              "eth0  on  no link  dhclient  192.0.2.17  in 4 h  192.0.2.1, 2001:db8::1  office\n");
    one = asking();
    one.active = false;
    EXPECT_EQ(rowOf(one), "eth2  on  no link  udhcpc  -  -  -  -\n");
}

TEST(Overview, HasTheAddressOfIPv6WhereThereIsNoneOfIPv4) {
    InterfaceOverview one = asking();
    one.leases->push_back(leaseOf("dhcp6c", "2001:db8::17", moment + 600));
    EXPECT_EQ(rowOf(one), "eth2  on  bound  dhcp6c  2001:db8::17  in 10 min  -  -\n");
    one.leases->back().expires = moment;
    EXPECT_EQ(rowOf(one), "eth2  on  expired  dhcp6c  -  in 0 s  -  -\n");
}

TEST(Overview, TellsOfTwoFamiliesThatOfIPv4) {
    InterfaceOverview one = bound();
    one.leases->insert(one.leases->begin(), leaseOf("dhcp6c", "2001:db8::17", moment + 600));
    EXPECT_EQ(rowOf(one), rowOf(bound()));
}

TEST(Overview, OfALeaseWithoutAClientsNameTheClientIsNotKnown) {
    InterfaceOverview one = bound();
    one.leases->front().client.clear();
    EXPECT_EQ(rowOf(one),
              "eth0  on  bound  ?  192.0.2.17  in 4 h  192.0.2.1, 2001:db8::1  office\n");
}

TEST(Overview, IsSortedByWhenLeasesEnd) {
    std::vector<InterfaceOverview> rows{untold(), bound(), fixed(), bound()};
    rows[3].name = "eth4";
    rows[3].leases->front().expires = moment + 1800;  // "in 30 min", and so before "in 4 h"
    sortBy("expires", overviewColumns(moment), rows);
    std::string order;
    for (const InterfaceOverview& each : rows) {
        order += each.name + ' ';
    }
    EXPECT_EQ(order, "eth1 eth4 eth0 eth3 ");
}

TEST(Overview, IsJson) {
    InterfaceOverview one = bound();
    LeaseOverview& lease = one.leases->front();
    lease.server = "192.0.2.1";
    lease.obtained = moment;
    lease.renews = moment + 7200;
    lease.rebinds = moment + 12600;
    lease.options = {1, 3, 6};
    lease.clientIdentifier = "01:02";
    lease.process = 17;
    lease.source = "/var/lib/dhcp/dhclient.leases";
    EXPECT_EQ(overviewJson({one, asking(), untold()}, moment), R"({
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
        "seconds": 1795334400,
        "time": "2026-11-22T08:00:00Z"
      },
      "servers": [
        "192.0.2.1",
        "2001:db8::1"
      ],
      "configurationName": "office",
      "leases": [
        {
          "state": "bound",
          "family": "IPv4",
          "clientState": 8,
          "address": "192.0.2.17",
          "serverAddress": "192.0.2.1",
          "leaseObtained": {
            "seconds": 1795320000,
            "time": "2026-11-22T04:00:00Z"
          },
          "renewalTime": {
            "seconds": 1795327200,
            "time": "2026-11-22T06:00:00Z"
          },
          "rebindingTime": {
            "seconds": 1795332600,
            "time": "2026-11-22T07:30:00Z"
          },
          "leaseExpires": {
            "seconds": 1795334400,
            "time": "2026-11-22T08:00:00Z"
          },
          "optionsReceived": [
            1,
            3,
            6
          ],
          "clientIdentifier": "01:02",
          "client": "dhclient",
          "process": 17,
          "source": "/var/lib/dhcp/dhclient.leases"
        }
      ],
      "unknown": []
    },
    {
      "interface": "eth2",
      "system": "Computer",
      "dhcp": true,
      "state": "asking",
      "link": true,
      "client": "udhcpc",
      "address": null,
      "expires": null,
      "servers": [],
      "configurationName": null,
      "leases": [
        {
          "state": "asking",
          "family": "IPv4",
          "clientState": 0,
          "address": null,
          "serverAddress": null,
          "leaseObtained": null,
          "renewalTime": null,
          "rebindingTime": null,
          "leaseExpires": null,
          "optionsReceived": [],
          "clientIdentifier": null,
          "client": "udhcpc",
          "process": null,
          "source": null
        }
      ],
      "unknown": []
    },
    {
      "interface": "eth3",
      "system": "Computer",
      "dhcp": null,
      "state": null,
      "link": null,
      "client": null,
      "address": null,
      "expires": null,
      "servers": null,
      "configurationName": null,
      "leases": null,
      "unknown": [
        "dhcp",
        "state",
        "client",
        "address",
        "expires",
        "servers",
        "configurationName",
        "link",
        "leases"
      ]
    }
  ]
}
)");
}

TEST(UnknownText, IsEmptyWhereAllIsKnown) {
    EXPECT_EQ(unknownText({bound(), fixed(), asking()}, moment), "");
}

TEST(UnknownText, GathersLikeInterfaces) {
    InterfaceOverview hidden = interface("eth5", true, "");
    hidden.dhcp = std::nullopt;
    InterfaceOverview other = hidden;
    other.name = "eth6";
    InterfaceOverview endless = bound();
    endless.leases->front().expires = std::nullopt;
    EXPECT_EQ(unknownText({hidden, endless, other, ofProcessor()}, moment),
              "cimdhcp: note: eth5, eth6: nothing tells DHCP, STATE, CLIENT and EXPIRES\n"
              "cimdhcp: note: eth0: nothing tells EXPIRES\n"
              "cimdhcp: note: eth0 of BMC: nothing tells CLIENT and EXPIRES\n");
}

TEST(UnknownText, IsOneLineForAnotherMachine) {
    InterfaceOverview on = untold();
    on.dhcp = true;
    on.clientState = 8;
    on.address = "192.0.2.17";
    on.servers.emplace();
    on.configurationName = "";
    InterfaceOverview disabled = on;
    disabled.clientState = 0;
    InterfaceOverview off = on;
    off.dhcp = false;
    EXPECT_EQ(unknownText({on, off}, moment),
              "cimdhcp: note: the server does not tell CLIENT and EXPIRES\n");
    EXPECT_EQ(unknownText({on, disabled}, moment),
              "cimdhcp: note: the server does not tell STATE, CLIENT and EXPIRES\n");
    EXPECT_EQ(unknownText({off}, moment), "");
}

}  // namespace
}  // namespace cimdhcp
