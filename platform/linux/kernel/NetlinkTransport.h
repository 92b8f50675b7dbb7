#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>

namespace ZR::Live {

using Deadline = std::chrono::steady_clock::time_point;

/// One datagram as it was received.
struct Datagram {
    int error = 0;             ///< errno; ETIMEDOUT when the deadline passed
    std::size_t size = 0;      ///< bytes in the buffer
    bool truncated = false;    ///< the datagram was longer than the buffer
    std::uint32_t sender = 0;  ///< netlink port of the sender; 0 is the kernel
};

/// A request socket to the kernel's routing family. An interface, so that tests can give
/// every response that a kernel may give, also rare and broken ones.
class NetlinkTransport {
  public:
    NetlinkTransport() = default;
    NetlinkTransport(const NetlinkTransport&) = delete;
    NetlinkTransport& operator=(const NetlinkTransport&) = delete;
    virtual ~NetlinkTransport() = default;

    /// Opens the socket, in place of the one that is open. Returns an errno, 0 for none.
    [[nodiscard]] virtual int open() = 0;

    /// Sends one message. Returns an errno, 0 for none.
    [[nodiscard]] virtual int send(std::span<const std::byte> message) = 0;

    /// Receives one datagram; waits for it until the deadline at most.
    [[nodiscard]] virtual Datagram receive(std::span<std::byte> buffer, Deadline deadline) = 0;
};

/// The transport to the kernel of this machine, in the network namespace of the
/// thread that opens it.
[[nodiscard]] std::unique_ptr<NetlinkTransport> kernelTransport();

}  // namespace ZR::Live
