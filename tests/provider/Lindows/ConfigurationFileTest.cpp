#include "Lindows/ConfigurationFile.h"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <grp.h>
#include <gtest/gtest.h>
#include <sys/mount.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <random>
#include <stdexcept>
#include <string>
#include <vector>

#include "Lindows/DHCPSettingData.h"
#include "kit/ChildProcess.h"
#include "kit/Files.h"
#include "kit/LogCapture.h"
#include "kit/PrivateNamespace.h"

namespace {

namespace fs = std::filesystem;
using namespace std::string_literals;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::MatchesRegex;
using ZR::DHCPClientProvider::configurationFilePath;
using ZR::DHCPClientProvider::modifyValue;
using ZR::Testing::ChildResult;
using ZR::Testing::inChild;
using ZR::Testing::LogCapture;
using ZR::Testing::readFile;
using ZR::Testing::TemporaryDirectory;
using ZR::Testing::writeFile;
using ZR::Testing::Printing::PrintTo;

/// What a rewrite in place must keep of a file, apart from its content.
struct Identity {
    dev_t device;
    ino_t inode;
    uid_t owner;
    gid_t group;
    mode_t mode;
    nlink_t links;

    bool operator==(const Identity&) const = default;
};

Identity identityOf(const std::string& path) {
    struct stat status {};
    if (::lstat(path.c_str(), &status) != 0) {
        throw std::runtime_error("no status of " + path);
    }
    return {status.st_dev, status.st_ino,  status.st_uid,
            status.st_gid, status.st_mode, status.st_nlink};
}

/// Becomes a user whom file modes bind. For children only.
void becomeNobody() {
    constexpr uid_t nobody = 65534;
    if (::geteuid() != 0) {
        return;
    }
    if (::setgroups(0, nullptr) != 0 || ::setgid(nobody) != 0 || ::setuid(nobody) != 0) {
        throw std::runtime_error("cannot become nobody");
    }
}

/// Gives a file a content without emptying it first, for which some disks would wait.
void fill(const std::string& path, const std::string& content) {
    std::ofstream(path, std::ios::app).close();
    std::fstream file(path, std::ios::in | std::ios::out | std::ios::binary);
    file.write(content.data(), static_cast<std::streamsize>(content.size()));
    file.close();
    fs::resize_file(path, content.size());
    if (!file) {
        throw std::runtime_error("cannot fill " + path);
    }
}

/// Takes the calling child into a mount name space. Without privileges it stays its own
/// user and group in the user name space that comes with it: no other user could make files there.
void enterMountNamespace() {
    const std::string user = std::to_string(::geteuid());
    const std::string group = std::to_string(::getegid());
    ZR::Testing::enterNamespaces(CLONE_NEWNS);
    if (user != "0") {
        writeFile("/proc/self/setgroups", "deny");
        writeFile("/proc/self/uid_map", user + " " + user + " 1");
        writeFile("/proc/self/gid_map", group + " " + group + " 1");
    }
}

class ConfigurationFile : public ::testing::Test {
  protected:
    /// What one rewrite makes of a content.
    std::string rewritten(const std::string& content, const std::string& key,
                          const std::string& value) {
        fill(path_, content);
        modifyValue(path_, key, value);
        return readFile(path_);
    }
    std::string renamed(const std::string& content) {
        return rewritten(content, "CONFIG_NAME", "new");
    }

    TemporaryDirectory directory_;
    std::string path_ = directory_ / "ifcfg-eth0";
};

TEST_F(ConfigurationFile, ReplacesTheLineOfTheKey) {
    EXPECT_EQ(renamed("DEVICE=eth0\nCONFIG_NAME=old\n"), "DEVICE=eth0\nCONFIG_NAME=new\n");
    EXPECT_EQ(renamed("CONFIG_NAME=a much longer name than the new one\nDEVICE=eth0\n"),
              "CONFIG_NAME=new\nDEVICE=eth0\n");
}

TEST_F(ConfigurationFile, AppendsAMissingKey) {
    EXPECT_EQ(renamed("DEVICE=eth0\n"), "DEVICE=eth0\nCONFIG_NAME=new\n");
}

TEST_F(ConfigurationFile, GluesAnAppendedKeyOntoALineWithoutAnEnd) {
    EXPECT_EQ(renamed("DEVICE=eth0"), "DEVICE=eth0CONFIG_NAME=new\n");
}

TEST_F(ConfigurationFile, EndsALineOfTheKeyThatHadNoEnd) {
    EXPECT_EQ(renamed("DEVICE=eth0\nCONFIG_NAME=old"), "DEVICE=eth0\nCONFIG_NAME=new\n");
}

TEST_F(ConfigurationFile, ReplacesACommentThatMentionsTheKey) {
    EXPECT_EQ(renamed("# the CONFIG_NAME is shown to users\nDEVICE=eth0\n"),
              "CONFIG_NAME=new\nDEVICE=eth0\n");
}

TEST_F(ConfigurationFile, ReplacesALongerKeyThatContainsTheKey) {
    EXPECT_EQ(renamed("OLD_CONFIG_NAME_2=x\nDEVICE=eth0\n"), "CONFIG_NAME=new\nDEVICE=eth0\n");
}

TEST_F(ConfigurationFile, ReplacesAValueThatContainsTheKey) {
    EXPECT_EQ(renamed("DEVICE=CONFIG_NAME\n"), "CONFIG_NAME=new\n");
}

TEST_F(ConfigurationFile, ReplacesEveryLineWithTheKey) {
    EXPECT_EQ(renamed("CONFIG_NAME=a\nDEVICE=eth0\nCONFIG_NAME=b\n"),
              "CONFIG_NAME=new\nDEVICE=eth0\nCONFIG_NAME=new\n");
}

TEST_F(ConfigurationFile, ComparesTheKeyWithRegardToCase) {
    EXPECT_EQ(renamed("config_name=old\n"), "config_name=old\nCONFIG_NAME=new\n");
}

TEST_F(ConfigurationFile, WritesAnEmptyValue) {
    EXPECT_EQ(rewritten("CONFIG_NAME=old\nA=1\n", "CONFIG_NAME", ""), "CONFIG_NAME=\nA=1\n");
}

TEST_F(ConfigurationFile, FillsAnEmptyFile) {
    EXPECT_EQ(renamed(""), "CONFIG_NAME=new\n");
}

TEST_F(ConfigurationFile, KeepsCarriageReturnsOfOtherLines) {
    EXPECT_EQ(renamed("A=1\r\nCONFIG_NAME=old\r\nB=2\r\n"), "A=1\r\nCONFIG_NAME=new\nB=2\r\n");
}

TEST_F(ConfigurationFile, KeepsBlankLinesAndOddBytes) {
    EXPECT_EQ(renamed("\n\n \t\nA=\xFF\xFE\x01\nCONFIG_NAME=old\n\n"),
              "\n\n \t\nA=\xFF\xFE\x01\nCONFIG_NAME=new\n\n");
}

TEST_F(ConfigurationFile, KeepsZeroBytesAndDoesNotLookBehindThem) {
    EXPECT_EQ(renamed("A=1\0 2\nCONFIG_NAME=old\n"s), "A=1\0 2\nCONFIG_NAME=new\n"s);
    EXPECT_EQ(renamed("A=1\0CONFIG_NAME=old\n"s), "A=1\0CONFIG_NAME=old\nCONFIG_NAME=new\n"s);
    EXPECT_EQ(renamed("\0\nCONFIG_NAME=old\0rest\n"s), "\0\nCONFIG_NAME=new\n"s);
}

TEST_F(ConfigurationFile, WritesAValueOfAnyLengthWhole) {
    for (const std::size_t size : {499U, 500U, 511U, 512U, 5000U, 100000U}) {
        const std::string value(size, 'v');
        EXPECT_EQ(rewritten("CONFIG_NAME=old\nA=1\n", "CONFIG_NAME", value),
                  "CONFIG_NAME=" + value + "\nA=1\n")
            << size;
    }
}

TEST_F(ConfigurationFile, SecondWriteOfTheSameValueChangesNothing) {
    const std::string once = renamed("A=1\nCONFIG_NAME=old\nB=2\n");
    modifyValue(path_, "CONFIG_NAME", "new");
    EXPECT_EQ(readFile(path_), once);
}

/// Lines of these many bytes, their line feeds included: the longest that is one
/// piece has 511.
class LinesAroundThePieceSize : public ConfigurationFile,
                                public ::testing::WithParamInterface<std::size_t> {
  protected:
    static constexpr std::size_t pieceSize = 511;

    /// A line with the key at a place, and a text of no meaning around it.
    static std::string lineWith(const std::string& key, std::size_t place) {
        std::string line(GetParam() - 1, '.');
        line.replace(place, key.size(), key);
        return line + "\n";
    }
};

TEST_P(LinesAroundThePieceSize, WithoutTheKeyAreKept) {
    const std::string line = std::string(GetParam() - 1, '.') + "\n";
    EXPECT_EQ(rewritten(line + "CONFIG_NAME=old\n" + line, "CONFIG_NAME", "new"),
              line + "CONFIG_NAME=new\n" + line);
}

TEST_P(LinesAroundThePieceSize, WithTheKeyAtTheStartLoseTheirFirstPiece) {
    const std::string line = lineWith("CONFIG_NAME", 0);
    const std::string rest = line.size() > pieceSize ? line.substr(pieceSize) : "";
    EXPECT_EQ(renamed("A=1\n" + line + "B=2\n"), "A=1\nCONFIG_NAME=new\n" + rest + "B=2\n");
}

TEST_P(LinesAroundThePieceSize, WithTheKeyJustBeforeThePiecesEndLoseTheirFirstPiece) {
    // The last place at which the key is whole in the first piece.
    const std::size_t place = std::min(GetParam() - 1, pieceSize) - 1;
    const std::string line = lineWith("K", place);
    const std::string rest = line.size() > pieceSize ? line.substr(pieceSize) : "";
    EXPECT_EQ(rewritten(line + "B=2\n", "K", "v"), "K=v\n" + rest + "B=2\n");
}

TEST_P(LinesAroundThePieceSize, WithTheKeyBehindThePiecesEndLoseTheirSecondPiece) {
    if (GetParam() < pieceSize + 2) {
        return;  // the second piece, if any, is the line feed alone
    }
    const std::string line = lineWith("K", pieceSize);
    EXPECT_EQ(rewritten(line + "B=2\n", "K", "v"), line.substr(0, pieceSize) + "K=v\nB=2\n");
}

TEST_P(LinesAroundThePieceSize, WithTheKeyAcrossThePiecesEndAreKept) {
    if (GetParam() < pieceSize + 2) {
        return;  // such a line has no text on both sides of the end
    }
    const std::string line = lineWith("KE", pieceSize - 1);
    EXPECT_EQ(rewritten(line, "KE", "v"), line + "KE=v\n");
}

INSTANTIATE_TEST_SUITE_P(Bytes, LinesAroundThePieceSize, ::testing::Values(510, 511, 512, 513, 514),
                         [](const auto& parameter) { return std::to_string(parameter.param); });

TEST_F(ConfigurationFile, EachPieceOfALongLineWithTheKeyIsReplaced) {
    std::string line(2000, '.');
    for (const std::size_t place : {10U, 600U, 1600U}) {
        line.replace(place, 3, "KEY");
    }
    // Of the four pieces the third one has no key.
    EXPECT_EQ(rewritten(line + "\n", "KEY", "v"),
              "KEY=v\nKEY=v\n" + line.substr(1022, 511) + "KEY=v\n");
}

TEST_F(ConfigurationFile, RewritesInPlace) {
    writeFile(path_, "CONFIG_NAME=old\n");
    ASSERT_EQ(::chmod(path_.c_str(), 0604), 0);
    if (::geteuid() == 0) {
        ASSERT_EQ(::chown(path_.c_str(), 1234, 4321), 0);
    }
    fs::create_hard_link(path_, directory_ / "other name");
    const Identity before = identityOf(path_);
    for (const char* value : {"a longer name than the one before", "short", ""}) {
        modifyValue(path_, "CONFIG_NAME", value);
        EXPECT_EQ(readFile(path_), "CONFIG_NAME="s + value + "\n");
        EXPECT_EQ(identityOf(path_), before);
    }
    // There is nothing beside the file either: no backup, nothing temporary.
    EXPECT_EQ(std::distance(fs::directory_iterator(directory_.path()), fs::directory_iterator()),
              2);
}

TEST_F(ConfigurationFile, MissingFileIsNotCreated) {
    const LogCapture capture(6000, 6000);
    modifyValue(path_, "CONFIG_NAME", "new");
    modifyValue(directory_ / "missing/ifcfg-eth0", "CONFIG_NAME", "new");
    EXPECT_TRUE(fs::is_empty(directory_.path()));
    EXPECT_THAT(capture.log(), IsEmpty());
}

TEST_F(ConfigurationFile, ReadOnlyFileStaysAsItIsWithoutAWord) {
    writeFile(path_, "CONFIG_NAME=old\n");
    ASSERT_EQ(::chmod(path_.c_str(), 0444), 0);
    fs::permissions(directory_.path(), fs::perms{0755});
    const ChildResult child = inChild([this] {
        becomeNobody();
        const LogCapture capture(6000, 6000);
        modifyValue(path_, "CONFIG_NAME", "new");
        return std::to_string(capture.log().size()) + " lines";
    });
    EXPECT_EQ(child, (ChildResult{"0 lines", 0, 0}));
    EXPECT_EQ(readFile(path_), "CONFIG_NAME=old\n");
}

TEST_F(ConfigurationFile, FileThatMayNotBeReadStaysAsItIs) {
    writeFile(path_, "CONFIG_NAME=old\n");
    ASSERT_EQ(::chmod(path_.c_str(), 0222), 0);
    fs::permissions(directory_.path(), fs::perms{0755});
    const ChildResult child = inChild([this] {
        becomeNobody();
        modifyValue(path_, "CONFIG_NAME", "new");
        return "done"s;
    });
    EXPECT_EQ(child, (ChildResult{"done", 0, 0}));
    ASSERT_EQ(::chmod(path_.c_str(), 0644), 0);
    EXPECT_EQ(readFile(path_), "CONFIG_NAME=old\n");
}

TEST_F(ConfigurationFile, WritableFileOfAnotherOwnerIsRewritten) {
    writeFile(path_, "CONFIG_NAME=old\n");
    ASSERT_EQ(::chmod(path_.c_str(), 0666), 0);
    fs::permissions(directory_.path(), fs::perms{0755});
    const Identity before = identityOf(path_);
    const ChildResult child = inChild([this] {
        becomeNobody();
        modifyValue(path_, "CONFIG_NAME", "new");
        return "done"s;
    });
    EXPECT_EQ(child, (ChildResult{"done", 0, 0}));
    EXPECT_EQ(readFile(path_), "CONFIG_NAME=new\n");
    EXPECT_EQ(identityOf(path_), before);
}

TEST_F(ConfigurationFile, DirectoryInItsPlaceStaysAsItIs) {
    fs::create_directory(path_);
    const Identity before = identityOf(path_);
    modifyValue(path_, "CONFIG_NAME", "new");
    EXPECT_EQ(identityOf(path_), before);
    EXPECT_TRUE(fs::is_empty(path_));
}

TEST_F(ConfigurationFile, PipeInItsPlaceHangsNobody) {
    ASSERT_EQ(::mkfifo(path_.c_str(), 0666), 0);
    const ChildResult child = inChild([this] {
        ::alarm(20);
        modifyValue(path_, "CONFIG_NAME", "new");
        return "done"s;
    });
    EXPECT_EQ(child, (ChildResult{"done", 0, 0}));
    EXPECT_TRUE(fs::is_fifo(path_));
}

TEST_F(ConfigurationFile, PipeWithAnOpenEndGetsNothing) {
    ASSERT_EQ(::mkfifo(path_.c_str(), 0666), 0);
    const int end = ::open(path_.c_str(), O_RDWR | O_NONBLOCK | O_CLOEXEC);
    ASSERT_GE(end, 0);
    modifyValue(path_, "CONFIG_NAME", "new");
    char byte = 0;
    EXPECT_EQ(::read(end, &byte, 1), -1);
    EXPECT_EQ(errno, EAGAIN);
    ::close(end);
}

TEST_F(ConfigurationFile, SymbolicLinkStaysAndItsTargetIsRewritten) {
    const std::string target = directory_ / "target";
    writeFile(target, "CONFIG_NAME=old\n");
    fs::create_symlink("target", path_);
    const Identity before = identityOf(target);
    modifyValue(path_, "CONFIG_NAME", "new");
    EXPECT_TRUE(fs::is_symlink(path_));
    EXPECT_EQ(readFile(target), "CONFIG_NAME=new\n");
    EXPECT_EQ(identityOf(target), before);
}

TEST_F(ConfigurationFile, DanglingSymbolicLinkCreatesNothing) {
    fs::create_symlink("target", path_);
    modifyValue(path_, "CONFIG_NAME", "new");
    EXPECT_FALSE(fs::exists(directory_ / "target"));
    EXPECT_TRUE(fs::is_symlink(path_));
}

TEST_F(ConfigurationFile, ValueThatIsNoLineIsRefusedWithAFailureLine) {
    const std::string content = "A=1\nCONFIG_NAME=old\n";
    for (const std::string& value : {"a\nb"s, "a\rb"s, "a\0b"s, "\n"s, "\r"s, "\0"s}) {
        const LogCapture capture(6000, 6000);
        EXPECT_EQ(rewritten(content, "CONFIG_NAME", value), content);
        for (const auto& records : {capture.log(), capture.trace()}) {
            ASSERT_EQ(records.size(), 1U);
            EXPECT_EQ(records[0].level, 6000);
            EXPECT_EQ(records[0].file, "Lindows/DHCPSettingData");
            EXPECT_THAT(records[0].message,
                        MatchesRegex("MESSAGE \\[File: Lindows/DHCPSettingData, Line: "
                                     "[0-9]+\\]: The value cannot be one line of the "
                                     "configuration file"));
        }
    }
}

TEST_F(ConfigurationFile, GoodRewriteTellsNoFailure) {
    const LogCapture capture(6000, 6000);
    renamed("CONFIG_NAME=old\n");
    EXPECT_THAT(capture.log(), IsEmpty());
    EXPECT_THAT(capture.trace(), IsEmpty());
}

TEST_F(ConfigurationFile, TracesItsParametersAtEntryAndExit) {
    writeFile(path_, "CONFIG_NAME=old\n");
    const LogCapture capture;
    modifyValue(path_, "CONFIG_NAME", "new");
    const auto messages = capture.logMessages();
    ASSERT_EQ(messages.size(), 2U);
    EXPECT_THAT(messages[0], MatchesRegex("ENTERING: modifyValue\\(\\) in .*"));
    EXPECT_THAT(messages[1], MatchesRegex("EXITING: modifyValue\\(\\) in .*"));
    for (const std::string& message : messages) {
        EXPECT_THAT(message,
                    HasSubstr(",Parameters List:  path=" + path_ + " key=CONFIG_NAME value=new"));
    }
}

/// A file that fills its page of a small file system but for a few bytes, and a value
/// for which there is no room.
TEST_F(ConfigurationFile, FullDiskKeepsTheContentAndTellsOnce) {
    if (!ZR::Testing::canEnterNamespaces()) {
        GTEST_SKIP() << "needs a mount name space of its own";
    }
    const std::string content = "CONFIG_NAME=old\n" + std::string(4000, '.') + "\nLAST=1\n";
    const ChildResult child = inChild([&] {
        enterMountNamespace();
        const std::string disk = directory_.path();
        if (::mount("tmpfs", disk.c_str(), "tmpfs", 0, "size=16k") != 0) {
            throw std::runtime_error("no small file system");
        }
        writeFile(path_, content);
        const int filler = ::open((directory_ / "filler").c_str(), O_WRONLY | O_CREAT, 0600);
        const std::string page(4096, 'x');
        while (::write(filler, page.data(), page.size()) > 0) {
        }
        // Not even written and restored: the time of the last change stays.
        constexpr std::array<timespec, 2> longAgo{{{1, 0}, {1, 0}}};
        if (::utimensat(AT_FDCWD, path_.c_str(), longAgo.data(), 0) != 0) {
            throw std::runtime_error("cannot set the time");
        }
        const Identity before = identityOf(path_);
        const LogCapture capture(6000, 6000);
        modifyValue(path_, "CONFIG_NAME", std::string(8192, 'v'));
        std::string report = readFile(path_) == content ? "kept" : "changed";
        struct stat status {};
        if (::stat(path_.c_str(), &status) != 0 || status.st_mtim.tv_sec != longAgo[1].tv_sec) {
            report += ", but touched";
        }
        report += identityOf(path_) == before ? ", the same file" : ", another file";
        for (const auto& record : capture.log()) {
            report += "\n" + std::to_string(record.level) + " " + record.message;
        }
        // A value that fits is written all the same.
        modifyValue(path_, "CONFIG_NAME", "new");
        report += "\n" + readFile(path_).substr(0, 16);
        return report;
    });
    EXPECT_EQ(child.exitStatus, 0);
    EXPECT_THAT(child.output,
                MatchesRegex("kept, the same file\n6000 MESSAGE \\[File: [^\n]*\\]: [^\n]*/"
                             "ifcfg-eth0: No space left on device\nCONFIG_NAME=new\n"));
}

/// ramfs knows of no room to take.
TEST_F(ConfigurationFile, IsWrittenWhereTheFileSystemCannotPromiseRoom) {
    if (!ZR::Testing::canEnterNamespaces()) {
        GTEST_SKIP() << "needs a mount name space of its own";
    }
    const ChildResult child = inChild([&] {
        enterMountNamespace();
        if (::mount("ramfs", directory_.path().c_str(), "ramfs", 0, nullptr) != 0) {
            return std::string("no ramfs for this user");
        }
        writeFile(path_, "CONFIG_NAME=old\nLAST=1\n");
        const int fd = ::open(path_.c_str(), O_RDWR);
        std::string report =
            ::fallocate(fd, FALLOC_FL_KEEP_SIZE, 0, 1) == 0 ? "room: " : "no room: ";
        ::close(fd);
        modifyValue(path_, "CONFIG_NAME", "new");
        return report + readFile(path_);
    });
    if (child.output == "no ramfs for this user") {
        GTEST_SKIP() << child.output;
    }
    EXPECT_EQ(child.output, "no room: CONFIG_NAME=new\nLAST=1\n");
}

/// The limit on file sizes lets room be taken, but stops a write where it stands.
struct StoppedWrite {
    const char* name;
    std::string before;  ///< the value
    std::string after;
    std::size_t stop;  ///< bytes that the file may have
};

class ConfigurationFileStopped : public ConfigurationFile,
                                 public ::testing::WithParamInterface<StoppedWrite> {};

TEST_P(ConfigurationFileStopped, WriteThatFailsHalfWayPutsTheOldContentBackAndTellsOnce) {
    std::string content = "CONFIG_NAME=" + GetParam().before + "\n";
    while (content.size() < 8000) {
        content += "A" + std::to_string(content.size()) + "=1\n";
    }
    writeFile(path_, content);
    const Identity before = identityOf(path_);
    const ChildResult child = inChild([&] {
        const LogCapture capture(6000, 6000);
        std::signal(SIGXFSZ, SIG_IGN);
        struct rlimit limit {};
        limit.rlim_cur = GetParam().stop;
        limit.rlim_max = RLIM_INFINITY;
        if (::setrlimit(RLIMIT_FSIZE, &limit) != 0) {
            throw std::runtime_error("no limit on file sizes");
        }
        // All that follows the line moves, so what was written is not the old text.
        modifyValue(path_, "CONFIG_NAME", GetParam().after);
        std::string report;
        for (const auto& record : capture.log()) {
            report += std::to_string(record.level) + " " + record.message + "\n";
        }
        return report;
    });
    EXPECT_EQ(child.exitStatus, 0);
    EXPECT_THAT(child.output, MatchesRegex("6000 MESSAGE \\[File: [^\n]*\\]: [^\n]*/ifcfg-eth0: "
                                           "File too large\n"));
    EXPECT_EQ(readFile(path_), content);
    EXPECT_EQ(identityOf(path_), before);
}

INSTANTIATE_TEST_SUITE_P(
    Writes, ConfigurationFileStopped,
    ::testing::Values(
        StoppedWrite{"ThatGrows", "old", std::string(50, 'v'), 8020},
        // Only the write fails here: making a file shorter is allowed beyond the limit.
        StoppedWrite{"ThatShrinks", std::string(50, 'v'), "new", 4096}),
    [](const auto& each) { return each.param.name; });

/// The rewrite in the plainest form that there is: one byte after the other into a
/// piece, which ends with a line feed or with its 511th byte.
std::string modelOf(const std::string& content, const std::string& key, const std::string& value) {
    if (value.find('\n') != std::string::npos || value.find('\r') != std::string::npos ||
        value.find('\0') != std::string::npos) {
        return content;
    }
    std::string result;
    std::string piece;
    bool found = false;
    const auto endPiece = [&] {
        if (std::strstr(piece.c_str(), key.c_str()) != nullptr) {
            result += key + '=' + value + '\n';
            found = true;
        } else {
            result += piece;
        }
        piece.clear();
    };
    for (const char byte : content) {
        piece += byte;
        if (byte == '\n' || piece.size() == 511) {
            endPiece();
        }
    }
    if (!piece.empty()) {
        endPiece();
    }
    if (!found) {
        result += key + '=' + value + '\n';
    }
    return result;
}

class RandomTexts {
  public:
    explicit RandomTexts(unsigned seed) : generator_(seed) {}

    std::size_t below(std::size_t limit) {
        return std::uniform_int_distribution<std::size_t>(0, limit - 1)(generator_);
    }

    std::string of(const std::string& alphabet, std::size_t size) {
        std::string text(size, '\0');
        for (char& byte : text) {
            byte = alphabet[below(alphabet.size())];
        }
        return text;
    }

    std::string key() {
        switch (below(4)) {
            case 0:
                return "CONFIG_NAME";
            case 1:
                return of("AB", 1 + below(3));
            case 2:
                return of("AB=#", 1 + below(600));
            default:
                return of("AB", 1);
        }
    }

    std::string value() {
        switch (below(8)) {
            case 0:
                return of("v\n\r\0"s, below(6));
            case 1:
                return of("v= ", below(2000));
            default:
                return of("AB= v\"'#%\xFF", below(20));
        }
    }

    std::string content(const std::string& key) {
        std::string text;
        for (std::size_t parts = below(12); parts > 0; --parts) {
            switch (below(7)) {
                case 0:
                    text += key;
                    break;
                case 1:
                    text += key.substr(0, below(key.size() + 1));
                    break;
                case 2:
                    text += std::string(500 + below(30), '.');
                    break;
                case 3:
                    text += of("AB=\r\0\xFF\x01 #"s, below(40));
                    break;
                case 4:
                    text += of("AB=.\n", below(300));
                    break;
                default:
                    text += '\n';
            }
        }
        return text;
    }

  private:
    std::mt19937 generator_;
};

TEST_F(ConfigurationFile, AgreesWithItsModelOnRandomFiles) {
    const char* const wanted = std::getenv("ZR_TEST_SEED");
    const unsigned seed = wanted != nullptr
                              ? static_cast<unsigned>(std::strtoul(wanted, nullptr, 10))
                              : std::random_device()();
    std::cout << "ZR_TEST_SEED=" << seed << '\n';
    RandomTexts random(seed);
    for (int run = 0; run < 4000; ++run) {
        const std::string key = random.key();
        const std::string value = random.value();
        const std::string content = random.content(key);
        ASSERT_EQ(rewritten(content, key, value), modelOf(content, key, value))
            << "run " << run << " of seed " << seed << ", key " << key << ", content "
            << ::testing::PrintToString(content);
    }
}

TEST(ConfigurationFilePath, IsTheDirectoryAsItIsAndTheInterfaceName) {
    EXPECT_EQ(configurationFilePath("/data/", "eth0"), "/data/ifcfg-eth0");
    EXPECT_EQ(configurationFilePath("/data", "eth0"), "/dataifcfg-eth0");
    EXPECT_EQ(configurationFilePath("", "eth0.100"), "ifcfg-eth0.100");
    EXPECT_EQ(configurationFilePath("/data/", "..."), "/data/ifcfg-...");
    EXPECT_EQ(configurationFilePath("/data/", "a b%s"), "/data/ifcfg-a b%s");
    EXPECT_EQ(configurationFilePath("/data/", "\xC3\xBC"), "/data/ifcfg-\xC3\xBC");
}

TEST(ConfigurationFilePath, IsWholeHoweverLong) {
    const std::string name(300, 'n');
    EXPECT_EQ(configurationFilePath("/data/", name), "/data/ifcfg-" + name);
}

TEST(ConfigurationFilePath, IsEmptyForANameThatNamesNoFile) {
    for (const std::string& name : {""s, "."s, ".."s, "/"s, "a/b"s, "../eth0"s, "eth0\n"s, "\t"s,
                                    "eth0\0"s, "\x1f"s, "\x7f"s}) {
        EXPECT_EQ(configurationFilePath("/data/", name), "") << ::testing::PrintToString(name);
    }
}

}  // namespace
