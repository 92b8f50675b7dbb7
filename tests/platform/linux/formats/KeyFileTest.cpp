#include "formats/KeyFile.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

std::vector<std::string> keys(std::string_view text) {
    std::vector<std::string> found;
    forEachKey(text, [&](std::string_view section, std::string_view key, std::string_view value) {
        found.push_back(std::string{section} + '|' + std::string{key} + '|' + std::string{value});
    });
    return found;
}

TEST(KeyFile, KeysBelongToTheSectionAboveThem) {
    EXPECT_THAT(keys("a=1\n[one]\n b = 2 \n[two]\r\nc=\nd=x=y"),
                ElementsAre("|a|1", "one|b|2", "two|c|", "two|d|x=y"));
}

TEST(KeyFile, CommentsAndWhatIsNotAPairAreSkipped) {
    EXPECT_THAT(keys("# a=1\n; b=2\n\nnothing\n[half\n"), IsEmpty());
}

TEST(KeyFile, ATornEndIsTheValueSoFar) {
    EXPECT_THAT(keys("[s]\nkey=val"), ElementsAre("s|key|val"));
    EXPECT_THAT(keys("[s"), IsEmpty());
}

}  // namespace
}  // namespace ZR::Live
