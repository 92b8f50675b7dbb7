#include "formats/ShellAssignments.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

TEST(ShellAssignments, PlainAndQuotedValues) {
    EXPECT_THAT(parseShellAssignments("A=one\nB='two words'\nC=\"say \\\"hi\\\"\"\n D=\n"),
                ElementsAre(ShellAssignment{"A", "one"}, ShellAssignment{"B", "two words"},
                            ShellAssignment{"C", "say \"hi\""}, ShellAssignment{"D", ""}));
}

TEST(ShellAssignments, ExportedOnesCountToo) {
    EXPECT_THAT(parseShellAssignments("export A=1\nexport\tB=2\nexporting=3\n"),
                ElementsAre(ShellAssignment{"A", "1"}, ShellAssignment{"B", "2"},
                            ShellAssignment{"exporting", "3"}));
}

TEST(ShellAssignments, CommentsAndCommandsAreSkipped) {
    EXPECT_THAT(parseShellAssignments("# A=1\n. /etc/other\nif [ x = y ]; then\n=1\na-b=2\n"),
                IsEmpty());
    EXPECT_THAT(parseShellAssignments("A=1 # the one\nB=2; rm -rf x\n"),
                ElementsAre(ShellAssignment{"A", "1"}, ShellAssignment{"B", "2"}));
}

TEST(ShellAssignments, NothingIsExpanded) {
    EXPECT_THAT(parseShellAssignments("A=$(id)\nB=\"$A\"\n"),
                ElementsAre(ShellAssignment{"A", "$(id)"}, ShellAssignment{"B", "$A"}));
}

TEST(ShellAssignments, AnOpenQuoteEndsWithItsLine) {
    EXPECT_THAT(parseShellAssignments("A='half\nB=2\n\\\nC=3\\"),
                ElementsAre(ShellAssignment{"A", "half"}, ShellAssignment{"B", "2"},
                            ShellAssignment{"C", "3\\"}));
}

TEST(ShellAssignments, OfANameTheLastValueCounts) {
    const auto assignments = parseShellAssignments("A=1\nA=2\n");
    EXPECT_EQ(lastValue(assignments, "A"), "2");
    EXPECT_EQ(lastValue(assignments, "B"), "");
}

}  // namespace
}  // namespace ZR::Live
