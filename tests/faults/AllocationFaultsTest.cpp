// Each allocation of the provider fails once, in each request of the script.

#include <gtest/gtest.h>

#include "FaultSweep.h"
#include "NamespaceMachine.h"
#include "kit/Namespaces.h"
#include "kit/TreeMachine.h"

namespace test {
namespace {

class AllocationFaults : public ::testing::TestWithParam<ScriptRequest> {};

TEST_P(AllocationFaults, LeaveEveryAnswerTrueForATreeInAFile) {
    TreeMachine machine;
    FaultSweep sweep(machine, FaultSweep::Reads::yes);
    const unsigned failed = sweep.failAllocations(GetParam());
    // What is refused, is refused without a thought.
    EXPECT_EQ(failed > 10, !GetParam().direct) << failed;
    RecordProperty("positions", static_cast<int>(failed));
}

TEST_P(AllocationFaults, LeaveEveryAnswerTrueForTheLiveMachine) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(ZR::Live::passesInNamespaces(110, [] {
        LiveMachine machine;
        FaultSweep sweep(machine, FaultSweep::Reads::no);
        const unsigned failed = sweep.failAllocations(GetParam());
        std::printf("positions: %u\n", failed);
    }));
}

INSTANTIATE_TEST_SUITE_P(Script, AllocationFaults, ::testing::ValuesIn(script()),
                         [](const auto& each) { return each.param.name; });

TEST(AllocationFaultsOfAReading, LeaveWhatIsKnownOfTheLiveMachineTrue) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(ZR::Live::passesInNamespaces(110, [] {
        LiveMachine machine;
        FaultSweep sweep(machine, FaultSweep::Reads::yes);
        const unsigned failed = sweep.failAllocations(
            {"Servers", Operation::enumerate, "QVXZR_DHCPRemoteServiceAccessPoint", ""});
        EXPECT_GT(failed, 50U);
        std::printf("positions: %u\n", failed);
    }));
}

}  // namespace
}  // namespace test
