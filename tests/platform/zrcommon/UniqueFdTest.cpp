#include "zrcommon/UniqueFd.h"

#include <fcntl.h>
#include <gtest/gtest.h>

#include <string>
#include <utility>

#include "kit/ChildProcess.h"

namespace ZR {

namespace {

int openOne() {
    return ::open("/dev/null", O_RDONLY | O_CLOEXEC);
}
bool isOpen(int fd) {
    return ::fcntl(fd, F_GETFD) >= 0;
}

TEST(UniqueFd, ClosesAtItsEnd) {
    int number = -1;
    {
        const UniqueFd fd{openOne()};
        number = fd.get();
        EXPECT_TRUE(fd);
        EXPECT_TRUE(isOpen(number));
    }
    EXPECT_FALSE(isOpen(number));
}

TEST(UniqueFd, HoldsNothingAtFirst) {
    const UniqueFd fd;
    EXPECT_FALSE(fd);
    EXPECT_EQ(fd.get(), -1);
}

TEST(UniqueFd, DescriptorZeroIsOneLikeAnyOther) {
    const auto result = Testing::inChild([] {
        ::close(STDIN_FILENO);
        UniqueFd fd{openOne()};
        const bool held = fd.get() == 0 && static_cast<bool>(fd);
        fd.reset();
        return std::string(held && !isOpen(0) ? "yes" : "no");
    });
    EXPECT_EQ(result.output, "yes");
}

TEST(UniqueFd, MovingHandsTheDescriptorOver) {
    UniqueFd one{openOne()};
    const int number = one.get();
    UniqueFd other{std::move(one)};
    EXPECT_EQ(one.get(), -1);  // NOLINT(bugprone-use-after-move): what it is left with
    EXPECT_EQ(other.get(), number);
    EXPECT_TRUE(isOpen(number));
}

TEST(UniqueFd, AssignmentClosesWhatWasHeld) {
    UniqueFd one{openOne()};
    UniqueFd other{openOne()};
    const int kept = one.get();
    const int closed = other.get();
    other = std::move(one);
    EXPECT_EQ(other.get(), kept);
    EXPECT_TRUE(isOpen(kept));
    EXPECT_FALSE(isOpen(closed));
}

TEST(UniqueFd, AssignmentToItselfKeepsTheDescriptor) {
    UniqueFd fd{openOne()};
    const int number = fd.get();
    UniqueFd& same = fd;
    fd = std::move(same);
    EXPECT_EQ(fd.get(), number);
    EXPECT_TRUE(isOpen(number));
}

TEST(UniqueFd, ResetClosesAndTakesAnother) {
    UniqueFd fd{openOne()};
    const int first = fd.get();
    const int second = openOne();
    fd.reset(second);
    EXPECT_FALSE(isOpen(first));
    EXPECT_EQ(fd.get(), second);
    fd.reset();
    EXPECT_FALSE(fd);
    EXPECT_FALSE(isOpen(second));
}

}  // namespace

}  // namespace ZR
