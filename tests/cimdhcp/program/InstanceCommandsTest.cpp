#include <gtest/gtest.h>

#include <nlohmann/json.hpp>
#include <sstream>

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
  "paths": [],
  "instances": []
}
)");
}

TEST_F(InstanceCommands, PropertyListsLeaveTheRestOut) {
    EXPECT_EQ(run({"instances", "QVXZR_DHCPCapabilities", "--properties",
                   "maxelementnamelen,InstanceID"}),
              (Ended{0,
                     "root/cimv2:QVXZR_DHCPCapabilities.InstanceID=\"eth0\"\n"
                     "  MaxElementNameLen = 15\n"
                     "  InstanceID        = \"eth0\"\n",
                     ""}));
    EXPECT_EQ(run({"--format", "mof", "get", "QVXZR_DHCPCapabilities.InstanceID=\"eth0\"",
                   "--properties", "ElementName"})
                  .out,
              "instance of QVXZR_DHCPCapabilities {\n"
              "    ElementName = \"eth0\";\n"
              "};\n");
    EXPECT_EQ(run({"instances", "QVXZR_DHCPCapabilities", "--properties", "ElementNames"}),
              (Ended{1, "",
                     "cimdhcp: CIM_ERR_NO_SUCH_PROPERTY: QVXZR_DHCPCapabilities has no property "
                     "\"ElementNames\"; did you mean ElementName?\n"}));
    // What a subclass alone has.
    EXPECT_EQ(run({"instances", "CIM_Capabilities", "--properties", "OptionsSupported"}).status, 0);
}

TEST_F(InstanceCommands, HaveColumns) {
    EXPECT_EQ(run({"--format", "tsv", "instances", "QVXZR_DHCPCapabilities", "--properties",
                   "OptionsSupported,Caption,ElementNameEditSupported"}),
              (Ended{0,
                     "PATH\tOptionsSupported\tCaption\tElementNameEditSupported\n"
                     "root/cimv2:QVXZR_DHCPCapabilities.InstanceID=\"eth0\"\t{8, 14, 17}\t\t"
                     "FALSE\n",
                     ""}));
    EXPECT_EQ(run({"instances", "QVXZR_DHCPSettingData", "--columns",
                   "elementname,AddressOrigin,ConfigurationName"}),
              (Ended{0,
                     "ElementName  AddressOrigin  ConfigurationName\n"
                     "eth0         4 (DHCP)       -\n"
                     "eth1         4 (DHCP)       -\n",
                     ""}));
    EXPECT_EQ(run({"--format", "tsv", "--no-header", "names", "QVXZR_DHCPCapabilities"}).out,
              "root/cimv2:QVXZR_DHCPCapabilities.InstanceID=\"eth0\"\n");
    EXPECT_EQ(run({"instances", "QVXZR_DHCPSettingData", "--columns", "Colour"}).status, 2);
}

TEST_F(InstanceCommands, DescribeTellsWhatTheSchemaDoes) {
    const Ended text = run({"describe", "qvxzr_dhcpsettingdata"});
    EXPECT_EQ(text.status, 0);
    EXPECT_EQ(text.out.substr(0, text.out.find('\n')),
              "class QVXZR_DHCPSettingData : CIM_DHCPSettingData");
    EXPECT_NE(text.out.find("\n    InstanceID  string, key\n"), std::string::npos);
    EXPECT_NE(text.out.find("\n    ConfigurationName  string, writable\n"), std::string::npos);
    EXPECT_NE(text.out.find("4 (DHCP)"), std::string::npos);
    EXPECT_EQ(
        run({"describe", "QVXZR_DHCPCapabilities", "--count"}).out,
        std::to_string(nlohmann::json::parse(
                           run({"describe", "QVXZR_DHCPCapabilities", "--format", "json"}).out)
                           .at("properties")
                           .size()) +
            "\n");
    EXPECT_EQ(run({"--format", "tsv", "describe", "QVXZR_DHCPElementCapabilities", "--columns",
                   "property,type,key,writable"})
                  .out,
              "PROPERTY\tTYPE\tKEY\tWRITABLE\n"
              "ManagedElement\tQVXZR_DHCPProtocolEndpoint REF\tyes\t\n"
              "Capabilities\tQVXZR_DHCPCapabilities REF\tyes\t\n"
              "Characteristics\tuint16[]\t\t\n");
    EXPECT_EQ(
        run({"describe", "QVXZR_DHCPLeese"}),
        (Ended{1, "",
               "cimdhcp: CIM_ERR_INVALID_CLASS: GetClass of QVXZR_DHCPLeese: the class is not "
               "served; \"cimdhcp classes\" lists what is; did you mean QVXZR_DHCPLease?\n"}));
}

TEST_F(InstanceCommands, TellWhichKeysThereAre) {
    EXPECT_EQ(run({"get", "QVXZR_DHCPCapabilities.Name=\"eth0\""}),
              (Ended{1, "",
                     "cimdhcp: CIM_ERR_INVALID_PARAMETER: the key InstanceID of "
                     "QVXZR_DHCPCapabilities is missing; QVXZR_DHCPCapabilities has the key "
                     "InstanceID\n"}));
}

TEST_F(InstanceCommands, TableOfClassesKeepsNamesWholeOnATerminal) {
    const Ended ended = runOnTerminal(80, {"--color", "never", "classes"});
    const Ended whole = run({"--no-header", "classes"});
    std::istringstream lines(whole.out);
    for (std::string name; lines >> name; std::getline(lines, name)) {
        EXPECT_NE(ended.out.find("\n" + name + ' '), std::string::npos) << name;
    }
    EXPECT_NE(ended.out.find("\n(without PROVIDER"), std::string::npos);
    EXPECT_EQ(ended.out.find("…"), std::string::npos);
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
