// The requests and responses of the kernel's device, over the network instead, with a
// simulator that knows how service processors respond.

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <chrono>
#include <thread>

#include "LinuxSupport.h"
#include "Simulator.h"
#include "ipmi/IpmiReader.h"
#include "kit/Diagnostics.h"

namespace ZR::Live {
namespace {

using testing::IsEmpty;

class IpmiSimulatorTest : public testing::Test {
  protected:
    void SetUp() override {
        if (::access(Simulator::program, X_OK) != 0) {
            GTEST_SKIP() << "needs " << Simulator::program;
        }
    }

    /// The LAN channel that one reader comes to know. On a machine under load a second
    /// may not be enough for the simulator: then another reader begins anew.
    static std::optional<LanChannel> lanOf(const Simulator& simulator) {
        std::vector<ZR::Diagnostic> diagnostics;
        for (int attempt = 0; attempt < 5; ++attempt) {
            IpmiReader reader{std::make_unique<RmcpSession>(simulator.port())};
            diagnostics.clear();
            for (int look = 0; look < 400 && diagnostics.empty(); ++look) {
                std::this_thread::sleep_for(std::chrono::milliseconds{5});
                const auto known = reader.read(diagnostics);
                if (known && known->lan) {
                    EXPECT_THAT(ZR::Testing::textsOf(diagnostics), IsEmpty());
                    return known->lan;
                }
            }
        }
        ADD_FAILURE() << testing::PrintToString(diagnostics) << simulator.output();
        return std::nullopt;
    }
};

TEST_F(IpmiSimulatorTest, LeasedAddress) {
    Simulator simulator;
    EXPECT_EQ(lanOf(simulator), (LanChannel{1, std::uint8_t{2}, "198.51.100.77"_ip}));
}

TEST_F(IpmiSimulatorTest, EverySourceAndNoAddress) {
    Simulator simulator;
    simulator.configure("static", "192.0.2.7");
    EXPECT_EQ(lanOf(simulator), (LanChannel{1, std::uint8_t{1}, "192.0.2.7"_ip}));
    simulator.configure("bios", "192.0.2.8");
    EXPECT_EQ(lanOf(simulator), (LanChannel{1, std::uint8_t{3}, "192.0.2.8"_ip}));
    simulator.configure("other", "192.0.2.9");
    EXPECT_EQ(lanOf(simulator), (LanChannel{1, std::uint8_t{4}, "192.0.2.9"_ip}));
    simulator.configure("dhcp", "0.0.0.0");
    EXPECT_EQ(lanOf(simulator), (LanChannel{1, std::uint8_t{2}, std::nullopt}));
}

TEST_F(IpmiSimulatorTest, LanElsewhereThanUsual) {
    Simulator simulator{8};
    EXPECT_EQ(lanOf(simulator), (LanChannel{8, std::uint8_t{2}, "198.51.100.77"_ip}));
}

TEST_F(IpmiSimulatorTest, AParameterThatItDoesNotHave) {
    Simulator simulator;
    RmcpSession session{simulator.port()};
    ASSERT_EQ(session.open(), 0) << simulator.output();
    ASSERT_EQ(session.send(7, {0x0c, 0x02, {1, 50, 0, 0}}), 0);
    IpmiReceived received = session.receive();
    for (int i = 0; received.error == EAGAIN && i < 1000; ++i) {
        std::this_thread::sleep_for(std::chrono::milliseconds{5});
        received = session.receive();
    }
    ASSERT_EQ(received.error, 0);
    EXPECT_EQ(received.id, 7);
    const auto decoded = decodeLanAddress(received.response);
    ASSERT_TRUE(std::holds_alternative<IpmiRefusal>(decoded));
    EXPECT_TRUE(std::get<IpmiRefusal>(decoded).unsupported());
}

}  // namespace
}  // namespace ZR::Live
