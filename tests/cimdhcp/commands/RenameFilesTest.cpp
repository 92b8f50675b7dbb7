// The files that hold a new name, and those that do not take one.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <csignal>
#include <filesystem>

#include "commands/rename/RenameFiles.h"
#include "kit/ChildProcess.h"
#include "kit/Files.h"
#include "text/Failure.h"

namespace cimdhcp {
namespace {

namespace fs = std::filesystem;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
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

/// Names that hold every printable character once at the beginning, once in the middle,
/// once at the end, and behind the signs at which a part of a value begins.
std::vector<std::string> namesWithEveryCharacter() {
    std::vector<std::string> names{"", "office", "a:b", "b\xC3\xBCro", "#1", "a#b"};
    for (char letter = ' '; letter <= '~'; ++letter) {
        for (const char* form : {"@", "@a", "a@b", "a@", "a:@b", "a=@b", "@,@}"}) {
            std::string name;
            for (const char sign : std::string_view(form)) {
                name += sign == '@' ? letter : sign;
            }
            names.push_back(name);
        }
    }
    return names;
}

/// What a shell takes the name for in a file that the provider wrote.
std::string readBack(const std::string& shell, const std::string& name) {
    const ZR::Testing::TemporaryDirectory directory;
    ZR::Testing::writeFile(directory / "ifcfg", "DEVICE=eth0\nCONFIG_NAME=" + name + "\n");
    const std::string command = "cd " + directory.path().string() + " && HOME=/somewhere " + shell +
                                " -c '. ./ifcfg; printf %s \"$CONFIG_NAME\"' >out 2>err";
    EXPECT_EQ(::system(command.c_str()), 0) << name;  // NOLINT(cert-env33-c,concurrency-mt-unsafe)
    return ZR::Testing::readFile(directory / "out");
}

TEST(RenameRefusals, EveryNameThatIsTakenIsReadBackByShellsAsItself) {
    std::vector<std::string> taken;
    for (const std::string& name : namesWithEveryCharacter()) {
        if (refusalsOfName(name).empty()) {
            taken.push_back(name);
        }
    }
    EXPECT_GT(taken.size(), 400U);
    // One shell for all of them: a line each, and a name of its own.
    std::string lines;
    std::string expected;
    for (const std::string& name : taken) {
        lines.append("CONFIG_NAME=").append(name).append("\nprintf '%s\\n' \"$CONFIG_NAME\"\n");
        expected.append(name).append("\n");
    }
    const ZR::Testing::TemporaryDirectory directory;
    ZR::Testing::writeFile(directory / "lines", lines);
    for (const std::string shell : {"/bin/sh", "bash"}) {
        const std::string command =
            "cd " + directory.path().string() + " && " + shell + " -c '. ./lines' >out 2>err";
        EXPECT_EQ(::system(command.c_str()), 0);  // NOLINT(cert-env33-c,concurrency-mt-unsafe)
        EXPECT_EQ(ZR::Testing::readFile(directory / "out"), expected) << shell;
        EXPECT_EQ(ZR::Testing::readFile(directory / "err"), "") << shell;
    }
}

TEST(RenameRefusals, NamesThatShellsReadOtherwiseAreRefused) {
    for (const char* name : {"$HOME", "a\\b", "~", "a:~", "a#b'c'", "\"a\"b", "${X}", "a$(true)"}) {
        EXPECT_NE(readBack("/bin/sh", name), name) << "it would be harmless";
        EXPECT_THAT(refusalsOfName(name), testing::SizeIs(testing::Ge(1U))) << name;
    }
    for (const char* name :
         {"the office", "a;b", "a&b", "a|b", "a`b`", "a>b", "a<b", "(a)", "a\tb", "~root", "a=~"}) {
        EXPECT_FALSE(refusalsOfName(name).empty()) << name;
    }
}

TEST(RenameRefusals, TellWhatAShellWouldDo) {
    EXPECT_THAT(refusalsOfName("a b"),
                ElementsAre("the name has a blank: a shell that reads the file ends the name "
                            "there, and runs what follows"));
    EXPECT_THAT(refusalsOfName("a;$b\""),
                ElementsAre(HasSubstr("has a \";\""), HasSubstr("has a \"$\""),
                            HasSubstr("has a quotation mark")));
    EXPECT_THAT(refusalsOfName("~/x"), ElementsAre(HasSubstr("home directory")));
}

TEST(RenameRefusals, ANameLeavesRoomInItsLine) {
    EXPECT_THAT(refusalsOfName(std::string(490, 'a')), IsEmpty());
    EXPECT_THAT(refusalsOfName(std::string(491, 'a')),
                ElementsAre(HasSubstr("the name has 491 bytes, more than 490")));
}

TEST(RenameRefusals, LinesThatOnlyContainTheKeyAreToldWithTheirNumbers) {
    EXPECT_THAT(refusalsOfContent("DEVICE=eth0\nCONFIG_NAME=home\nCONFIG_NAME=\n"), IsEmpty());
    EXPECT_THAT(refusalsOfContent(""), IsEmpty());
    EXPECT_THAT(
        refusalsOfContent("# CONFIG_NAME=x\nA=b\n CONFIG_NAME=x\nMY_CONFIG_NAME=x\nCONFIG_NAME2=x"),
        ElementsAre("line 1, \"# CONFIG_NAME=x\", contains CONFIG_NAME: the whole line would be "
                    "replaced by the new name's line",
                    testing::StartsWith("line 3, \" CONFIG_NAME=x\", "),
                    testing::StartsWith("line 4, \"MY_CONFIG_NAME=x\", "),
                    testing::StartsWith("line 5, \"CONFIG_NAME2=x\", ")));
    EXPECT_THAT(refusalsOfContent(std::string_view("A\0CONFIG_NAME\n", 14)), IsEmpty())
        << "the provider does not look behind a zero byte";
}

TEST(RenameRefusals, LongLinesAreTold) {
    EXPECT_THAT(refusalsOfContent("CONFIG_NAME=" + std::string(498, 'a') + "\n"), IsEmpty());
    EXPECT_THAT(refusalsOfContent("A=b\nCONFIG_NAME=" + std::string(499, 'a') + "\n"),
                ElementsAre("line 2, \"CONFIG_NAME=" + std::string(48, 'a') +
                            "...\", has 511 bytes: it would be taken for several lines of at most "
                            "511, and each of these that contains CONFIG_NAME replaced by the new "
                            "name's line"));
}

TEST(ConfigurationContent, KnowsWhetherItsLastLineHasAnEnd) {
    EXPECT_FALSE(lacksLineEnd(""));
    EXPECT_FALSE(lacksLineEnd("A=b\n"));
    EXPECT_TRUE(lacksLineEnd("A=b\nC=d"));
}

TEST(ConfigurationContent, TellsItsNames) {
    EXPECT_EQ(namesIn("A=b\n"), "no CONFIG_NAME");
    EXPECT_EQ(namesIn("A=b\nCONFIG_NAME=\"x\x01\"\n"), "CONFIG_NAME=x\\x01 in line 2");
    EXPECT_EQ(namesIn("CONFIG_NAME=x\nCONFIG_NAME=y"),
              "CONFIG_NAME=x in line 1, and CONFIG_NAME=y in line 2");
}

}  // namespace
}  // namespace cimdhcp
