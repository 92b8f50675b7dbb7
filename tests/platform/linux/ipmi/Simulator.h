#pragma once

#include <sys/types.h>

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "LinuxSupport.h"
#include "ipmi/IpmiTransport.h"
#include "zrcommon/UniqueFd.h"

namespace ZR::Live {

/// Debian's simulator of service processors, running for one test on a port of the
/// loopback interface, with LAN on the given channel.
class Simulator {
  public:
    static constexpr const char* program = "/usr/bin/ipmi_sim";

    explicit Simulator(unsigned channel = 1);
    ~Simulator();
    Simulator(const Simulator&) = delete;
    Simulator& operator=(const Simulator&) = delete;

    [[nodiscard]] std::uint16_t port() const { return port_; }

    /// `source`: static, dhcp, bios or other.
    void configure(const std::string& source, const std::string& address) const;

    /// What it wrote: for the message of a failing test.
    [[nodiscard]] std::string output() const;

  private:
    void start();

    TemporaryDirectory directory_;
    std::uint16_t port_ = 0;
    pid_t process_ = -1;
};

/// The same requests and responses over the network: IPMI 1.5 over RMCP and UDP
/// (IPMI 2.0, chapter 13), as an administrator without authentication, to a
/// processor on this machine's loopback. open() waits for it some seconds at most.
class RmcpSession final : public IpmiTransport {
  public:
    explicit RmcpSession(std::uint16_t port) : port_(port) {}

    int open() override;
    void close() noexcept override;
    int send(long id, const IpmiRequest& request) override;
    IpmiReceived receive() override;

  private:
    /// Sends a request of the session's own again and again until there is a response.
    std::optional<IpmiResponse> exchange(const IpmiRequest& request);
    bool logIn();

    std::uint16_t port_;
    UniqueFd socket_;
    std::uint32_t sessionId_ = 0;
    std::uint32_t sessionSequence_ = 0;  // 0 outside of a session
    std::uint8_t requestSequence_ = 0;   // six bits
    std::map<std::uint8_t, long> ids_;
};

}  // namespace ZR::Live
