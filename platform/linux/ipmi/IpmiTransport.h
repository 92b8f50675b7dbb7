#pragma once

#include "ipmi/IpmiMessages.h"

namespace ZR::Live {

/// One message as it was received.
struct IpmiReceived {
    int error = 0;  ///< errno; EAGAIN when nothing has come yet
    long id = 0;    ///< of the request that it responds to; 0 for any other message
    IpmiResponse response;
};

/// A way to a service processor. Nothing here ever waits for it, and requests may
/// be sent before the responses to earlier ones have come. An interface, so that tests can
/// give every response that a processor may give, late, wrong, or none.
class IpmiTransport {
  public:
    IpmiTransport() = default;
    IpmiTransport(const IpmiTransport&) = delete;
    IpmiTransport& operator=(const IpmiTransport&) = delete;
    virtual ~IpmiTransport() = default;

    /// Opens the way, in place of the one that is open. Returns an errno, 0 for none;
    /// ENOENT when the machine has no service processor.
    [[nodiscard]] virtual int open() = 0;

    /// Closes the way. Responses that have not been received are lost.
    virtual void close() noexcept = 0;

    /// Sends one request under a number of the caller's, not 0. Returns an errno, 0
    /// for none.
    [[nodiscard]] virtual int send(long id, const IpmiRequest& request) = 0;

    /// Takes one message of those that have come.
    [[nodiscard]] virtual IpmiReceived receive() = 0;
};

}  // namespace ZR::Live
