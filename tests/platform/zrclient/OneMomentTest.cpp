#include "zrclient/OneMoment.h"

#include <gmock/gmock.h>

#include <thread>

#include "kit/ZrclientSupport.h"
#include "zrclient/Instrumentation.h"
#include "zrclient/InstrumentationService.h"

namespace ZR::Testing {
namespace {

using NodeLexicon::NodeType;
using NodeLexicon::Properties;

class OneMomentTest : public SnapshotTreeTest {
  protected:
    void showComputer(const std::string& name) {
        show(R"({"nodes": [{"type": "ComputerSystem", "properties": {"Name": ")" + name +
             R"("}}]})");
    }
    static std::string computer() {
        Instrumentation cursor;
        cursor.selectNode(NodeType::ComputerSystem);
        std::string name;
        cursor.getProperty(Properties::Name, name);
        return name;
    }
};

TEST_F(OneMomentTest, CursorsOfAThreadSeeTheMachineAtOneTime) {
    showComputer("early");
    {
        const OneMoment moment;
        EXPECT_EQ(computer(), "early");
        showComputer("late");
        EXPECT_EQ(computer(), "early");
        std::thread([] { EXPECT_EQ(computer(), "late"); }).join();
        EXPECT_EQ(computer(), "early");
    }
    EXPECT_EQ(computer(), "late");
}

TEST_F(OneMomentTest, ItBeginsWithTheFirstSelection) {
    showComputer("early");
    EXPECT_EQ(computer(), "early");
    const OneMoment moment;
    showComputer("late");
    EXPECT_EQ(computer(), "late");
}

TEST_F(OneMomentTest, InsideAnotherItIsThatOne) {
    showComputer("early");
    const OneMoment moment;
    EXPECT_EQ(computer(), "early");
    {
        const OneMoment inner;
        showComputer("late");
        EXPECT_EQ(computer(), "early");
    }
    EXPECT_EQ(computer(), "early");
}

TEST_F(OneMomentTest, PathsAreLookedUpInIt) {
    showComputer("early");
    const OneMoment moment;
    EXPECT_EQ(computer(), "early");
    show(R"({"nodes": []})");
    std::thread([] { EXPECT_EQ(computer(), ""); }).join();
    EXPECT_EQ(OneMoment::latest(), OneMoment::current());
    EXPECT_NE(OneMoment::latest(), InstrumentationService::process().latest());
}

}  // namespace
}  // namespace ZR::Testing
