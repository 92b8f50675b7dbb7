#include "commands/Overview.h"

#include <gtest/gtest.h>

namespace cimdhcp {
namespace {

const InterfaceOverview bound{
    "Computer", "eth0", true, "bound", "192.0.2.17", {"192.0.2.1", "2001:db8::1"}, "office"};
const InterfaceOverview fixed{"Computer", "eth1", false, "active", "198.51.100.4", {}, ""};
const InterfaceOverview untold{"Computer", "eth2", std::nullopt, "", "", {}, ""};
const InterfaceOverview ofProcessor{"BMC", "eth0", true, "disabled", "", {}, ""};

TEST(Overview, IsATable) {
    EXPECT_EQ(overviewTable({bound, fixed, untold}, std::nullopt),
              "INTERFACE  DHCP  STATE   ADDRESS       SERVERS                 CONFIGURATION NAME\n"
              "eth0       on    bound   192.0.2.17    192.0.2.1, 2001:db8::1  office\n"
              "eth1       off   active  198.51.100.4  -                       -\n"
              "eth2       -     -       -             -                       -\n");
}

TEST(Overview, HasTheSystemWhereThereAreTwo) {
    EXPECT_EQ(overviewTable({fixed, ofProcessor}, std::nullopt),
              "SYSTEM    INTERFACE  DHCP  STATE     ADDRESS       SERVERS  CONFIGURATION NAME\n"
              "Computer  eth1       off   active    198.51.100.4  -        -\n"
              "BMC       eth0       on    disabled  -             -        -\n");
}

TEST(Overview, SaysThatNoInterfaceUsesDhcp) {
    EXPECT_EQ(overviewTable({fixed}, std::nullopt),
              "INTERFACE  DHCP  STATE   ADDRESS       SERVERS  CONFIGURATION NAME\n"
              "eth1       off   active  198.51.100.4  -        -\n"
              "No interface of this machine uses DHCP.\n");
    // It would be a guess when the provider did not tell.
    EXPECT_EQ(overviewTable({untold}, std::nullopt).find("No interface"), std::string::npos);
}

TEST(Overview, SaysThatThereAreNoInterfaces) {
    EXPECT_EQ(overviewTable({}, std::nullopt), "This machine has no network interfaces.\n");
}

TEST(Overview, FitsATerminal) {
    EXPECT_EQ(overviewTable({bound}, 60),
              "INTERFACE  DHCP  STATE  ADDRESS     SERVERS      CONFIGURAT…\n"
              "eth0       on    bound  192.0.2.17  192.0.2.1,…  office\n");
}

TEST(Overview, IsJson) {
    EXPECT_EQ(overviewJson({bound, untold}), R"({
  "interfaces": [
    {
      "interface": "eth0",
      "system": "Computer",
      "dhcp": true,
      "state": "bound",
      "address": "192.0.2.17",
      "servers": [
        "192.0.2.1",
        "2001:db8::1"
      ],
      "configurationName": "office"
    },
    {
      "interface": "eth2",
      "system": "Computer",
      "dhcp": null,
      "state": null,
      "address": null,
      "servers": [],
      "configurationName": null
    }
  ]
}
)");
}

TEST(DiagnosticLine, IsOneLineOrNone) {
    EXPECT_EQ(diagnosticLine({}), "");
    const std::vector<ZR::Diagnostic> diagnostics{
        ZR::Diagnostic{"cannot read /a: Permission denied"}, ZR::Diagnostic{"cannot read \nb"}};
    EXPECT_EQ(diagnosticLine(std::span{diagnostics}.first(1)),
              "cimdhcp: not everything could be read: cannot read /a: Permission denied\n");
    const std::string both = diagnosticLine(diagnostics);
    EXPECT_EQ(both.find('\n'), both.size() - 1) << both;
    EXPECT_NE(both.find("Permission denied; cannot read"), std::string::npos) << both;
    EXPECT_EQ(
        diagnosticLine(std::vector(6, ZR::Diagnostic{"a"})),
        "cimdhcp: not everything could be read: a; a; a; a; and 2 more, which are in the log\n");
}

TEST(Overview, WithoutHeadingsIsRowsAlone) {
    const Style bare{false, false};
    EXPECT_EQ(overviewTable({}, std::nullopt, bare), "");
    EXPECT_EQ(overviewTable({{"Computer", "eth0", false, "", "", {}, ""}}, std::nullopt, bare),
              "eth0  off  -  -  -  -\n");
}

}  // namespace
}  // namespace cimdhcp
