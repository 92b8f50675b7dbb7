#include "Lindows/DHCPSettingData.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <array>
#include <filesystem>
#include <map>
#include <optional>
#include <thread>

#include "Elements.h"
#include "kit/Files.h"
#include "kit/Tree.h"

namespace {

using test::computer;
using test::dhcpInterface;
using test::host;
using test::interface;
using test::LogCapture;
using test::serviceProcessor;
using test::staticInterface;
using test::text;
using ZR::Testing::readFile;
using ZR::Testing::writeFile;
using Setting = ZR::DHCPClientProvider::DHCPSettingData;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::MatchesRegex;

class DHCPSettingDataTest : public test::TreeTest {
  protected:
    static std::vector<std::string> walk(Setting& setting) {
        return test::walk(setting, &Setting::getInstanceID);
    }

    static std::string fileOf(const std::string& interfaceName) {
        return dataDirectory() + "ifcfg-" + interfaceName;
    }

    /// All that is in the data directory: the path of each entry below it, and the
    /// content of files.
    static std::map<std::string, std::string> entries() {
        std::map<std::string, std::string> found;
        for (const auto& entry : std::filesystem::recursive_directory_iterator(dataDirectory())) {
            found[entry.path().lexically_relative(dataDirectory())] =
                entry.is_regular_file() ? readFile(entry.path()) : "(no file)";
        }
        return found;
    }
};

TEST_F(DHCPSettingDataTest, NoInterfaceNodesGiveNoRecords) {
    setTree({host({})});
    const Setting setting;
    EXPECT_FALSE(setting);
    EXPECT_FALSE(setting.isOnRecord());
}

TEST_F(DHCPSettingDataTest, WalksEveryInterfaceWhetherItUsesDHCPOrNot) {
    setTree({host({staticInterface("eth0"), dhcpInterface("eth1"), interface("eth2")}),
             serviceProcessor({staticInterface("bmc0")})});
    Setting setting;
    EXPECT_THAT(walk(setting),
                ElementsAre("Computer%eth0", "Computer%eth1", "Computer%eth2", "BMC%bmc0"));
}

TEST_F(DHCPSettingDataTest, InstanceIDTellsServiceProcessorFromEveryOtherComputer) {
    setTree({serviceProcessor({interface("eth1")}), host({interface("eth1")}),
             computer("bmc", "x", {interface("eth2")}), computer("BMC2", "y", {interface("eth3")}),
             interface("eth4")});
    Setting setting;
    EXPECT_THAT(walk(setting), ElementsAre("BMC%eth1", "Computer%eth1", "Computer%eth2",
                                           "Computer%eth3", "Computer%eth4"));
}

TEST_F(DHCPSettingDataTest, UnreadableNameGivesAnInstanceIDWithoutOne) {
    setTree({host({test::namelessInterface()})});
    const Setting setting;
    EXPECT_EQ(text(setting, &Setting::getInstanceID), "Computer%");
    EXPECT_EQ(text(setting, &Setting::getElementName), test::untouched);
}

TEST_F(DHCPSettingDataTest, FilterSelectsTheOneInterface) {
    setTree({host({interface("eth0"), interface("eth1")}),
             serviceProcessor({interface("eth0"), interface("eth1")})});
    Setting setting;
    setting.setFilter(Setting::FilterByInstanceID, "BMC%eth0");
    EXPECT_THAT(walk(setting), ElementsAre("BMC%eth0"));
}

TEST_F(DHCPSettingDataTest, FilterComparesExactly) {
    setTree({host({interface("eth0"), interface("eth01")})});
    for (const char* reference : {"eth0", "computer%eth0", "Computer%eth", "Computer%eth00", ""}) {
        Setting setting;
        setting.setFilter(Setting::FilterByInstanceID, reference);
        EXPECT_FALSE(setting) << reference;
    }
}

TEST_F(DHCPSettingDataTest, FilteredStepsPassOverOtherInterfaces) {
    setTree({host({interface("eth0"), interface("eth1")}),
             computer("Computer 2", "x", {interface("eth0"), interface("eth1")})});
    Setting setting;
    setting.setFilter(Setting::FilterByInstanceID, "Computer%eth0");
    EXPECT_THAT(walk(setting), ElementsAre("Computer%eth0", "Computer%eth0"));
}

TEST_F(DHCPSettingDataTest, SecondFilterContinuesFromWhereTheFirstStopped) {
    setTree({host({interface("eth0"), interface("eth1"), interface("eth2")})});
    Setting earlier;
    earlier.setFilter(Setting::FilterByInstanceID, "Computer%eth1");
    EXPECT_TRUE(earlier);
    earlier.setFilter(Setting::FilterByInstanceID, "Computer%eth0");
    EXPECT_FALSE(earlier);

    Setting moved;
    ++moved;
    moved.setFilter(Setting::FilterByInstanceID, "Computer%eth0");
    EXPECT_FALSE(moved);

    Setting ahead;
    ++ahead;
    ahead.setFilter(Setting::FilterByInstanceID, "Computer%eth2");
    EXPECT_THAT(walk(ahead), ElementsAre("Computer%eth2"));
}

TEST_F(DHCPSettingDataTest, OtherFilterTypesNeverReject) {
    setTree({host({interface("eth0"), interface("eth1")})});
    Setting setting;
    setting.setFilter(static_cast<Setting::FilterType>(1), "nothing");
    EXPECT_TRUE(setting.evaluate());
    EXPECT_THAT(walk(setting), ElementsAre("Computer%eth0", "Computer%eth1"));
}

TEST_F(DHCPSettingDataTest, PlainProperties) {
    setTree({host({interface("eth0", {{"IPv4Address", "192.0.2.7"}})})});
    const Setting setting;
    EXPECT_EQ(text(setting, &Setting::getElementName), "eth0");
    EXPECT_EQ(test::number(setting, &Setting::getAddressOrigin), 4);
    EXPECT_EQ(text(setting, &Setting::getRequestedIPv4Address), "192.0.2.7");
}

TEST_F(DHCPSettingDataTest, UnreadableAddressFailsAndWritesNothing) {
    setTree({host({interface("eth0"), interface("eth1", {{"IPv4Address", 3221225991}})})});
    Setting setting;
    EXPECT_EQ(text(setting, &Setting::getRequestedIPv4Address), std::nullopt);
    ++setting;
    EXPECT_EQ(text(setting, &Setting::getRequestedIPv4Address), std::nullopt);
}

TEST_F(DHCPSettingDataTest, UnsupportedPropertiesAnswerFalseAndWriteNothing) {
    setTree({host({dhcpInterface("eth0")})});
    const Setting setting;
    EXPECT_EQ(text(setting, &Setting::getClientIdentifier), std::nullopt);
    EXPECT_EQ(text(setting, &Setting::getVendorClassIdentifier), std::nullopt);
    EXPECT_EQ(test::number(setting, &Setting::getRequestedLeaseTime), std::nullopt);
    EXPECT_EQ(test::number(setting, &Setting::getRequestedOptions), std::nullopt);
}

TEST_F(DHCPSettingDataTest, ConfigurationNameIsReadFromTheInterfacesFile) {
    setTree({host({interface("eth0"), interface("eth1")})});
    writeFile(fileOf("eth0"), "DEVICE=eth0\nCONFIG_NAME=first\n");
    writeFile(fileOf("eth1"), "CONFIG_NAME=old\n# CONFIG_NAME=comment\nCONFIG_NAME = \"last\" \n");
    Setting setting;
    EXPECT_EQ(text(setting, &Setting::getConfigurationName), "first");
    ++setting;
    EXPECT_EQ(text(setting, &Setting::getConfigurationName), "last");
}

TEST_F(DHCPSettingDataTest, MissingFileLeavesTheConfigurationNameAsItWas) {
    setTree({host({interface("eth0")})});
    const Setting setting;
    EXPECT_EQ(text(setting, &Setting::getConfigurationName), test::untouched);
}

TEST_F(DHCPSettingDataTest, FileWithoutTheKeyHasAnEmptyConfigurationName) {
    setTree({host({interface("eth0")})});
    writeFile(fileOf("eth0"), "DEVICE=eth0\nMY_CONFIG_NAME=x\n#CONFIG_NAME=y\n");
    const Setting setting;
    EXPECT_EQ(text(setting, &Setting::getConfigurationName), "");
}

TEST_F(DHCPSettingDataTest, DirectoryInTheFilesPlaceHasAnEmptyConfigurationName) {
    setTree({host({interface("eth0")})});
    std::filesystem::create_directory(fileOf("eth0"));
    const Setting setting;
    EXPECT_EQ(text(setting, &Setting::getConfigurationName), "");
}

TEST_F(DHCPSettingDataTest, SetConfigurationNameRewritesTheInterfacesFileAlone) {
    setTree({host({interface("eth0"), interface("eth1")})});
    writeFile(fileOf("eth0"), "DEVICE=eth0\nCONFIG_NAME=old\n");
    writeFile(fileOf("eth1"), "DEVICE=eth1\nCONFIG_NAME=old\n");
    Setting setting;
    setting.setFilter(Setting::FilterByInstanceID, "Computer%eth1");
    EXPECT_TRUE(setting.setConfigurationName("new"));
    EXPECT_EQ(readFile(fileOf("eth0")), "DEVICE=eth0\nCONFIG_NAME=old\n");
    EXPECT_EQ(readFile(fileOf("eth1")), "DEVICE=eth1\nCONFIG_NAME=new\n");
    EXPECT_EQ(text(setting, &Setting::getConfigurationName), "new");
    EXPECT_TRUE(setting);
}

TEST_F(DHCPSettingDataTest, EmptyConfigurationNameIsWrittenAsSuch) {
    setTree({host({interface("eth0")})});
    writeFile(fileOf("eth0"), "CONFIG_NAME=old\n");
    Setting setting;
    EXPECT_TRUE(setting.setConfigurationName(""));
    EXPECT_EQ(readFile(fileOf("eth0")), "CONFIG_NAME=\n");
}

TEST_F(DHCPSettingDataTest, MissingFileIsNotCreatedAndTheAnswerIsTrue) {
    setTree({host({interface("eth0")})});
    Setting setting;
    const LogCapture capture(6000, 6000);
    EXPECT_TRUE(setting.setConfigurationName("new"));
    EXPECT_THAT(entries(), IsEmpty());
    EXPECT_THAT(capture.log(), IsEmpty());
}

TEST_F(DHCPSettingDataTest, PathsOfAnyLengthAreServed) {
    const std::string name(200, 'n');
    setTree({host({interface(name)})});
    writeFile(fileOf(name), "CONFIG_NAME=old\n");
    ASSERT_GT(fileOf(name).size(), 128U);
    Setting setting;
    EXPECT_EQ(text(setting, &Setting::getConfigurationName), "old");
    EXPECT_TRUE(setting.setConfigurationName("new"));
    EXPECT_EQ(readFile(fileOf(name)), "CONFIG_NAME=new\n");
}

TEST_F(DHCPSettingDataTest, ValueThatIsNoLineChangesNothingAndTheAnswerIsTrue) {
    setTree({host({interface("eth0")})});
    const std::string content = "DEVICE=eth0\nCONFIG_NAME=old\n";
    writeFile(fileOf("eth0"), content);
    Setting setting;
    using namespace std::string_literals;
    for (const std::string& value : {"a\nBOOTPROTO=none"s, "a\r"s, "a\0b"s, "\n"s}) {
        const LogCapture capture(6000, 6000);
        EXPECT_TRUE(setting.setConfigurationName(value));
        EXPECT_EQ(readFile(fileOf("eth0")), content);
        for (const auto& records : {capture.log(), capture.trace()}) {
            ASSERT_EQ(records.size(), 1U);
            EXPECT_EQ(records[0].level, 6000);
        }
    }
}

TEST_F(DHCPSettingDataTest, CursorPastTheEndWritesNothingAndTheAnswerIsTrue) {
    setTree({host({})});
    writeFile(fileOf(""), "CONFIG_NAME=old\n");
    Setting setting;
    EXPECT_TRUE(setting.setConfigurationName("new"));
    EXPECT_EQ(text(setting, &Setting::getConfigurationName), test::untouched);
    EXPECT_EQ(readFile(fileOf("")), "CONFIG_NAME=old\n");
}

/// Interface names that must not reach the file system, though each of them would
/// name a file that the test has put there.
class NamesThatNameNoFile : public test::TreeTest,
                            public ::testing::WithParamInterface<std::string> {};

TEST_P(NamesThatNameNoFile, AreNeitherReadNorWritten) {
    setTree({host({interface(GetParam())})});
    const std::string content = "CONFIG_NAME=old\n";
    const std::string path = dataDirectory() + "ifcfg-" + GetParam();
    std::filesystem::create_directories(std::filesystem::path(path).parent_path());
    writeFile(path, content);
    Setting setting;
    ASSERT_EQ(text(setting, &Setting::getElementName), GetParam());
    {
        const LogCapture capture(6000, 6000);
        EXPECT_EQ(text(setting, &Setting::getConfigurationName), test::untouched);
        EXPECT_EQ(capture.log().size(), 1U);
    }
    const LogCapture capture(6000, 6000);
    EXPECT_TRUE(setting.setConfigurationName("new"));
    EXPECT_EQ(readFile(path), content);
    for (const auto& records : {capture.log(), capture.trace()}) {
        ASSERT_EQ(records.size(), 1U);
        EXPECT_EQ(records[0].level, 6000);
        EXPECT_EQ(records[0].file, "Lindows/DHCPSettingData");
        EXPECT_THAT(records[0].message, MatchesRegex("MESSAGE \\[File: .*"));
    }
}

INSTANTIATE_TEST_SUITE_P(All, NamesThatNameNoFile,
                         ::testing::Values("", ".", "..", "a/b", "x/../eth0", "eth\n0", "\x01",
                                           "eth0\x1f", "eth0\x7f"));

TEST_F(DHCPSettingDataTest, SetFilterTracesItsParametersAndWhatIsCompared) {
    setTree({serviceProcessor({interface("bmc0")})});
    Setting setting;
    const LogCapture capture;
    setting.setFilter(Setting::FilterByInstanceID, "BMC%bmc0");
    const auto records = capture.log();
    ASSERT_GE(records.size(), 2U);
    for (const auto& [record, word] :
         {std::pair{records.front(), "ENTERING"}, std::pair{records.back(), "EXITING"}}) {
        EXPECT_EQ(record.level, 3000);
        EXPECT_THAT(record.message,
                    MatchesRegex(std::string(word) +
                                 ": setFilter\\(\\) in Lindows/DHCPSettingData \\[Line: "
                                 "[0-9]+\\],Parameters List:  filterType=0x[0-9a-f]+ "
                                 "reference=BMC%bmc0"));
    }
    EXPECT_THAT(test::variables(records), ElementsAre("systemNode=BMC", "actualOutput=BMC%bmc0",
                                                      "iterator->reference=BMC%bmc0"));
    EXPECT_EQ(test::variables(capture.trace()), test::variables(records));
}

TEST_F(DHCPSettingDataTest, TracesTheFileOfTheConfigurationName) {
    setTree({host({interface("eth0")})});
    Setting setting;
    const LogCapture capture;
    text(setting, &Setting::getConfigurationName);
    EXPECT_THAT(test::variables(capture.log()), ElementsAre("l_cFileName=" + fileOf("eth0")));
    EXPECT_TRUE(setting.setConfigurationName("new"));
    EXPECT_THAT(test::variables(capture.trace()),
                ElementsAre("l_cFileName=" + fileOf("eth0"), "l_cFileName=" + fileOf("eth0")));
}

TEST_F(DHCPSettingDataTest, ThreadsThatRenameDifferentInterfacesLoseNothing) {
    setTree({host({interface("eth0"), interface("eth1")})});
    constexpr int renames = 10000;
    const auto rename = [](const std::string& name, int& lost) {
        const std::string head = "DEVICE=" + name + "\n";
        for (int count = 0; count < renames; ++count) {
            Setting setting;
            setting.setFilter(Setting::FilterByInstanceID, "Computer%" + name);
            const std::string value = name + " " + std::to_string(count);
            EXPECT_TRUE(setting.setConfigurationName(value));
            std::string now;
            setting.getConfigurationName(now);
            lost += now != value || readFile(fileOf(name)) != head + "CONFIG_NAME=" + value + "\n";
        }
    };
    std::array<int, 2> lost{};
    writeFile(fileOf("eth0"), "DEVICE=eth0\nCONFIG_NAME=\n");
    writeFile(fileOf("eth1"), "DEVICE=eth1\nCONFIG_NAME=\n");
    std::thread first(rename, "eth0", std::ref(lost[0]));
    std::thread second(rename, "eth1", std::ref(lost[1]));
    first.join();
    second.join();
    EXPECT_THAT(lost, ElementsAre(0, 0));
}

TEST_F(DHCPSettingDataTest, WalkCostsGrowWithTheInterfacesAlone) {
    test::expectLinearWalk(1, 0, [](unsigned interfaces) {
        Setting setting;
        EXPECT_EQ(test::walk(setting, &Setting::getElementName).size(), interfaces);
    });
    // The interface, and the two nodes above it.
    test::expectLinearWalk(3, 0, [](unsigned interfaces) {
        Setting setting;
        EXPECT_EQ(walk(setting).size(), interfaces);
    });
    test::expectLinearWalk(3, 0, [](unsigned interfaces) {
        Setting setting;
        setting.setFilter(Setting::FilterByInstanceID,
                          "Computer%eth" + std::to_string(interfaces - 1));
        EXPECT_EQ(test::walk(setting, &Setting::getElementName).size(), 1U);
    });
}

TEST_F(DHCPSettingDataTest, WithoutAFilterStepsCompareNothing) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1")})});
    test::expectStepsToCompareNothing<Setting>();
}

}  // namespace
