#include "text/ProgressBar.h"

#include <gtest/gtest.h>

#include <sstream>

namespace cimdhcp {
namespace {

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

}  // namespace
}  // namespace cimdhcp
