// How often the kernel is asked when a person asks once.
#include <gtest/gtest.h>

#include "client/EmbeddedClient.h"
#include "client/MachineInterfaces.h"
#include "commands/Overview.h"
#include "kit/SystemCalls.h"
#include "zrclient/Snapshot.h"
#include "zrlinux/LiveSource.h"

namespace cimdhcp {
namespace {

using ZR::Testing::Call;
using ZR::Testing::SystemCalls;

TEST(OneReading, OfTheKernelIsEnoughForAWholeMachine) {
    unsigned ofOneReading = 0;
    {
        const SystemCalls calls;
        static_cast<void>(ZR::openLiveSource()->read());
        ofOneReading = calls.count(Call::sendto);
    }
    ASSERT_GT(ofOneReading, 0U);
    EmbeddedClient client(
        {ZR_SOURCE_DIR "/schema", ZR_SOURCE_DIR "/schema", {ZR_BINARY_DIR "/lib/cmpi"}},
        "root/cimv2");
    const SystemCalls calls;
    const MachineInterfaces machine = askMachine(client, AskDiagnostics::Yes);
    EXPECT_FALSE(machine.interfaces.empty());
    EXPECT_TRUE(machine.interfaces.front().leases) << "not of the classes of the extensions";
    EXPECT_EQ(calls.count(Call::sendto), ofOneReading);
    // The machine may change meanwhile, but seldom.
    static_cast<void>(askMachine(client, AskDiagnostics::Yes));
    EXPECT_EQ(calls.count(Call::sendto), ofOneReading);
}

}  // namespace
}  // namespace cimdhcp
