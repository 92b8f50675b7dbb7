#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "ProgramRun.h"

namespace {

using test::Ended;
using ZR::Testing::readFile;

const std::string setting = "QVXZR_DHCPSettingData.InstanceID=\"Computer%eth0\"";

class Modify : public test::ProgramTest {};

TEST_F(Modify, ChangesTheConfigurationName) {
    writeConfiguration("eth0", "DEVICE=eth0\nCONFIG_NAME=home\n");
    EXPECT_EQ(run({"modify", setting, "configurationname=a=b c"}), (Ended{0, "Modified.\n", ""}));
    EXPECT_EQ(readFile(configuration("eth0")), "DEVICE=eth0\nCONFIG_NAME=a=b c\n");
}

TEST_F(Modify, IsQuietInOtherFormats) {
    writeConfiguration("eth0", "CONFIG_NAME=home\n");
    EXPECT_EQ(run({"--format", "mof", "modify", setting, "ConfigurationName=x"}),
              (Ended{0, "", ""}));
    EXPECT_EQ(run({"--format", "json", "modify", setting, "ConfigurationName=y"}), (Ended{0, R"({
  "operation": "ModifyInstance",
  "status": {
    "code": 0,
    "name": "OK"
  },
  "paths": [],
  "instances": []
}
)",
                                                                                          ""}));
    EXPECT_EQ(readFile(configuration("eth0")), "CONFIG_NAME=y\n");
}

TEST_F(Modify, TellsWhatAPropertyTakes) {
    EXPECT_EQ(run({"modify", setting, "AddressOrigin=fixed"}),
              (Ended{2, "",
                     "cimdhcp: AddressOrigin cannot be \"fixed\": it takes a number from 0 to "
                     "65535\n"}));
    EXPECT_EQ(
        run({"modify", setting, "ConfigurationName"}),
        (Ended{
            2, "",
            "cimdhcp: \"ConfigurationName\" is not an assignment of the form PROPERTY=VALUE\n"}));
    EXPECT_EQ(run({"modify", setting, "ElementName=a", "elementname=b"}),
              (Ended{2, "", "cimdhcp: elementname is given twice\n"}));
}

TEST_F(Modify, RefusesPropertiesThatTheClassDoesNotHave) {
    EXPECT_EQ(run({"modify", setting, "Colour=red"}),
              (Ended{1, "",
                     "cimdhcp: CIM_ERR_NO_SUCH_PROPERTY: QVXZR_DHCPSettingData has no property "
                     "\"Colour\"\n"}));
}

TEST_F(Modify, IsRefusedByClassesThatCannotBeChanged) {
    EXPECT_EQ(run({"modify", "QVXZR_DHCPCapabilities.InstanceID=\"eth0\"", "MaxElementNameLen=4"}),
              (Ended{1, "",
                     "cimdhcp: not changed: MaxElementNameLen of QVXZR_DHCPCapabilities cannot be "
                     "written\n"}));
}

TEST_F(Modify, RefusesPropertiesThatTheProviderDoesNotTake) {
    writeConfiguration("eth0", "CONFIG_NAME=home\n");
    // The standard's class lets a client write the one, and none the other.
    for (const char* property : {"ClientIdentifier", "ElementName", "InstanceID"}) {
        EXPECT_EQ(run({"modify", setting, std::string(property) + "=x"}),
                  (Ended{1, "",
                         "cimdhcp: not changed: " + std::string(property) +
                             " of QVXZR_DHCPSettingData cannot be written, only ConfigurationName "
                             "can\n"}));
    }
    EXPECT_EQ(run({"modify", setting, "ConfigurationName=x", "ElementName=y"}).status, 1);
    EXPECT_EQ(readFile(configuration("eth0")), "CONFIG_NAME=home\n");
}

TEST_F(Modify, RefusesAnInstanceThatDoesNotExist) {
    EXPECT_EQ(run({"modify", "QVXZR_DHCPSettingData.InstanceID=\"Computer%eth7\"",
                   "ConfigurationName=x"}),
              (Ended{1, "",
                     "cimdhcp: CIM_ERR_NOT_FOUND: there is no "
                     "QVXZR_DHCPSettingData.InstanceID=\"Computer%eth7\"; \"cimdhcp "
                     "names QVXZR_DHCPSettingData\" lists what there is\n"}));
}

TEST_F(Modify, RefusesBlanksAtTheEnds) {
    writeConfiguration("eth0", "CONFIG_NAME=home\n");
    for (const char* name : {" x", "x ", " "}) {
        EXPECT_EQ(run({"modify", setting, std::string("ConfigurationName=") + name}),
                  (Ended{2, "",
                         "cimdhcp: ConfigurationName cannot be \"" + std::string(name) +
                             "\": blanks at its ends would not come back\n"}));
    }
    EXPECT_EQ(readFile(configuration("eth0")), "CONFIG_NAME=home\n");
}

TEST_F(Modify, TellsThatNothingWasChanged) {
    EXPECT_EQ(run({"modify", setting, "ConfigurationName=office"}),
              (Ended{1, "",
                     "cimdhcp: CIM_ERR_FAILED: " + configuration("eth0") +
                         ": No such file or directory\n"}));
    // The exact provider returns OK without a file, too.
    EXPECT_EQ(
        run({"--exact", "modify", setting, "ConfigurationName=office"}),
        (Ended{1, "",
               "cimdhcp: not changed: ConfigurationName is still not set, not \"office\"\n"}));
    writeConfiguration("eth0", "CONFIG_NAME=home\n");
    EXPECT_EQ(run({"modify", setting, "ConfigurationName=home"}),
              (Ended{1, "", "cimdhcp: not changed: ConfigurationName is \"home\" already\n"}));
}

TEST_F(Modify, TellsWhatCameOutOtherThanWanted) {
    writeConfiguration("eth0", "CONFIG_NAME=home\n");
    EXPECT_EQ(run({"modify", setting, "ConfigurationName='x'"}),
              (Ended{1, "",
                     "cimdhcp: CIM_ERR_FAILED: " + configuration("eth0") +
                         " gives the name \"x\", not \"'x'\": blanks around a name and "
                         "quotation marks do not count, and the log of the provider tells of a "
                         "failed write\n"}));
    writeConfiguration("eth0", "CONFIG_NAME=home\n");
    EXPECT_EQ(run({"--exact", "modify", setting, "ConfigurationName='x'"}),
              (Ended{1, "",
                     "cimdhcp: not changed as wanted: ConfigurationName is now \"x\", not "
                     "\"'x'\"\n"}));
}

TEST_F(Modify, TakesTheNameAway) {
    writeConfiguration("eth0", "CONFIG_NAME=home\n");
    EXPECT_EQ(run({"modify", setting, "ConfigurationName="}), (Ended{0, "Modified.\n", ""}));
    EXPECT_EQ(readFile(configuration("eth0")), "CONFIG_NAME=\n");
}

TEST_F(Modify, NeedsAnInstance) {
    writeConfiguration("eth0", "CONFIG_NAME=home\n");
    EXPECT_EQ(run({"modify", "QVXZR_DHCPSettingData", "ConfigurationName=x"}).status, 2);
    EXPECT_EQ(readFile(configuration("eth0")), "CONFIG_NAME=home\n");
}

TEST_F(Modify, RefusesControlCharacters) {
    writeConfiguration("eth0", "CONFIG_NAME=home\n");
    const Ended ended = run({"modify", setting, "ConfigurationName=a\nDEVICE=b"});
    EXPECT_EQ(ended.status, 1);
    EXPECT_EQ(ended.err.substr(0, 35), "cimdhcp: CIM_ERR_INVALID_PARAMETER:");
    EXPECT_EQ(readFile(configuration("eth0")), "CONFIG_NAME=home\n");
}

}  // namespace
