#include "transport/ListeningSocket.h"

#include <arpa/inet.h>
#include <netdb.h>
#include <netinet/in.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <memory>
#include <utility>

namespace cimom::wbem {

ListeningSocket::ListeningSocket(const std::string& address, std::uint16_t port) {
    addrinfo hints{};
    hints.ai_flags = AI_NUMERICHOST | AI_NUMERICSERV | AI_PASSIVE;
    hints.ai_socktype = SOCK_STREAM;
    addrinfo* found = nullptr;
    if (::getaddrinfo(address.c_str(), std::to_string(port).c_str(), &hints, &found) != 0) {
        throw SocketError("\"" + address + "\" is not an IPv4 or IPv6 address");
    }
    const std::unique_ptr<addrinfo, void (*)(addrinfo*)> owned(found, ::freeaddrinfo);
    fd_ = ::socket(found->ai_family, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
    const int yes = 1;
    // Without SO_REUSEADDR a restarted server would wait for old connections to be
    // forgotten.
    if (fd_ < 0 || ::setsockopt(fd_, SOL_SOCKET, SO_REUSEADDR, &yes, sizeof yes) != 0 ||
        (found->ai_family == AF_INET6 &&
         ::setsockopt(fd_, IPPROTO_IPV6, IPV6_V6ONLY, &yes, sizeof yes) != 0) ||
        ::bind(fd_, found->ai_addr, found->ai_addrlen) != 0 || ::listen(fd_, SOMAXCONN) != 0) {
        const int reason = errno;
        close();
        throw SocketError(address + " port " + std::to_string(port) + ": " + std::strerror(reason));
    }
}

int ListeningSocket::release() noexcept {
    return std::exchange(fd_, -1);
}

std::uint16_t ListeningSocket::port() const {
    sockaddr_storage storage{};
    socklen_t length = sizeof storage;
    if (::getsockname(fd_, reinterpret_cast<sockaddr*>(&storage), &length) != 0) {
        throw SocketError(std::strerror(errno));
    }
    return ntohs(storage.ss_family == AF_INET
                     ? reinterpret_cast<const sockaddr_in*>(&storage)->sin_port
                     : reinterpret_cast<const sockaddr_in6*>(&storage)->sin6_port);
}

void ListeningSocket::close() noexcept {
    if (fd_ >= 0) {
        ::close(fd_);
        fd_ = -1;
    }
}

std::string addressText(const sockaddr* address) {
    std::array<char, INET6_ADDRSTRLEN> text{};
    // Whoever hands out an address has aligned it for its family.
    const void* const bytes = address;
    const void* number = nullptr;
    if (address != nullptr && address->sa_family == AF_INET) {
        number = &static_cast<const sockaddr_in*>(bytes)->sin_addr;
    } else if (address != nullptr && address->sa_family == AF_INET6) {
        number = &static_cast<const sockaddr_in6*>(bytes)->sin6_addr;
    }
    const bool known = number != nullptr &&
                       ::inet_ntop(address->sa_family, number, text.data(), text.size()) != nullptr;
    return known ? text.data() : "unknown";
}

}  // namespace cimom::wbem
