#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <array>
#include <cstring>
#include <filesystem>
#include <iterator>
#include <string>
#include <vector>

#include "LogSink.h"
#include "kit/ChildProcess.h"
#include "kit/Files.h"
#include "kit/LogCapture.h"
#include "kit/PrivateNamespace.h"
#include "zrcommon/UniqueFd.h"

namespace TKLog {

namespace {

using ZR::Testing::parseLog;
using ZR::Testing::readFile;
using ZR::Testing::writeFile;

void say(LogSink& sink, std::string_view message) {
    sink.write({"file", "function", 1, "category", 6000, message});
}

std::vector<std::string> messagesIn(const std::string& path) {
    std::vector<std::string> messages;
    for (const auto& record : parseLog(readFile(path))) {
        messages.push_back(record.message);
    }
    return messages;
}

using Messages = std::vector<std::string>;

class FileSinkTest : public testing::Test {
  protected:
    ZR::Testing::TemporaryDirectory directory_;
    std::string path_ = directory_ / "log";
    LogSink sink_{"file:" + path_};
};

TEST_F(FileSinkTest, FileIsMadeAtTheFirstLine) {
    EXPECT_FALSE(std::filesystem::exists(path_));
    say(sink_, "one");
    EXPECT_EQ(messagesIn(path_), Messages{"one"});
}

TEST_F(FileSinkTest, FileIsNotForEveryonesEyes) {
    say(sink_, "one");
    struct stat status {};
    ASSERT_EQ(::stat(path_.c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 0137U, 0U);
}

TEST_F(FileSinkTest, LinesAreAppendedToWhatIsThere) {
    writeFile(path_, "2026-11-20T08:15:30.123456Z 1 c f:1 g old\n");
    say(sink_, "new");
    EXPECT_EQ(messagesIn(path_), (Messages{"old", "new"}));
}

TEST_F(FileSinkTest, FileThatWasRenamedAwayIsOpenedAnewByName) {
    say(sink_, "before");
    std::filesystem::rename(path_, path_ + ".1");
    say(sink_, "after");
    say(sink_, "later");
    EXPECT_EQ(messagesIn(path_ + ".1"), Messages{"before"});
    EXPECT_EQ(messagesIn(path_), (Messages{"after", "later"}));
}

TEST_F(FileSinkTest, FileThatAnotherTookThePlaceOfIsLeft) {
    say(sink_, "before");
    std::filesystem::rename(path_, path_ + ".1");
    writeFile(path_, "");
    say(sink_, "after");
    EXPECT_EQ(messagesIn(path_ + ".1"), Messages{"before"});
    EXPECT_EQ(messagesIn(path_), Messages{"after"});
}

TEST_F(FileSinkTest, FileThatWasRemovedIsMadeAnew) {
    say(sink_, "before");
    std::filesystem::remove(path_);
    say(sink_, "after");
    EXPECT_EQ(messagesIn(path_), Messages{"after"});
}

TEST_F(FileSinkTest, FileThatWasEmptiedIsWrittenFromItsBeginning) {
    say(sink_, "before");
    std::filesystem::resize_file(path_, 0);
    say(sink_, "after");
    EXPECT_EQ(messagesIn(path_), Messages{"after"});
}

TEST_F(FileSinkTest, GoesOnInTheFileWhenItCanBeOpenedAgain) {
    std::filesystem::create_directory(path_);  // cannot be opened for writing
    say(sink_, "lost to the file");
    std::filesystem::remove(path_);
    say(sink_, "back");
    EXPECT_EQ(messagesIn(path_), Messages{"back"});
}

TEST_F(FileSinkTest, RotationLeavesNoDescriptorOpen) {
    const auto openDescriptors = [] {
        using Entries = std::filesystem::directory_iterator;
        return std::distance(Entries("/proc/self/fd"), Entries());
    };
    say(sink_, "first");
    const auto before = openDescriptors();
    for (int i = 0; i < 5; ++i) {
        std::filesystem::rename(path_, path_ + ".1");
        say(sink_, "next");
    }
    EXPECT_EQ(openDescriptors(), before);
}

TEST_F(FileSinkTest, DescriptorIsNotHandedToPrograms) {
    say(sink_, "first");
    bool found = false;
    for (const auto& entry : std::filesystem::directory_iterator("/proc/self/fd")) {
        std::error_code gone;  // the iterator's own descriptor is listed, too
        if (std::filesystem::read_symlink(entry.path(), gone) == path_) {
            found = true;
            const int flags = ::fcntl(std::stoi(entry.path().filename().string()), F_GETFD);
            EXPECT_NE(flags & FD_CLOEXEC, 0);
        }
    }
    EXPECT_TRUE(found);
}

TEST(LogSink, NoneAndUnknownNamesKeepNothing) {
    for (const char* name : {"none", "", "console", "FILE:/x", "stderr "}) {
        LogSink sink(name);
        EXPECT_TRUE(sink.keepsNothing()) << name;
        say(sink, "to no sink");
    }
    for (const char* name : {"stderr", "syslog", "file:/x"}) {
        EXPECT_FALSE(LogSink(name).keepsNothing()) << name;
    }
}

TEST(LogSink, StandardErrorGetsTheLineAsAFileDoes) {
    ZR::Testing::TemporaryDirectory directory;
    const auto result = ZR::Testing::inChild([&directory] {
        const int file = ::open((directory / "errors").c_str(), O_WRONLY | O_CREAT, 0600);
        ::dup2(file, STDERR_FILENO);
        LogSink sink("stderr");
        say(sink, "one");
        say(sink, "two\nlines");
        return std::string();
    });
    EXPECT_EQ(result, (ZR::Testing::ChildResult{"", 0, 0}));
    EXPECT_EQ(messagesIn(directory / "errors"), (Messages{"one", "two\\nlines"}));
}

TEST(LogSink, LineThatFitsNowhereIsDropped) {
    LogSink sink("file:/dev/full");
    say(sink, "no space");  // neither hangs nor throws
    SUCCEED();
}

}  // namespace

// The daemon is played by a socket of the test's own at /dev/log, in a mount name
// space that no other process sees.

namespace {

using ZR::Testing::inChild;

void say(LogSink& sink, int level, std::string_view message) {
    sink.write({"file", "a function", 1, "category", level, message});
}

/// A datagram as "<PRIORITY>TEXT", without the time and the program's name, which
/// are the C library's.
std::string priorityAndText(const std::string& datagram) {
    const std::size_t priority = datagram.find('>');
    const std::size_t text = datagram.find(": ");
    if (priority == std::string::npos || text == std::string::npos) {
        return "not for syslog: " + datagram;
    }
    return datagram.substr(0, priority + 1) + datagram.substr(text + 2);
}

class SyslogTest : public testing::Test {
  protected:
    void SetUp() override {
        if (!ZR::Testing::canEnterNamespaces()) {
            GTEST_SKIP() << "needs a mount name space of its own";
        }
    }

    /// What the daemon gets from a function, one line each.
    template <typename Function>
    static std::string daemonGets(const Function& function) {
        return inChild([&function] {
                   ZR::Testing::enterNamespaces(CLONE_NEWNS);
                   ZR::Testing::mountEmpty("/dev");
                   const ZR::UniqueFd daemon{
                       ::socket(AF_UNIX, SOCK_DGRAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0)};
                   sockaddr_un address{};
                   address.sun_family = AF_UNIX;
                   std::strcpy(address.sun_path, "/dev/log");
                   if (::bind(daemon.get(), reinterpret_cast<const sockaddr*>(&address),
                              sizeof address) != 0) {
                       return std::string("cannot bind");
                   }
                   function();
                   std::string lines;
                   std::array<char, 4096> datagram{};
                   for (;;) {
                       const ssize_t size =
                           ::recv(daemon.get(), datagram.data(), datagram.size(), 0);
                       if (size < 0) {
                           return lines;
                       }
                       lines += priorityAndText(
                           std::string(datagram.data(), static_cast<std::size_t>(size)));
                       lines += '\n';
                   }
               })
            .output;
    }
};

TEST_F(SyslogTest, DaemonGetsTheLineWithoutTimeAndLevel) {
    EXPECT_EQ(daemonGets([] {
                  LogSink sink("syslog");
                  say(sink, 6000, "a message");
              }),
              "<27>category file:1 a\\x20function a message\n");
}

TEST_F(SyslogTest, LevelsBecomePriorities) {
    // Facility daemon (3) times 8, plus error (3), information (6) or debugging (7).
    EXPECT_EQ(daemonGets([] {
                  LogSink sink("syslog");
                  for (const int level : {7000, 6000, 5999, 4000, 3999, 0}) {
                      say(sink, level, "m");
                  }
              }),
              "<27>category file:1 a\\x20function m\n"
              "<27>category file:1 a\\x20function m\n"
              "<30>category file:1 a\\x20function m\n"
              "<30>category file:1 a\\x20function m\n"
              "<31>category file:1 a\\x20function m\n"
              "<31>category file:1 a\\x20function m\n");
}

TEST_F(SyslogTest, PercentSignsAreText) {
    EXPECT_EQ(daemonGets([] {
                  LogSink sink("syslog");
                  say(sink, 6000, "Computer%eth0 %s%n");
              }),
              "<27>category file:1 a\\x20function Computer%eth0 %s%n\n");
}

TEST_F(SyslogTest, FileThatCannotBeOpenedIsToldOnceAndItsLinesGoToTheDaemon) {
    EXPECT_EQ(daemonGets([] {
                  LogSink sink("file:/nowhere/log");
                  say(sink, 6000, "one");
                  say(sink, 4000, "two");
              }),
              "<27>log file /nowhere/log: No such file or directory\n"
              "<27>category file:1 a\\x20function one\n"
              "<30>category file:1 a\\x20function two\n");
}

TEST_F(SyslogTest, FileThatFailsAgainAfterItWorkedIsToldAgain) {
    EXPECT_EQ(daemonGets([] {
                  std::filesystem::create_directory("/dev/below");
                  LogSink sink("file:/dev/below/log");
                  say(sink, 6000, "into the file");
                  std::filesystem::rename("/dev/below", "/dev/moved");
                  say(sink, 6000, "one");
                  std::filesystem::create_directory("/dev/below");
                  say(sink, 6000, "into the file");
                  std::filesystem::remove_all("/dev/below");
                  say(sink, 6000, "two");
              }),
              "<27>log file /dev/below/log: No such file or directory\n"
              "<27>category file:1 a\\x20function one\n"
              "<27>log file /dev/below/log: No such file or directory\n"
              "<27>category file:1 a\\x20function two\n");
}

TEST(SyslogWithoutADaemon, LinesAreLostQuietly) {
    LogSink sink("syslog");
    say(sink, 6000, "perhaps heard, perhaps not");
    LogSink file("file:/nowhere/log");
    say(file, 6000, "perhaps heard, perhaps not");
    SUCCEED();
}

}  // namespace

}  // namespace TKLog
