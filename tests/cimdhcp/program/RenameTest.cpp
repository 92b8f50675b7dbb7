#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>

#include "ProgramRun.h"

namespace {

namespace fs = std::filesystem;
using test::Ended;
using testing::HasSubstr;
using ZR::Testing::readFile;

class Rename : public test::ProgramTest {
  protected:
    [[nodiscard]] std::string nameOf(const std::string& interface) const {
        return readFile(configuration(interface));
    }
};

TEST_F(Rename, ChangesTheNameAndTellsTheOldOne) {
    writeConfiguration("eth0", "# mine\nDEVICE=eth0\nCONFIG_NAME=home\n");
    EXPECT_EQ(run({"rename", "eth0", "the-office"}),
              (Ended{0,
                     "eth0: the configuration name is now \"the-office\", was \"home\" (" +
                         configuration("eth0") + ").\n",
                     ""}));
    EXPECT_EQ(nameOf("eth0"), "# mine\nDEVICE=eth0\nCONFIG_NAME=the-office\n");
}

TEST_F(Rename, GivesANameToAnInterfaceThatHadNone) {
    writeConfiguration("eth1", "DEVICE=eth1\n");
    EXPECT_EQ(
        run({"rename", "eth1", "lab"}),
        (Ended{0, "eth1: the configuration name is now \"lab\" (" + configuration("eth1") + ").\n",
               ""}));
    EXPECT_EQ(nameOf("eth1"), "DEVICE=eth1\nCONFIG_NAME=lab\n");
}

TEST_F(Rename, TakesTheNameAway) {
    writeConfiguration("eth0", "CONFIG_NAME=home\n");
    EXPECT_EQ(run({"rename", "eth0", ""}).status, 0);
    EXPECT_EQ(nameOf("eth0"), "CONFIG_NAME=\n");
}

TEST_F(Rename, ChangesNothingWithoutAFile) {
    EXPECT_EQ(run({"rename", "eth0", "office"}),
              (Ended{1, "",
                     "cimdhcp: eth0 has no configuration file: there is no " +
                         configuration("eth0") + "; --create makes it\n"}));
    EXPECT_TRUE(fs::is_empty(dataDir()));
}

TEST_F(Rename, MakesTheFileWhenAsked) {
    EXPECT_EQ(run({"rename", "eth0", "office", "--create"}),
              (Ended{0,
                     "Made the file " + configuration("eth0") +
                         ".\n"
                         "eth0: the configuration name is now \"office\" (" +
                         configuration("eth0") + ").\n",
                     ""}));
    EXPECT_EQ(nameOf("eth0"), "DEVICE=eth0\nCONFIG_NAME=office\n");
    EXPECT_EQ(fs::status(configuration("eth0")).permissions(), fs::perms(0644));
}

TEST_F(Rename, MakesTheDirectoryToo) {
    fs::remove(dataDir());
    // The one that is set, not one that is named on the command line.
    EXPECT_EQ(runAs(program(), {"--tree", tree(), "rename", "eth0", "office", "--create"},
                    {{"ZR_DATA_DIR", dataDir()}}),
              (Ended{0,
                     "Made the directory " + dataDir() +
                         "/.\n"
                         "Made the file " +
                         configuration("eth0") +
                         ".\n"
                         "eth0: the configuration name is now \"office\" (" +
                         configuration("eth0") + ").\n",
                     ""}));
    EXPECT_EQ(nameOf("eth0"), "DEVICE=eth0\nCONFIG_NAME=office\n");
}

TEST_F(Rename, KeepsAFileThatIsThereWhenAskedToMakeOne) {
    writeConfiguration("eth0", "KEEP=me\nCONFIG_NAME=home\n");
    EXPECT_EQ(run({"rename", "eth0", "office", "--create"}).out,
              "eth0: the configuration name is now \"office\", was \"home\" (" +
                  configuration("eth0") + ").\n");
    EXPECT_EQ(nameOf("eth0"), "KEEP=me\nCONFIG_NAME=office\n");
}

TEST_F(Rename, TellsInJsonWhatItDid) {
    EXPECT_EQ(run({"--format", "json", "rename", "eth0", "office", "--create"}), (Ended{0, R"({
  "operation": "rename",
  "interface": "eth0",
  "file": ")" + configuration("eth0") + R"(",
  "fileCreated": true,
  "directoryCreated": false,
  "lineEnded": false,
  "oldName": null,
  "newName": "office"
}
)",
                                                                                        ""}));
}

TEST_F(Rename, MakesNoFileForAnInterfaceThatAShellWouldReadOtherwise) {
    setTree(test::computer("Computer", test::dhcpInterface("a;b", "192.0.2.1")));
    const Ended refused = run({"rename", "a;b", "office", "--create"});
    EXPECT_EQ(refused.status, 1);
    EXPECT_THAT(refused.err, HasSubstr("the file's first line would be DEVICE=a;b: the name has "
                                       "a \";\": "));
    EXPECT_TRUE(fs::is_empty(dataDir()));
    EXPECT_EQ(run({"rename", "a;b", "office", "--create", "--force"}).status, 0);
    EXPECT_EQ(nameOf("a;b"), "DEVICE=a;b\nCONFIG_NAME=office\n");
}

TEST_F(Rename, NamesTheInterfacesThatThereAre) {
    EXPECT_EQ(
        run({"rename", "eth7", "office"}),
        (Ended{1, "", "cimdhcp: there is no interface \"eth7\"; this machine has: eth0, eth1\n"}));
    setTree("");
    EXPECT_EQ(run({"rename", "eth7", "office"}),
              (Ended{1, "", "cimdhcp: there is no interface \"eth7\"; this machine has none\n"}));
}

TEST_F(Rename, AsksWhichOfTwoInterfacesOfOneName) {
    setTree(test::computer("Computer", test::dhcpInterface("eth0", "192.0.2.1")) + "," +
            test::computer("BMC", test::dhcpInterface("eth0", "192.0.2.9")));
    writeConfiguration("eth0", "CONFIG_NAME=home\n");
    EXPECT_EQ(run({"rename", "eth0", "office"}),
              (Ended{1, "",
                     "cimdhcp: there are several interfaces \"eth0\"; name one of: Computer%eth0, "
                     "BMC%eth0\n"}));
    EXPECT_EQ(run({"rename", "BMC%eth0", "office"}).status, 0);
    EXPECT_EQ(nameOf("eth0"), "CONFIG_NAME=office\n");
}

TEST_F(Rename, RefusesNamesThatWouldNotComeBack) {
    writeConfiguration("eth0", "CONFIG_NAME=home\n");
    EXPECT_EQ(run({"rename", "eth0", "a\nb"}),
              (Ended{2, "",
                     "cimdhcp: \"a\\x0Ab\" cannot be a configuration name: it must be one line, "
                     "without blanks at its ends or quotation marks around it\n"}));
    EXPECT_EQ(run({"rename", "eth0", " x"}).status, 2);
    EXPECT_EQ(nameOf("eth0"), "CONFIG_NAME=home\n");
}

TEST_F(Rename, RefusesNamesThatAShellWouldReadOtherwise) {
    writeConfiguration("eth0", "CONFIG_NAME=home\n");
    EXPECT_EQ(run({"rename", "eth0", "the office"}),
              (Ended{1, "",
                     "cimdhcp: the line would be CONFIG_NAME=the office: the name has a blank: a "
                     "shell that reads the file ends the name there, and runs what follows; "
                     "nothing was changed, --force does it all the same\n"}));
    for (const char* name : {"$HOME", "a`b`", "a;b", "it's", "a\\b", "a>b", "~"}) {
        EXPECT_EQ(run({"rename", "eth0", name}).status, 1) << name;
        EXPECT_EQ(run({"rename", "eth1", name, "--create"}).status, 1) << name;
    }
    EXPECT_EQ(nameOf("eth0"), "CONFIG_NAME=home\n");
    EXPECT_FALSE(fs::exists(configuration("eth1")));
    EXPECT_EQ(run({"rename", "eth0", "the office", "--force"}).status, 0);
    EXPECT_EQ(nameOf("eth0"), "CONFIG_NAME=the office\n");
}

TEST_F(Rename, RefusesNamesThatAreTooLongForTheNextRename) {
    writeConfiguration("eth0", "CONFIG_NAME=home\n");
    const std::string longest(490, 'a');
    const Ended refused = run({"rename", "eth0", longest + "a"});
    EXPECT_EQ(refused.status, 1);
    EXPECT_THAT(refused.err, HasSubstr("the name has 491 bytes, more than 490"));
    EXPECT_EQ(nameOf("eth0"), "CONFIG_NAME=home\n");
    EXPECT_EQ(run({"rename", "eth0", longest}).status, 0);
    EXPECT_EQ(run({"rename", "eth0", "short"}).status, 0);
    EXPECT_EQ(nameOf("eth0"), "CONFIG_NAME=short\n");
}

TEST_F(Rename, RefusesFilesOfWhichOtherLinesWouldBeReplaced) {
    const std::string content = "# CONFIG_NAME is mine\nCONFIG_NAME=home\nOLD_CONFIG_NAME=x\n";
    writeConfiguration("eth0", content);
    EXPECT_EQ(run({"rename", "eth0", "office"}),
              (Ended{1, "",
                     "cimdhcp: " + configuration("eth0") +
                         ": line 1, \"# CONFIG_NAME is mine\", contains CONFIG_NAME: the whole "
                         "line would be replaced by the new name's line; line 3, "
                         "\"OLD_CONFIG_NAME=x\", contains CONFIG_NAME: the whole line would be "
                         "replaced by the new name's line; nothing was changed, --force does it "
                         "all the same\n"}));
    EXPECT_EQ(nameOf("eth0"), content);
    EXPECT_EQ(run({"rename", "eth0", "office", "--force"}).status, 0);
    EXPECT_EQ(nameOf("eth0"), "CONFIG_NAME=office\nCONFIG_NAME=office\nCONFIG_NAME=office\n");
}

TEST_F(Rename, RefusesFilesWithLinesThatWouldBeTakenForSeveral) {
    const std::string content = "CONFIG_NAME=" + std::string(600, 'a') + "\n";
    writeConfiguration("eth0", content);
    const Ended refused = run({"rename", "eth0", "office"});
    EXPECT_EQ(refused.status, 1);
    EXPECT_THAT(refused.err, HasSubstr("line 1, \"CONFIG_NAME=aaa"));
    EXPECT_THAT(refused.err, HasSubstr("has 612 bytes: "));
    EXPECT_EQ(nameOf("eth0"), content);
    // And that is what happens then.
    EXPECT_EQ(run({"rename", "eth0", "office", "--force"}).status, 0);
    EXPECT_EQ(nameOf("eth0"), "CONFIG_NAME=office\n" + std::string(101, 'a') + "\n");
}

TEST_F(Rename, EndsALastLineThatHasNoEnd) {
    writeConfiguration("eth0", "DEVICE=eth0");
    EXPECT_EQ(run({"rename", "eth0", "office"}).out,
              "Ended the last line of " + configuration("eth0") +
                  ".\neth0: the configuration name is now \"office\" (" + configuration("eth0") +
                  ").\n");
    EXPECT_EQ(nameOf("eth0"), "DEVICE=eth0\nCONFIG_NAME=office\n");
    writeConfiguration("eth1", "CONFIG_NAME=home\nDEVICE=eth1");
    EXPECT_THAT(run({"--format", "json", "rename", "eth1", "office"}).out,
                HasSubstr("\"lineEnded\": true"));
    EXPECT_EQ(nameOf("eth1"), "CONFIG_NAME=office\nDEVICE=eth1\n");
}

TEST_F(Rename, FindsOutThatItDidNotTakeEffect) {
    // The exact provider returns OK all the same.
    fs::create_directory(configuration("eth0"));
    EXPECT_EQ(
        run({"rename", "eth0", "office"}),
        (Ended{1, "",
               "cimdhcp: CIM_ERR_FAILED: " + configuration("eth0") + " is not a regular file; " +
                   configuration("eth0") + " cannot be read (Is a directory)\n"}));
    EXPECT_EQ(run({"--exact", "rename", "eth0", "office"}),
              (Ended{1, "",
                     "cimdhcp: the configuration name of eth0 is still \"\": " +
                         configuration("eth0") + " is not a regular file; " +
                         configuration("eth0") + " cannot be read (Is a directory)\n"}));
}

TEST_F(Rename, TellsWhatTheFileHoldsAfterAFailure) {
    writeConfiguration("eth0", "DEVICE=eth0\nCONFIG_NAME=home\n");
    fs::permissions(configuration("eth0"), fs::perms(0444));
    fs::permissions(dataDir(), fs::perms(0755));
    fs::permissions(directory().path(), fs::perms(0755));
    if (::geteuid() != 0) {
        GTEST_SKIP() << "needs another user who may not write";
    }
    const Ended ended =
        runAs("/usr/bin/setpriv",
              {"--reuid=65534", "--regid=65534", "--clear-groups", program(), "--tree", tree(),
               "--data-dir", dataDir(), "rename", "eth0", "office"});
    EXPECT_EQ(ended, (Ended{1, "",
                            "cimdhcp: CIM_ERR_ACCESS_DENIED: " + configuration("eth0") +
                                " cannot be written: Permission denied; " + configuration("eth0") +
                                " now holds CONFIG_NAME=home in line 2\n"}));
}

TEST_F(Rename, RefusesInterfacesThatCannotHaveAFile) {
    setTree(test::computer("Computer", test::dhcpInterface("../eth0", "192.0.2.1")));
    EXPECT_EQ(run({"rename", "../eth0", "office", "--create"}),
              (Ended{1, "",
                     "cimdhcp: the name \"../eth0\" cannot be part of a file's name: such an "
                     "interface has no configuration file\n"}));
}

}  // namespace
