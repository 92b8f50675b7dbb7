// The daemon is played by a socket of the test's own at /dev/log, in a mount name
// space that no other process sees.
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <array>
#include <cstring>
#include <filesystem>
#include <string>

#include "LogSink.h"
#include "kit/ChildProcess.h"
#include "kit/PrivateNamespace.h"
#include "zrcommon/UniqueFd.h"

namespace TKLog {

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
