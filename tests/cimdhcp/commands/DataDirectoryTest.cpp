#include "commands/check/Findings.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include "kit/ChildProcess.h"
#include "kit/Files.h"

namespace cimdhcp {
namespace {

namespace fs = std::filesystem;
using testing::HasSubstr;
using testing::SizeIs;
using Verdict = Finding::Verdict;

class DataDirectory : public testing::Test {
  protected:
    DataDirectory() {
        fs::create_directory(data());
        fs::create_directory(sourced());
    }

    [[nodiscard]] std::string data() const { return directory_ / "data"; }
    [[nodiscard]] std::string sourced() const { return directory_ / "sourced"; }

    [[nodiscard]] std::vector<Finding> findings(const std::string& path) const {
        std::vector<Finding> result;
        lookAtDataDirectory(path + "/", result, {"/nowhere", sourced()});
        return result;
    }

    const ZR::Testing::TemporaryDirectory directory_;
};

TEST_F(DataDirectory, OfItsOwnIsGood) {
    ZR::Testing::writeFile(data() + "/ifcfg-eth0", "");
    ZR::Testing::writeFile(data() + "/other", "");
    EXPECT_EQ(findings(data()), (std::vector<Finding>{{Verdict::good, "data directory",
                                                       data() + "/ has 1 ifcfg file", ""}}));
}

TEST_F(DataDirectory, ThatIsMissingIsTold) {
    const auto found = findings(data() + "/none");
    ASSERT_THAT(found, SizeIs(1));
    EXPECT_EQ(found[0].verdict, Verdict::notable);
    EXPECT_THAT(found[0].detail, HasSubstr("/none/ does not exist"));
    EXPECT_THAT(found[0].remedy, HasSubstr("mkdir -p " + data() + "/none/"));
}

TEST_F(DataDirectory, ThatIsALinkToItselfIsTold) {
    fs::create_symlink("loop", directory_ / "loop");
    EXPECT_EQ(findings(directory_ / "loop"),
              (std::vector<Finding>{
                  {Verdict::bad, "data directory",
                   (directory_ / "loop") + "/: Too many levels of symbolic links",
                   "remove the link that leads to itself, and make a directory there"}}));
}

TEST_F(DataDirectory, ThatIsAFileIsTold) {
    ZR::Testing::writeFile(directory_ / "file", "");
    EXPECT_EQ(findings(directory_ / "file"),
              (std::vector<Finding>{
                  {Verdict::bad, "data directory", (directory_ / "file") + "/: Not a directory",
                   "make it a directory that this user may look into, or set DATA_DIR"}}));
}

TEST_F(DataDirectory, WhoseFilesShellsReadIsWarnedOfUnderWhateverName) {
    const std::string link = directory_ / "link";
    fs::create_symlink("sourced", link);
    fs::create_directory(sourced() + "/below");
    for (const std::string& path : {sourced(), link, sourced() + "/below", link + "/none",
                                    data() + "/../sourced", sourced() + "/."}) {
        const auto found = findings(path);
        ASSERT_THAT(found, SizeIs(2)) << path;
        EXPECT_EQ(found[1].verdict, Verdict::notable);
        EXPECT_THAT(found[1].detail,
                    HasSubstr(path + "/ is in " + sourced() +
                              ", whose files shells or network scripts read: who reads an ifcfg "
                              "file there, often as root, runs the commands that a configuration "
                              "name holds"));
        EXPECT_THAT(found[1].remedy, HasSubstr("/var/lib/dhcp-client-provider/"));
    }
}

TEST_F(DataDirectory, BesideOneWhoseFilesShellsReadIsGood) {
    fs::create_directory(sourced() + "-not");
    EXPECT_THAT(findings(sourced() + "-not"), SizeIs(1));
}

TEST_F(DataDirectory, TellsInOneLineWhatThisUserMayNotDo) {
    for (const char* name : {"eth0", "eth1"}) {
        ZR::Testing::writeFile(data() + "/ifcfg-" + name, "");
        fs::permissions(data() + "/ifcfg-" + name, fs::perms(0400));
    }
    fs::permissions(directory_.path(), fs::perms(0755));
    fs::permissions(data(), fs::perms(0755));
    // The superuser may do anything.
    const auto child = ZR::Testing::inChild([&] {
        constexpr uid_t nobody = 65534;
        static_cast<void>(::setuid(nobody) == 0);
        const auto found = findings(data());
        return std::to_string(found.size()) + " " + found.at(0).detail + "|" + found.at(0).remedy;
    });
    if (::geteuid() == 0) {
        const std::string prefix = "1 " + data() +
                                   "/ has 2 ifcfg files; this user may not read 2 "
                                   "files (ifcfg-eth";
        EXPECT_EQ(child.output.substr(0, prefix.size()), prefix);
        EXPECT_THAT(child.output, HasSubstr(": Permission denied); this user may not change 2 "
                                            "files (ifcfg-eth"));
        EXPECT_THAT(child.output,
                    HasSubstr("; this user may not make files there (Permission denied)|rename as "
                              "a user who may, such as root"));
    } else {
        EXPECT_THAT(child.output, HasSubstr("this user may not change 2 files"));
    }
}

TEST_F(DataDirectory, KnowsTheDirectoriesOfTheUsualSystems) {
    EXPECT_THAT(
        sourcedDirectories(),
        testing::UnorderedElementsAre("/etc/sysconfig/network-scripts", "/etc/sysconfig/network",
                                      "/etc/network", "/etc/default", "/etc/profile.d"));
}

}  // namespace
}  // namespace cimdhcp
