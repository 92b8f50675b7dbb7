// What a terminal is shown beside the text.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/ioctl.h>

#include <condition_variable>
#include <cstdlib>
#include <mutex>
#include <ostream>
#include <sstream>
#include <streambuf>
#include <string>

#include "text/DisplayText.h"
#include "text/ProgressBar.h"
#include "text/Style.h"
#include "zrcommon/UniqueFd.h"

namespace cimdhcp {
namespace {

/// The terminal side of a real pseudo terminal.
class Terminal : public ::testing::Test {
  protected:
    void SetUp() override {
        ASSERT_TRUE(controller_);
        ASSERT_EQ(::grantpt(controller_.get()), 0);
        ASSERT_EQ(::unlockpt(controller_.get()), 0);
        terminal_ = ZR::UniqueFd(::open(::ptsname(controller_.get()), O_RDWR | O_NOCTTY));
        ASSERT_TRUE(terminal_);
    }

    void setWidth(unsigned short width) {
        winsize size{};
        size.ws_col = width;
        size.ws_row = 24;
        ASSERT_EQ(::ioctl(terminal_.get(), TIOCSWINSZ, &size), 0);
    }

    ZR::UniqueFd controller_{::posix_openpt(O_RDWR | O_NOCTTY)};
    ZR::UniqueFd terminal_;
};

TEST_F(Terminal, TellsItsWidth) {
    setWidth(123);
    EXPECT_EQ(terminalWidth(terminal_.get(), nullptr), 123U);
}

TEST_F(Terminal, IsEightyWideWhenItDoesNotKnow) {
    setWidth(0);
    EXPECT_EQ(terminalWidth(terminal_.get(), nullptr), 80U);
}

TEST_F(Terminal, FollowsColumnsFirst) {
    setWidth(123);
    EXPECT_EQ(terminalWidth(terminal_.get(), "60"), 60U);
    EXPECT_EQ(terminalWidth(terminal_.get(), "0"), 123U);
    EXPECT_EQ(terminalWidth(terminal_.get(), "wide"), 123U);
}

TEST(TerminalWidth, IsNoneForAFile) {
    const ZR::UniqueFd file(::open("/dev/null", O_WRONLY));
    EXPECT_EQ(terminalWidth(file.get(), "60"), std::nullopt);
}

TEST(Color, IsForTerminalsUnlessSomebodySaysOtherwise) {
    EXPECT_TRUE(wantsColor(ColorMode::automatic, true, nullptr, "xterm"));
    EXPECT_TRUE(wantsColor(ColorMode::automatic, true, "", nullptr));
    EXPECT_FALSE(wantsColor(ColorMode::automatic, false, nullptr, "xterm"));
    EXPECT_FALSE(wantsColor(ColorMode::automatic, true, "1", "xterm"));
    EXPECT_FALSE(wantsColor(ColorMode::automatic, true, nullptr, "dumb"));
}

TEST(Color, IsAsWantedOtherwise) {
    EXPECT_TRUE(wantsColor(ColorMode::always, false, "1", "dumb"));
    EXPECT_FALSE(wantsColor(ColorMode::never, true, nullptr, "xterm"));
}

TEST(Style, LeavesTextAsItIsWithoutColor) {
    EXPECT_EQ(Style{}.strong("a"), "a");
    EXPECT_EQ(Style{}.alarming("a"), "a");
    const Style colored{true, true};
    EXPECT_EQ(colored.strong("a"), "\x1B[1ma\x1B[0m");
    EXPECT_EQ(colored.alarming("a"), "\x1B[31ma\x1B[0m");
}

TEST(ProgressText, ShowsHowFarItIs) {
    EXPECT_EQ(progressText(0, 4, 0, 19), "[>         ] 0 of 4");
    EXPECT_EQ(progressText(2, 4, 0, 19), "[=====>    ] 2 of 4");
    EXPECT_EQ(progressText(4, 4, 0, 19), "[==========] 4 of 4");
    EXPECT_EQ(progressText(2, 4, 1, 27), "[====>   ] 2 of 4, 1 failed");
    EXPECT_EQ(progressText(1, 2, 0, 200).size(), 40U + 9U);
}

TEST(ProgressText, NeverIsWiderThanTheTerminal) {
    for (std::size_t width = 0; width < 60; ++width) {
        for (const std::size_t done : {0U, 7U, 12345U, 20000U}) {
            EXPECT_LE(progressText(done, 12345, done / 2, width).size(), width);
        }
    }
    EXPECT_EQ(progressText(0, 0, 0, 20), "[===========] 0 of 0");
}

TEST(ProgressBar, GoesAwayBeforeAnythingElseIsWritten) {
    std::ostringstream out;
    {
        ProgressBar bar(out, 20, 2);
        bar.hide();
        EXPECT_EQ(out.str(), "");
        bar.show(1, 0);
        EXPECT_EQ(out.str(), "\r\x1B[K[=====>    ] 1 of 2");
        bar.hide();
        out << "x\n";
        bar.show(2, 0);
    }
    EXPECT_EQ(out.str(),
              "\r\x1B[K[=====>    ] 1 of 2\r\x1B[Kx\n\r\x1B[K[==========] 2 of 2\r\x1B[K");
}

TEST(ProgressBar, IsForTerminals) {
    std::ostringstream out;
    ProgressBar(out, std::nullopt, 2).show(1, 1);
    EXPECT_EQ(out.str(), "");
}

/// What is written to a terminal, for those who wait for it.
class WatchedTerminal : public std::streambuf {
  public:
    /// All that has been written, as soon as that is so long.
    std::string waitFor(std::size_t length) {
        std::unique_lock lock(mutex_);
        changed_.wait(lock, [&] { return text_.size() >= length; });
        return text_;
    }

  protected:
    std::streamsize xsputn(const char* text, std::streamsize length) override {
        const std::lock_guard lock(mutex_);
        text_.append(text, static_cast<std::size_t>(length));
        changed_.notify_all();
        return length;
    }
    int_type overflow(int_type letter) override {
        const char text = traits_type::to_char_type(letter);
        return xsputn(&text, 1) == 1 ? letter : traits_type::eof();
    }

  private:
    std::mutex mutex_;
    std::condition_variable changed_;
    std::string text_;
};

TEST(WaitingLine, SaysHowLongItTakesAndGoesAway) {
    WatchedTerminal terminal;
    std::ostream out(&terminal);
    const std::string line = "\r\x1B[Kreading, 1 s";
    {
        const WaitingLine waiting(out, 40, "reading");
        EXPECT_EQ(terminal.waitFor(line.size()), line);
    }
    EXPECT_TRUE(terminal.waitFor(0).ends_with("\r\x1B[K"));
}

TEST(WaitingLine, SaysWhichStepIsBeingDone) {
    WatchedTerminal terminal;
    std::ostream out(&terminal);
    const std::string first = "\r\x1B[Kasking for a, 2 of 3, 1 s";
    const std::string next = "\r\x1B[Kasking for b, 3 of 3, ";
    {
        WaitingLine waiting(out, 40, "reading");
        const TellStep tell = waiting.steps();
        tell("asking for a", 2, 3);
        EXPECT_EQ(terminal.waitFor(first.size()), first);
        // From now on without a wait.
        tell("asking for b", 3, 3);
        EXPECT_THAT(terminal.waitFor(0), testing::HasSubstr(next));
        tell("drawing", 0, 0);
        EXPECT_THAT(terminal.waitFor(0), testing::HasSubstr("\r\x1B[Kdrawing, "));
    }
}

TEST(WaitingLine, IsForWhatTakesLongOnATerminal) {
    std::ostringstream out;
    { const WaitingLine waiting(out, 40, "reading"); }
    {
        WaitingLine waiting(out, std::nullopt, "reading");
        waiting.steps()("asking", 1, 2);
    }
    EXPECT_EQ(out.str(), "");
}

}  // namespace
}  // namespace cimdhcp
