#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "ProgramRun.h"

namespace {

using test::Ended;

class InstanceCommands : public test::ProgramTest {};

TEST_F(InstanceCommands, NamesListsPaths) {
    EXPECT_EQ(run({"names", "QVXZR_DHCPSettingData"}),
              (Ended{0,
                     "root/cimv2:QVXZR_DHCPSettingData.InstanceID=\"Computer%eth0\"\n"
                     "root/cimv2:QVXZR_DHCPSettingData.InstanceID=\"Computer%eth1\"\n",
                     ""}));
}

TEST_F(InstanceCommands, NamesAsMofAndJson) {
    EXPECT_EQ(run({"--format", "mof", "names", "QVXZR_DHCPCapabilities"}),
              (Ended{0,
                     "instance of QVXZR_DHCPCapabilities {\n"
                     "    InstanceID = \"eth0\";\n"
                     "};\n",
                     ""}));
    EXPECT_EQ(run({"--format", "json", "names", "QVXZR_DHCPCapabilities"}), (Ended{0, R"({
  "operation": "EnumerateInstanceNames",
  "status": {
    "code": 0,
    "name": "OK"
  },
  "returnDone": 1,
  "paths": [
    "root/cimv2:QVXZR_DHCPCapabilities.InstanceID=\"eth0\""
  ],
  "instances": []
}
)",
                                                                                   ""}));
}

TEST_F(InstanceCommands, NamesReachesTheSubclassesOfAStandardClass) {
    EXPECT_EQ(run({"names", "cim_dhcpprotocolendpoint"}),
              (Ended{0, endpointPath("eth0") + "\n", ""}));
}

TEST_F(InstanceCommands, InstancesShowsMeanings) {
    EXPECT_EQ(run({"instances", "QVXZR_DHCPProtocolEndpoint"}),
              (Ended{0,
                     endpointPath("eth0") +
                         "\n"
                         "  ElementName             = \"eth0\"\n"
                         "  RequestedState          = 2 (Enabled)\n"
                         "  SystemCreationClassName = \"QVXZR_ComputerSystem\"\n"
                         "  SystemName              = \"" +
                         hostName() +
                         "\"\n"
                         "  CreationClassName       = \"QVXZR_DHCPProtocolEndpoint\"\n"
                         "  Description             = \"Ethernet interface\"\n"
                         "  EnabledState            = 2 (Enabled)\n"
                         "  Name                    = \"eth0\"\n"
                         "  NameFormat              = \"NICName\"\n"
                         "  ProtocolIFType          = 1 (Other)\n"
                         "  OtherTypeDescription    = \"DHCP\"\n"
                         "  ClientState             = 8 (Bound)\n"
                         "  OptionsReceived         = {8 (Domain Name Server), 14 (Host Name), "
                         "17 (Domain Name)}\n",
                     ""}));
}

TEST_F(InstanceCommands, InstancesWrapsValuesOnATerminal) {
    EXPECT_EQ(runOnTerminal(50, {"--color", "never", "instances", "QVXZR_DHCPCapabilities"}),
              (Ended{0,
                     "root/cimv2:QVXZR_DHCPCapabilities.InstanceID=\"eth0\"\n"
                     "  InstanceID               = \"eth0\"\n"
                     "  ElementName              = \"eth0\"\n"
                     "  ElementNameEditSupported = FALSE\n"
                     "  MaxElementNameLen        = 15\n"
                     "  OptionsSupported         = {8 (Domain Name\n"
                     "                             Server), 14 (Host\n"
                     "                             Name), 17 (Domain\n"
                     "                             Name)}\n",
                     ""}));
}

TEST_F(InstanceCommands, InstancesAsMof) {
    writeConfiguration("eth0", "CONFIG_NAME=the \"big\" office\n");
    EXPECT_EQ(run({"instances", "QVXZR_DHCPSettingData", "--format", "mof"}),
              (Ended{0,
                     "instance of QVXZR_DHCPSettingData {\n"
                     "    InstanceID           = \"Computer%eth0\";\n"
                     "    ElementName          = \"eth0\";\n"
                     "    AddressOrigin        = 4;  // DHCP\n"
                     "    RequestedIPv4Address = \"192.0.2.17\";\n"
                     "    ConfigurationName    = \"the \\\"big\\\" office\";\n"
                     "};\n"
                     "\n"
                     "instance of QVXZR_DHCPSettingData {\n"
                     "    InstanceID           = \"Computer%eth1\";\n"
                     "    ElementName          = \"eth1\";\n"
                     "    AddressOrigin        = 4;  // DHCP\n"
                     "    RequestedIPv4Address = \"198.51.100.4\";\n"
                     "};\n",
                     ""}));
}

TEST_F(InstanceCommands, InstancesAsJson) {
    EXPECT_EQ(run({"instances", "QVXZR_DHCPCapabilities", "--format", "json"}), (Ended{0, R"({
  "operation": "EnumerateInstances",
  "status": {
    "code": 0,
    "name": "OK"
  },
  "returnDone": 1,
  "paths": [],
  "instances": [
    {
      "path": "root/cimv2:QVXZR_DHCPCapabilities.InstanceID=\"eth0\"",
      "class": "QVXZR_DHCPCapabilities",
      "properties": {
        "InstanceID": {
          "type": "string",
          "value": "eth0"
        },
        "ElementName": {
          "type": "string",
          "value": "eth0"
        },
        "ElementNameEditSupported": {
          "type": "boolean",
          "value": false
        },
        "MaxElementNameLen": {
          "type": "uint16",
          "value": 15
        },
        "OptionsSupported": {
          "type": "uint16",
          "value": [
            8,
            14,
            17
          ]
        }
      }
    }
  ]
}
)",
                                                                                       ""}));
}

TEST_F(InstanceCommands, GetFindsAnInstanceWithOrWithoutItsNamespace) {
    const Ended expected{0,
                         "root/cimv2:QVXZR_DHCPSettingData.InstanceID=\"Computer%eth1\"\n"
                         "  InstanceID           = \"Computer%eth1\"\n"
                         "  ElementName          = \"eth1\"\n"
                         "  AddressOrigin        = 4 (DHCP)\n"
                         "  RequestedIPv4Address = \"198.51.100.4\"\n",
                         ""};
    EXPECT_EQ(run({"get", "QVXZR_DHCPSettingData.InstanceID=\"Computer%eth1\""}), expected);
    EXPECT_EQ(run({"get", "root/cimv2:QVXZR_DHCPSettingData.InstanceID=\"Computer%eth1\""}),
              expected);
    EXPECT_EQ(run({"--namespace", "root/other", "get",
                   "/root/cimv2:qvxzr_dhcpsettingdata.instanceid=\"Computer%eth1\""}),
              expected);
}

TEST_F(InstanceCommands, GetTellsThatThereIsNone) {
    EXPECT_EQ(run({"get", "QVXZR_DHCPCapabilities.InstanceID=\"eth7\""}),
              (Ended{1, "",
                     "cimdhcp: CIM_ERR_NOT_FOUND: there is no "
                     "QVXZR_DHCPCapabilities.InstanceID=\"eth7\"; \"cimdhcp names "
                     "QVXZR_DHCPCapabilities\" lists what there is\n"}));
}

TEST_F(InstanceCommands, ErrorsAreInTheJsonToo) {
    EXPECT_EQ(run({"--format", "json", "get", "QVXZR_DHCPCapabilities.InstanceID=\"eth7\""}).out,
              R"({
  "operation": "GetInstance",
  "status": {
    "code": 6,
    "name": "CIM_ERR_NOT_FOUND"
  },
  "returnDone": 0,
  "paths": [],
  "instances": []
}
)");
}

TEST_F(InstanceCommands, UnknownClassesAndNamespacesAreErrors) {
    EXPECT_EQ(run({"names", "TEST_Unknown"}),
              (Ended{1, "",
                     "cimdhcp: CIM_ERR_INVALID_CLASS: no class \"TEST_Unknown\"; \"cimdhcp "
                     "classes\" lists what is\n"}));
    EXPECT_EQ(run({"--namespace", "root/other", "instances", "QVXZR_DHCPSettingData"}),
              (Ended{1, "", "cimdhcp: CIM_ERR_INVALID_NAMESPACE: no namespace \"root/other\"\n"}));
}

TEST_F(InstanceCommands, NothingIsNoError) {
    setTree("");
    EXPECT_EQ(run({"names", "QVXZR_DHCPSettingData"}), (Ended{0, "", ""}));
    EXPECT_EQ(run({"instances", "QVXZR_DHCPSettingData"}), (Ended{0, "", ""}));
}

}  // namespace
