#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <vector>

#include "ipmi/IpmiTransport.h"
#include "zrcommon/UniqueFd.h"

namespace ZR::Live {

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
