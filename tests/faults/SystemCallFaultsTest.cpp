// Each system call of the provider fails in each documented way, in each request of the
// script.

#include <gtest/gtest.h>

#include <cstdio>

#include "FaultSweep.h"
#include "NamespaceMachine.h"
#include "kit/Namespaces.h"
#include "kit/TreeMachine.h"

namespace test {
namespace {

/// Whether the provider looks at the machine for that request.
bool looks(const ScriptRequest& request) {
    return !request.direct;
}

class SystemCallFaults : public ::testing::TestWithParam<ScriptRequest> {};

TEST_P(SystemCallFaults, LeaveEveryAnswerTrueForATreeInAFile) {
    TreeMachine machine;
    FaultSweep sweep(machine, FaultSweep::Reads::yes);
    const unsigned failed = sweep.failSystemCalls(GetParam());
    EXPECT_EQ(failed > 100, looks(GetParam())) << failed;
    RecordProperty("positions", static_cast<int>(failed));
}

TEST_P(SystemCallFaults, LeaveEveryAnswerTrueForTheLiveMachine) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(ZR::Live::passesInNamespaces(110, [] {
        LiveMachine machine;
        FaultSweep sweep(machine, FaultSweep::Reads::no);
        const unsigned failed = sweep.failSystemCalls(GetParam());
        EXPECT_EQ(failed > 0, looks(GetParam())) << failed;
        std::printf("positions: %u\n", failed);
    }));
}

INSTANTIATE_TEST_SUITE_P(Script, SystemCallFaults, ::testing::ValuesIn(script()),
                         [](const auto& each) { return each.param.name; });

TEST(SystemCallFaultsOfAReading, LeaveWhatIsKnownOfTheLiveMachineTrue) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(ZR::Live::passesInNamespaces(110, [] {
        LiveMachine machine;
        FaultSweep sweep(machine, FaultSweep::Reads::yes);
        const unsigned failed = sweep.failSystemCalls(
            {"Servers", Operation::enumerate, "QVXZR_DHCPRemoteServiceAccessPoint", ""});
        EXPECT_GT(failed, 500U);
        std::printf("positions: %u\n", failed);
    }));
}

}  // namespace
}  // namespace test
