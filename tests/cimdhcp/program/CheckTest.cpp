// "cimdhcp check" on machines that lack something.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <nlohmann/json.hpp>

#include "ProgramRun.h"

namespace {

namespace fs = std::filesystem;
using test::Ended;
using testing::HasSubstr;
using testing::Not;

class Check : public test::ProgramTest {
  protected:
    Ended check(std::vector<std::string> options = {}) const {
        options.emplace_back("check");
        return run(std::move(options));
    }

    std::string emptyDirectory() const {
        const std::string path = directory() / "empty";
        fs::create_directories(path);
        return path;
    }
};

/// An interface of a tree with DHCP and one node of a client.
std::string withClient(const std::string& name, int linkState, const std::string& lease) {
    return R"({"type": "NetworkInterface", "description": "", "properties": {"Name": ")" + name +
           R"(", "DHCPEnabled": true, "AddressSource": 0, "InterfaceState": )" +
           std::to_string(linkState) +
           R"(}, "children": [{"type": "DHCPLease", "description": "DHCP lease", "properties": {
               "Family": "IPv4", "Client": "dhclient")" +
           lease + "}}]}";
}

std::size_t countOf(const std::string& text, const std::string& in) {
    std::size_t count = 0;
    for (std::size_t at = in.find(text); at != std::string::npos; at = in.find(text, at + 1)) {
        ++count;
    }
    return count;
}

TEST_F(Check, OnAGoodMachineEverythingIsInOrder) {
    const Ended ended = check();
    EXPECT_EQ(ended.status, 0);
    EXPECT_EQ(ended.err, "");
    EXPECT_THAT(ended.out,
                HasSubstr("ok    settings: " + (directory() / "platform.conf") + " is read\n"));
    EXPECT_THAT(ended.out, HasSubstr("ok    machine: tree " + tree() +
                                     " has 2 interfaces, 1 of them with DHCP\n"));
    EXPECT_THAT(ended.out, HasSubstr("ok    instance factory: of provider DHCPClientGateway\n"));
    EXPECT_THAT(ended.out, HasSubstr("ok    association factory: of provider DHCPClientGateway\n"));
    EXPECT_THAT(ended.out, HasSubstr("ok    QVXZR_DHCPProtocolEndpoint: 1 instance\n"));
    EXPECT_THAT(ended.out, HasSubstr("ok    QVXZR_DHCPSettingData: 2 instances\n"));
    EXPECT_THAT(ended.out, Not(HasSubstr("BAD")));
    EXPECT_THAT(ended.out, HasSubstr("Nothing is wrong"));
}

TEST_F(Check, TellsThatNoInterfaceUsesDhcp) {
    setTree("");
    const Ended ended = check();
    EXPECT_EQ(ended.status, 0);
    EXPECT_THAT(ended.out, HasSubstr("note  machine: tree " + tree() +
                                     " has 0 interfaces, 0 of them with DHCP: the DHCP classes are "
                                     "empty\n      -> "));
    // All classes that are empty are one line.
    EXPECT_THAT(ended.out,
                testing::ContainsRegex("note  QVXZR_[A-Za-z]+, QVXZR_[^\n]* more: no instance\n"));
    EXPECT_EQ(countOf("no instance", ended.out), 1U);
}

TEST_F(Check, TellsOfOneEmptyClassByItsName) {
    setTree(test::computer("Computer", withClient("eth0", 1, "")));
    EXPECT_THAT(check().out,
                testing::ContainsRegex("note  [^\n]*QVXZR_DHCPRemoteServiceAccessPoint[^\n]*: no "
                                       "instance\n"));
}

TEST_F(Check, TellsOfATreeOfAnotherMachine) {
    std::string foreign = test::computer("Computer", withClient("eth0", 1, ""));
    const std::string variable = "${HOSTNAME}";
    foreign.replace(foreign.find(variable), variable.size(), "elsewhere");
    setTree(foreign);
    const Ended ended = check();
    EXPECT_EQ(ended.status, 0);
    EXPECT_THAT(ended.out, testing::ContainsRegex(
                               "note  [a-z ]+: [^\n]*the computer is called \"elsewhere\" and "
                               "this machine \""));
    EXPECT_EQ(countOf("the computer is called", ended.out), 1U);
}

TEST_F(Check, TellsOfADataDirectoryThatIsALinkToItself) {
    const std::string loop = directory() / "loop";
    fs::create_symlink("loop", loop);
    const Ended ended = runAs(program(), {"--tree", tree(), "--data-dir", loop, "check"});
    EXPECT_EQ(ended.status, 1);
    EXPECT_THAT(ended.out, HasSubstr("BAD   data directory: " + loop +
                                     "/: Too many levels of symbolic links\n"
                                     "      -> remove the link that leads to itself"));
}

TEST_F(Check, TellsOfSettingsThatCannotBeUsed) {
    ZR::Testing::writeFile(directory() / "platform.conf", "LOG_LEVEL=loud\n");
    const Ended ended = check();
    EXPECT_EQ(ended.status, 1);
    EXPECT_THAT(ended.out, HasSubstr("BAD   settings: " + (directory() / "platform.conf")));
    EXPECT_THAT(ended.out, HasSubstr("1 thing is wrong"));
}

TEST_F(Check, TellsOfATreeThatCannotBeRead) {
    ZR::Testing::writeFile(tree(), "{");
    const Ended ended = check();
    EXPECT_EQ(ended.status, 1);
    EXPECT_THAT(ended.out, HasSubstr("BAD   tree: " + tree()));
    // The rest is looked at all the same.
    EXPECT_THAT(ended.out, HasSubstr("ok    schema: "));
}

TEST_F(Check, TellsOfAMissingDataDirectory) {
    fs::remove_all(dataDir());
    const Ended ended = check();
    EXPECT_EQ(ended.status, 0);
    EXPECT_THAT(ended.out, HasSubstr("note  data directory: " + dataDir() + "/ does not exist"));
    EXPECT_THAT(ended.out, HasSubstr("-> mkdir -p " + dataDir()));
}

TEST_F(Check, WarnsOfADataDirectoryWhoseFilesShellsRead) {
    const std::string link = directory() / "link";
    fs::create_symlink("/etc/default", link);
    for (const std::string& path : {std::string("/etc/default"), link}) {
        const Ended ended = runAs(program(), {"--tree", tree(), "--data-dir", path, "check"});
        EXPECT_EQ(ended.status, 0);
        EXPECT_THAT(ended.out,
                    HasSubstr("note  data directory: " + path +
                              "/ is in /etc/default, whose files shells or network scripts read"));
    }
}

TEST_F(Check, TellsOfAMissingLibrary) {
    const Ended ended = check({"--provider-dir", emptyDirectory()});
    EXPECT_EQ(ended.status, 1);
    EXPECT_THAT(ended.out,
                HasSubstr("BAD   library: libDHCPClient.so is not in " + emptyDirectory()));
    EXPECT_THAT(ended.out, testing::ContainsRegex("BAD   QVXZR_[^\n]* more: CIM_ERR_FAILED"));
}

TEST_F(Check, TellsOfALibraryWithoutFactories) {
    fs::copy(NO_PROVIDER_LIBRARY, emptyDirectory() + "/libDHCPClient.so");
    const Ended ended = check({"--provider-dir", emptyDirectory()});
    EXPECT_EQ(ended.status, 1);
    EXPECT_THAT(ended.out, HasSubstr("BAD   instance factory: "));
    EXPECT_THAT(ended.out, HasSubstr("BAD   association factory: "));
    EXPECT_THAT(ended.out, HasSubstr("DHCPClientGateway_Create_AssociationMI"));
}

TEST_F(Check, TellsOfAFaultInSchemaOrRegistration) {
    const std::string schema = emptyDirectory();
    ZR::Testing::writeFile(schema + "/a.mof", "class {");
    ZR::Testing::writeFile(schema + "/a.registration", "");
    const Ended broken = check({"--schema-dir", schema});
    EXPECT_EQ(broken.status, 1);
    EXPECT_THAT(broken.out, HasSubstr("BAD   schema and registration: " + schema + "/a.mof:1:7"));
    fs::remove(schema + "/a.registration");
    EXPECT_THAT(check({"--schema-dir", schema}).out,
                HasSubstr("BAD   installation: " + schema + ": no *.registration file is in it"));
}

TEST_F(Check, TellsOfANamespaceThatNoProviderServes) {
    const Ended ended = check({"--namespace", "root/other"});
    EXPECT_EQ(ended.status, 1);
    EXPECT_THAT(ended.out, HasSubstr("BAD   registration: no class is served in root/other"));
}

TEST_F(Check, TellsOfAClientThatItMayNotLookInto) {
    if (::geteuid() != 0) {
        GTEST_SKIP() << "needs a client of another user";
    }
    fs::permissions(directory().path(), fs::perms::others_read | fs::perms::others_exec,
                    fs::perm_options::add);
    fs::copy_file("/bin/sleep", directory() / "dhclient");
    // Of root, while the program runs as somebody else, on the live machine.
    const Ended ended =
        runAs("/bin/sh", {"-c", (directory() / "dhclient") + " 60 & " +
                                    "setpriv --reuid=65534 --regid=65534 --clear-groups " +
                                    program() + " check; kill $!"});
    EXPECT_THAT(ended.out, testing::ContainsRegex("note  rights: [^\n]*dhclient[^\n]*\n      -> "));
}

TEST_F(Check, TellsOfAClientThatNoServerResponds) {
    setTree(
        test::computer("Computer", withClient("eth0", 1, "") + "," + withClient("eth1", 1, "")));
    const Ended ended = check();
    EXPECT_EQ(ended.status, 0);
    EXPECT_THAT(ended.out,
                HasSubstr("note  DHCP server: eth0 (dhclient, IPv4), eth1 (dhclient, IPv4): asks "
                          "for a lease, and no server has given one; since when is not known\n"
                          "      -> see whether a DHCP server can be reached"));
}

TEST_F(Check, TellsOfALinkThatIsDown) {
    setTree(test::computer("Computer", withClient("eth0", 0, "")));
    const Ended ended = check();
    EXPECT_EQ(ended.status, 0);
    EXPECT_THAT(ended.out, HasSubstr("note  link: eth0: DHCP is on, and there is no link\n"
                                     "      -> plug the cable in"));
}

TEST_F(Check, EndsWithOneWhenALeaseHasEnded) {
    setTree(test::computer(
        "Computer", withClient("eth0", 1, R"(, "Address": "192.0.2.17", "LeaseExpires": 1000)")));
    const Ended ended = check();
    EXPECT_EQ(ended.status, 1);
    EXPECT_THAT(ended.out, HasSubstr("BAD   lease: eth0 (dhclient, IPv4) of 192.0.2.17, "
                                     "1970-01-01: has ended, and there is no other\n      -> "));
    EXPECT_EQ(ended.err, "cimdhcp: something is wrong; see the list\n");
}

TEST_F(Check, TellsThatItIsNotKnownWhetherDhcpIsOn) {
    setTree(test::computer("Computer", R"({"type": "NetworkInterface", "description": "",
                                           "properties": {"Name": "eth0"}})"));
    const Ended ended = check();
    EXPECT_EQ(ended.status, 0);
    EXPECT_THAT(ended.out, HasSubstr("note  DHCP: eth0: whether DHCP is on is not known\n"));
}

TEST_F(Check, EndsWithTwoWhenItIsNotUnderstood) {
    EXPECT_EQ(check({"--sort", "name"}).status, 2);
}

TEST_F(Check, EndsWithThreeWhenItsListCannotBeWritten) {
    EXPECT_EQ(
        runAs("/bin/sh", {"-c", "exec \"$0\" --tree \"$1\" check >/dev/full", program(), tree()})
            .status,
        3);
}

/// The live machine in namespaces of its own, after a shell command that lays it out.
class CheckOfTheLiveMachine : public Check {
  protected:
    void SetUp() override {
        if (::geteuid() != 0) {
            GTEST_SKIP() << "needs root for a mount namespace";
        }
    }
    Ended checkAfter(const std::string& layout, const std::string& before = "") const {
        return runAs("/usr/bin/unshare",
                     {"--mount", "--net", "/bin/sh", "-c",
                      "set -e; mount -t tmpfs none /var/lib; mount -t tmpfs none /run; " + layout +
                          "; exec " + before + program() + " check"});
    }
};

TEST_F(CheckOfTheLiveMachine, TellsOfADirectoryThatIsALinkToItself) {
    const Ended ended = checkAfter("ln -s dhcp /var/lib/dhcp");
    EXPECT_EQ(ended.status, 0);
    EXPECT_THAT(ended.out,
                HasSubstr("note  live source: cannot read /var/lib/dhcp: Too many levels of "
                          "symbolic links\n      -> remove the link that leads to itself"));
}

TEST_F(CheckOfTheLiveMachine, TellsWhatThisUserMayNotRead) {
    fs::permissions(directory().path(), fs::perms::others_read | fs::perms::others_exec,
                    fs::perm_options::add);
    const Ended ended = checkAfter("mkdir -m 700 /var/lib/dhcp",
                                   "setpriv --reuid=65534 --regid=65534 --clear-groups ");
    EXPECT_EQ(ended.status, 0);
    EXPECT_THAT(ended.out, HasSubstr("note  rights: cannot read /var/lib/dhcp: Permission denied\n"
                                     "      -> run as root"));
}

TEST_F(CheckOfTheLiveMachine, WatchesIt) {
    // Where nothing can be watched. A command that asks once does not try to, since the kernel
    // lets it wait for the end of its watches.
    const std::string layout =
        "unshare --user --map-root-user sh -c 'echo 0 >/proc/sys/user/max_inotify_instances; ";
    const auto run = [&](const std::string& command) {
        return runAs("/usr/bin/unshare",
                     {"--net", "/bin/sh", "-c", layout + program() + ' ' + command + "'"});
    };
    EXPECT_THAT(run("check").out, HasSubstr("live source: cannot watch files: "));
    // Of other processes of this machine it may tell what it cannot see from there.
    EXPECT_THAT(run("show").err, Not(HasSubstr("watch")));
    EXPECT_THAT(run("tree").err, Not(HasSubstr("watch")));
    EXPECT_THAT(run("rename eth0 name").err, HasSubstr("eth0"));
}

TEST_F(Check, HasAFormForPrograms) {
    const Ended ended = check({"--format", "json"});
    const auto findings = nlohmann::json::parse(ended.out).at("findings");
    ASSERT_FALSE(findings.empty());
    EXPECT_EQ(findings[0].at("verdict"), "good");
    EXPECT_EQ(findings[0].at("what"), "settings");
    EXPECT_EQ(findings[0].at("remedy"), "");
}

}  // namespace
