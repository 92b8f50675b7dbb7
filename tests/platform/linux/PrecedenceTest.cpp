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
    EXPECT_EQ(finished, (std::set<Properties>{Properties::Name, Properties::NameMaxLength,
                                              Properties::InterfaceState, Properties::IPv4Address,
                                              Properties::DHCPEnabled, Properties::AddressSource,
                                              Properties::DHCPServerAddresses}));
}

TEST(Precedence, TheLastRowOfEachPropertyFindsAValueForAnyInterface) {
    const Link link{.ifindex = 1, .name = "e"_name, .kind = "", .slaveKind = "", .carrier = {}};
    std::map<Properties, bool> found;
    for (const DecisionRow& row : precedence()) {
        InterfaceView view;
        view.link = &link;
        found[row.property] = row.find(view).has_value();
    }
    // An interface need not have an address; all else is always told.
    EXPECT_FALSE(found.at(Properties::IPv4Address));
    found.erase(Properties::IPv4Address);
    for (const auto& [property, has] : found) {
        EXPECT_TRUE(has) << static_cast<int>(property);
    }
}

}  // namespace
}  // namespace ZR::Live
