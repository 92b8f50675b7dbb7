#include "ipmi/IpmiDevice.h"

#include <fcntl.h>
#include <linux/ipmi.h>
#include <linux/ipmi_msgdefs.h>
#include <sys/ioctl.h>

#include <cerrno>
#include <string>
#include <utility>
#include <vector>

#include "formats/Files.h"
#include "zrcommon/UniqueFd.h"

namespace ZR::Live {
namespace {

/// The ioctl's argument is what its number says it is.
template <typename Argument>
int control(int fd, unsigned long request, Argument& argument) {
    for (;;) {
        if (::ioctl(fd, request, &argument) >= 0) {
            return 0;
        }
        if (errno != EINTR) {
            return errno;
        }
    }
}

// ENXIO and ENODEV: a name of the device without a driver behind it.
bool tellsOfNoDevice(int error) {
    return isAbsent(error) || error == ENXIO || error == ENODEV;
}

class Device final : public IpmiTransport {
  public:
    explicit Device(std::vector<std::string> paths) : paths_(std::move(paths)) {}

    int open() override {
        close();
        for (const std::string& path : paths_) {
            fd_.reset(::open(path.c_str(), O_RDWR | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
            if (fd_) {
                return 0;
            }
            if (!tellsOfNoDevice(errno)) {
                return errno;
            }
        }
        return ENOENT;
    }

    void close() noexcept override { fd_.reset(); }

    /// The kernel queues the request and lets the processor have it by and by.
    int send(long id, const IpmiRequest& request) override {
        ipmi_system_interface_addr address{};
        address.addr_type = IPMI_SYSTEM_INTERFACE_ADDR_TYPE;
        address.channel = IPMI_BMC_CHANNEL;
        std::vector<std::uint8_t> data = request.data;  // the kernel wants to be able to write
        ipmi_req message{};
        message.addr = static_cast<unsigned char*>(static_cast<void*>(&address));
        message.addr_len = sizeof address;
        message.msgid = id;
        message.msg.netfn = request.netFn;
        message.msg.cmd = request.command;
        message.msg.data = data.data();
        message.msg.data_len = static_cast<unsigned short>(data.size());
        return control(fd_.get(), IPMICTL_SEND_COMMAND, message);
    }

    /// Unlike read() of other devices, this never waits, in no mode of the descriptor.
    IpmiReceived receive() override {
        ipmi_addr address{};
        std::vector<std::uint8_t> data(IPMI_MAX_MSG_LENGTH);
        ipmi_recv message{};
        message.addr = static_cast<unsigned char*>(static_cast<void*>(&address));
        message.addr_len = sizeof address;
        message.msg.data = data.data();
        message.msg.data_len = static_cast<unsigned short>(data.size());
        const int error = control(fd_.get(), IPMICTL_RECEIVE_MSG_TRUNC, message);
        // EMSGSIZE: the beginning of a longer message was delivered, which will do.
        if (error != 0 && error != EMSGSIZE) {
            return {.error = error, .response = {}};
        }
        if (message.recv_type != IPMI_RESPONSE_RECV_TYPE) {
            return {.response = {}};
        }
        if (message.msg.data_len < data.size()) {
            data.resize(message.msg.data_len);
        }
        return {.id = message.msgid,
                .response = {message.msg.netfn, message.msg.cmd, std::move(data)}};
    }

  private:
    std::vector<std::string> paths_;
    UniqueFd fd_;
};

}  // namespace

std::unique_ptr<IpmiTransport> ipmiDevice(const Roots& roots) {
    std::vector<std::string> paths;
    paths.reserve(ipmiDevices.size());
    for (const std::string_view device : ipmiDevices) {
        paths.push_back(roots.path(device));
    }
    return std::make_unique<Device>(std::move(paths));
}

}  // namespace ZR::Live
