#include "Precedence.h"

#include <gtest/gtest.h>

#include <map>
#include <set>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

using NodeLexicon::Properties;

TEST(Precedence, RowsOfAPropertyStandTogether) {
    std::set<Properties> finished;
    Properties last{};
    for (const DecisionRow& row : precedence()) {
        if (row.property != last) {
            EXPECT_TRUE(finished.insert(row.property).second) << row.reason;
            last = row.property;
        }
        EXPECT_FALSE(row.reason.empty());
    }
    EXPECT_EQ(finished.size(), NodeLexicon::properties.size());
}

TEST(Precedence, TheLastRowOfEachPropertyAnswersForAnyInterface) {
    const Link link{.ifindex = 1, .name = "e"_name, .kind = "", .slaveKind = "", .carrier = {}};
    std::map<Properties, bool> answered;
    for (const DecisionRow& row : precedence()) {
        InterfaceView view;
        view.link = &link;
        answered[row.property] = row.answer(view).has_value();
    }
    // An interface need not have an address; all else is always told.
    EXPECT_FALSE(answered.at(Properties::IPv4Address));
    answered.erase(Properties::IPv4Address);
    for (const auto& [property, answers] : answered) {
        EXPECT_TRUE(answers) << static_cast<int>(property);
    }
}

}  // namespace
}  // namespace ZR::Live
