#include "text/Terminal.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/ioctl.h>

#include <cstdlib>

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

}  // namespace
}  // namespace cimdhcp
