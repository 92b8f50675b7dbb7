#include "commands/Findings.h"

#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

namespace cimdhcp {
namespace {

const Finding fine{Finding::Verdict::good, "schema", "9 classes", ""};
const Finding odd{Finding::Verdict::notable, "machine", "no interface", "plug one in"};
const Finding wrong{Finding::Verdict::bad, "library", "is not there", "install it"};

TEST(Findings, AreCountedInTheRightNumber) {
    EXPECT_EQ(counted(0, "class", "classes"), "0 classes");
    EXPECT_EQ(counted(1, "class", "classes"), "1 class");
    EXPECT_EQ(counted(2, "class", "classes"), "2 classes");
}

TEST(Findings, AreAListWithASum) {
    EXPECT_EQ(findingsText({}), "Nothing is wrong.\n");
    EXPECT_EQ(findingsText({fine}), "ok    schema: 9 classes\nNothing is wrong.\n");
    EXPECT_EQ(findingsText({fine, odd}),
              "ok    schema: 9 classes\n"
              "note  machine: no interface\n"
              "      -> plug one in\n"
              "Nothing is wrong; 1 is worth a look.\n");
    EXPECT_EQ(findingsText({wrong, odd, wrong, odd}),
              "BAD   library: is not there\n"
              "      -> install it\n"
              "note  machine: no interface\n"
              "      -> plug one in\n"
              "BAD   library: is not there\n"
              "      -> install it\n"
              "note  machine: no interface\n"
              "      -> plug one in\n"
              "2 things are wrong; 2 are worth a look.\n");
    EXPECT_NE(findingsText({wrong}).find("\n1 thing is wrong.\n"), std::string::npos);
}

TEST(Findings, AreJsonToo) {
    EXPECT_EQ(nlohmann::json::parse(findingsJson({fine, odd, wrong})),
              nlohmann::json::parse(R"({"findings": [
        {"verdict": "good", "what": "schema", "detail": "9 classes", "remedy": ""},
        {"verdict": "notable", "what": "machine", "detail": "no interface",
         "remedy": "plug one in"},
        {"verdict": "bad", "what": "library", "detail": "is not there",
         "remedy": "install it"}]})"));
}

TEST(Findings, OnlyBadOnesAreFailures) {
    EXPECT_TRUE(isGood({}));
    EXPECT_TRUE(isGood({fine, odd}));
    EXPECT_FALSE(isGood({fine, wrong}));
}

}  // namespace
}  // namespace cimdhcp
