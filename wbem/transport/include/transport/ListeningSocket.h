#pragma once

#include <sys/socket.h>

#include <cstdint>
#include <stdexcept>
#include <string>

namespace cimom::wbem {

/// An address or a port on which it is not possible to listen; what() says why.
class SocketError : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

/// A listening TCP socket, closed at the end unless it was released.
class ListeningSocket {
  public:
    /// Port 0: one that is free. An IPv6 address takes no IPv4 clients. Throws
    /// SocketError with address, port and reason.
    ListeningSocket(const std::string& address, std::uint16_t port);
    ~ListeningSocket() { close(); }
    ListeningSocket(ListeningSocket&& other) noexcept : fd_(other.release()) {}
    ListeningSocket(const ListeningSocket&) = delete;
    ListeningSocket& operator=(const ListeningSocket&) = delete;

    [[nodiscard]] int get() const noexcept { return fd_; }
    /// Leaves the closing to the caller.
    [[nodiscard]] int release() noexcept;

    [[nodiscard]] std::uint16_t port() const;

  private:
    void close() noexcept;

    int fd_ = -1;
};

/// The address of a client in numbers, "unknown" for another family than IP.
[[nodiscard]] std::string addressText(const sockaddr* address);

}  // namespace cimom::wbem
