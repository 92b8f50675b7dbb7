#include "transport/Deadline.h"

#include <gtest/gtest.h>

namespace cimom::wbem {
namespace {

TEST(Deadline, LeavesNoMoreThanThePatienceAndNeverLessThanNothing) {
    using std::chrono::milliseconds;
    const Deadline far(std::chrono::hours(1));
    EXPECT_EQ(far.patience(), std::chrono::hours(1));
    EXPECT_LE(far.left(), std::chrono::hours(1));
    EXPECT_GT(far.left(), std::chrono::minutes(1));
    EXPECT_EQ(Deadline(milliseconds(0)).left(), milliseconds(0));
    EXPECT_EQ(Deadline(milliseconds(-5000)).left(), milliseconds(0));
}

}  // namespace
}  // namespace cimom::wbem
