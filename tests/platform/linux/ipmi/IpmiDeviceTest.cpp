// The kernel makes its IPMI device where it has found a service processor, which no
// test machine has. The kernel's side of the ioctls is therefore played here, after
// linux/ipmi.h; the device is a file that stands in its place.

#include "ipmi/IpmiDevice.h"

#include <gtest/gtest.h>
#include <linux/ipmi.h>
#include <sys/ioctl.h>

#include <cstdarg>
#include <cstring>
#include <deque>
#include <filesystem>
#include <optional>

#include "LinuxSupport.h"

namespace {

/// What the kernel would give next, and what it was told.
struct PlayedKernel {
    struct Pending {
        int type = IPMI_RESPONSE_RECV_TYPE;
        long id = 0;
        unsigned char netFn = 0;
        unsigned char command = 0;
        std::vector<unsigned char> data;
    };
    struct Sent {
        ipmi_system_interface_addr address{};
        unsigned int addressLength = 0;
        long id = 0;
        ZR::Live::IpmiRequest request;
    };
    std::deque<Pending> pending;
    std::vector<Sent> sent;
    int interruptions = 0;
};

PlayedKernel* played = nullptr;

int fail(int error) {
    errno = error;
    return -1;
}

int playSend(const ipmi_req& request) {
    PlayedKernel::Sent sent;
    sent.addressLength = request.addr_len;
    std::memcpy(&sent.address, request.addr, sizeof sent.address);
    sent.id = request.msgid;
    sent.request = {request.msg.netfn,
                    request.msg.cmd,
                    {request.msg.data, request.msg.data + request.msg.data_len}};
    played->sent.push_back(std::move(sent));
    return 0;
}

int playReceive(ipmi_recv& message) {
    if (played->pending.empty()) {
        return fail(EAGAIN);
    }
    const PlayedKernel::Pending next = played->pending.front();
    played->pending.pop_front();
    message.recv_type = next.type;
    message.msgid = next.id;
    message.msg.netfn = next.netFn;
    message.msg.cmd = next.command;
    const bool truncated = next.data.size() > message.msg.data_len;
    if (!truncated) {
        message.msg.data_len = static_cast<unsigned short>(next.data.size());
    }
    std::memcpy(message.msg.data, next.data.data(), message.msg.data_len);
    return truncated ? fail(EMSGSIZE) : 0;
}

}  // namespace

extern "C" {
int __real_ioctl(int fd, unsigned long request, ...);
int __wrap_ioctl(int fd, unsigned long request, ...);

int __wrap_ioctl(int fd, unsigned long request, ...) {
    va_list arguments;
    va_start(arguments, request);
    void* const argument = va_arg(arguments, void*);
    va_end(arguments);
    if (played == nullptr) {
        return __real_ioctl(fd, request, argument);
    }
    if (played->interruptions > 0) {
        --played->interruptions;
        return fail(EINTR);
    }
    switch (request) {
        case IPMICTL_SEND_COMMAND:
            return playSend(*static_cast<const ipmi_req*>(argument));
        case IPMICTL_RECEIVE_MSG_TRUNC:
            return playReceive(*static_cast<ipmi_recv*>(argument));
        default:
            return fail(ENOTTY);
    }
}
}

namespace ZR::Live {
namespace {

class IpmiDeviceTest : public testing::Test {
  protected:
    IpmiDeviceTest() { played = &kernel_; }
    ~IpmiDeviceTest() override { played = nullptr; }

    PlayedKernel kernel_;
    TemporaryDirectory root_;
    std::unique_ptr<IpmiTransport> device_ = ipmiDevice({.files = root_.path()});
};

TEST_F(IpmiDeviceTest, AMachineWithoutTheDeviceHasNone) {
    EXPECT_EQ(device_->open(), ENOENT);
}

TEST_F(IpmiDeviceTest, EveryNameOfTheDeviceWillDo) {
    for (const std::string_view name : ipmiDevices) {
        root_.write(name, "");
        EXPECT_EQ(device_->open(), 0) << name;
        std::filesystem::remove(root_.path(name));
        EXPECT_EQ(device_->open(), ENOENT) << name;
    }
}

TEST_F(IpmiDeviceTest, ANameThatCannotBeOpenedIsNotPassedOver) {
    std::filesystem::create_directories(root_.path("/dev/ipmi0"));
    EXPECT_EQ(device_->open(), EISDIR);
}

TEST_F(IpmiDeviceTest, RequestsGoToTheProcessorItself) {
    root_.write("/dev/ipmi0", "");
    ASSERT_EQ(device_->open(), 0);
    kernel_.interruptions = 2;
    ASSERT_EQ(device_->send(77, {0x0c, 0x02, {1, 3, 0, 0}}), 0);
    ASSERT_EQ(kernel_.sent.size(), 1U);
    const PlayedKernel::Sent& sent = kernel_.sent.front();
    EXPECT_EQ(sent.address.addr_type, IPMI_SYSTEM_INTERFACE_ADDR_TYPE);
    EXPECT_EQ(sent.address.channel, IPMI_BMC_CHANNEL);
    EXPECT_EQ(sent.address.lun, 0);
    EXPECT_EQ(sent.addressLength, sizeof(ipmi_system_interface_addr));
    EXPECT_EQ(sent.id, 77);
    EXPECT_EQ(sent.request, (IpmiRequest{0x0c, 0x02, {1, 3, 0, 0}}));
}

TEST_F(IpmiDeviceTest, ResponsesComeWithTheNumberOfTheirRequest) {
    root_.write("/dev/ipmi0", "");
    ASSERT_EQ(device_->open(), 0);
    kernel_.pending.push_back({.id = 77, .netFn = 0x0d, .command = 0x02, .data = {0, 0x11, 2}});
    kernel_.interruptions = 1;
    const IpmiReceived received = device_->receive();
    EXPECT_EQ(received.error, 0);
    EXPECT_EQ(received.id, 77);
    EXPECT_EQ(received.response, (IpmiResponse{0x0d, 0x02, {0, 0x11, 2}}));
    EXPECT_EQ(device_->receive().error, EAGAIN);
}

TEST_F(IpmiDeviceTest, EventsAndCommandsOfOthersAreNotResponses) {
    root_.write("/dev/ipmi0", "");
    ASSERT_EQ(device_->open(), 0);
    for (const int type : {IPMI_ASYNC_EVENT_RECV_TYPE, IPMI_CMD_RECV_TYPE,
                           IPMI_RESPONSE_RESPONSE_TYPE, IPMI_OEM_RECV_TYPE}) {
        kernel_.pending.push_back({.type = type, .id = 77, .data = {0}});
        const IpmiReceived received = device_->receive();
        EXPECT_EQ(received.error, 0);
        EXPECT_EQ(received.id, 0);
    }
}

TEST_F(IpmiDeviceTest, OfTooLongAResponseTheBeginningCounts) {
    root_.write("/dev/ipmi0", "");
    ASSERT_EQ(device_->open(), 0);
    kernel_.pending.push_back(
        {.id = 5, .netFn = 7, .command = 0x42, .data = std::vector<unsigned char>(5000, 1)});
    const IpmiReceived received = device_->receive();
    EXPECT_EQ(received.error, 0);
    EXPECT_EQ(received.id, 5);
    EXPECT_LT(received.response.data.size(), 5000U);
    EXPECT_EQ(received.response.data.at(0), 1);
}

TEST_F(IpmiDeviceTest, WhatIsNotSuchADeviceRefusesRequests) {
    root_.write("/dev/ipmi0", "");
    played = nullptr;  // the real kernel, and a file in place of the device
    ASSERT_EQ(device_->open(), 0);
    EXPECT_EQ(device_->send(1, getChannelInfo(1)), ENOTTY);
    EXPECT_EQ(device_->receive().error, ENOTTY);
    device_->close();
    EXPECT_EQ(device_->send(1, getChannelInfo(1)), EBADF);
    EXPECT_EQ(device_->receive().error, EBADF);
}

}  // namespace
}  // namespace ZR::Live
