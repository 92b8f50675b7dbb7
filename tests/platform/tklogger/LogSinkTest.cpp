#include "LogSink.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <filesystem>
#include <iterator>
#include <string>
#include <vector>

#include "kit/ChildProcess.h"
#include "kit/FileContent.h"
#include "kit/LogCapture.h"
#include "kit/TemporaryDirectory.h"

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

}  // namespace TKLog
