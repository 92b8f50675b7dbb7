#include "commands/RenameFiles.h"

#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <csignal>
#include <filesystem>

#include "kit/ChildProcess.h"
#include "kit/FileContent.h"
#include "kit/TemporaryDirectory.h"
#include "text/Failure.h"

namespace cimdhcp {
namespace {

namespace fs = std::filesystem;
using ZR::Testing::readFile;
using ZR::Testing::TemporaryDirectory;
using ZR::Testing::writeFile;

mode_t modeOf(const std::string& path) {
    struct stat status {};
    EXPECT_EQ(::stat(path.c_str(), &status), 0);
    return status.st_mode & 07777U;
}

template <typename Act>
std::string refusal(Act&& act) {
    try {
        std::forward<Act>(act)();
        return "done";
    } catch (const Failure& failure) {
        EXPECT_EQ(failure.status(), ExitStatus::notDone);
        return failure.what();
    }
}

TEST(ConfigurationFile, TakesNamesThatComeBackAsTheyWere) {
    for (const char* name : {"office", "two words", "", "a=b", "it's", "\"", "büro", "a\"b"}) {
        EXPECT_TRUE(canBeConfigurationName(name)) << name;
    }
    for (const char* name : {" x", "x ", "\"x\"", "'x'", "a\nb", "a\tb", "\x1B"}) {
        EXPECT_FALSE(canBeConfigurationName(name)) << name;
    }
}

TEST(ConfigurationFile, IsMadeWithItsTwoLines) {
    const TemporaryDirectory directory;
    const std::string path = directory / "ifcfg-eth0";
    const mode_t before = ::umask(077);
    createConfigurationFile(path, "eth0", "office");
    ::umask(before);
    EXPECT_EQ(readFile(path), "DEVICE=eth0\nCONFIG_NAME=office\n");
    EXPECT_EQ(modeOf(path), 0644U);
}

TEST(ConfigurationFile, IsNeverOverwritten) {
    const TemporaryDirectory directory;
    const std::string path = directory / "ifcfg-eth0";
    writeFile(path, "mine");
    EXPECT_EQ(refusal([&] { createConfigurationFile(path, "eth0", "office"); }),
              "cannot make the file " + path + ": File exists");
    EXPECT_EQ(readFile(path), "mine");
    // Nor does a link that leads nowhere lead a new file there.
    const std::string link = directory / "ifcfg-eth1";
    fs::create_symlink(directory / "elsewhere", link);
    EXPECT_EQ(refusal([&] { createConfigurationFile(link, "eth1", "office"); }),
              "cannot make the file " + link + ": File exists");
    EXPECT_FALSE(fs::exists(directory / "elsewhere"));
}

TEST(ConfigurationFile, DoesNotStayHalfWritten) {
    // What a full disk does, a limit on the size of files does, too.
    const TemporaryDirectory directory;
    const std::string path = directory / "ifcfg-eth0";
    const auto child = ZR::Testing::inChild([&] {
        const rlimit limit{4, 4};
        ::signal(SIGXFSZ, SIG_IGN);
        ::setrlimit(RLIMIT_FSIZE, &limit);
        return refusal([&] { createConfigurationFile(path, "eth0", "office"); });
    });
    EXPECT_EQ(child.output, "cannot write the file " + path + ": File too large");
    EXPECT_FALSE(fs::exists(path));
}

TEST(ConfigurationFile, GetsItsDirectoryMade) {
    const TemporaryDirectory directory;
    const mode_t before = ::umask(022);
    EXPECT_TRUE(createDataDirectory(directory / "data/"));
    ::umask(before);
    EXPECT_EQ(modeOf(directory / "data"), 0755U);
    EXPECT_FALSE(createDataDirectory(directory / "data/"));
    EXPECT_EQ(refusal([&] { createDataDirectory(directory / "a/b/"); }),
              "cannot make the directory " + directory / "a/b/" + ": No such file or directory");
}

TEST(ConfigurationFile, TellsWhyItCannotBeChanged) {
    const TemporaryDirectory directory;
    EXPECT_EQ(whyUnchanged(directory / "none"), directory / "none" + ": No such file or directory");
    EXPECT_EQ(whyUnchanged(directory.path()), directory.path().string() + " is not a regular file");
    const std::string path = directory / "file";
    writeFile(path, "");
    EXPECT_EQ(whyUnchanged(path), path + " was not changed; the system log may tell why");
}

TEST(ConfigurationFile, TellsThatItIsNotForThisUser) {
    const TemporaryDirectory directory;
    const std::string path = directory / "file";
    writeFile(path, "");
    fs::permissions(directory.path(), fs::perms(0755));
    const auto told = [&] {
        // The superuser may do anything.
        return ZR::Testing::inChild([&] {
                   constexpr uid_t nobody = 65534;
                   static_cast<void>(::setuid(nobody) == 0);
                   return whyUnchanged(path);
               })
            .output;
    };
    fs::permissions(path, fs::perms(0444));
    EXPECT_EQ(told(), path + " cannot be written: Permission denied");
    fs::permissions(path, fs::perms(0200));
    EXPECT_EQ(told(), path + " cannot be read: Permission denied");
}

}  // namespace
}  // namespace cimdhcp
