#include "RmcpSession.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <numeric>
#include <span>

namespace ZR::Live {
namespace {

using Bytes = std::vector<std::uint8_t>;

constexpr std::uint8_t appRequest = 0x06;
constexpr std::uint8_t noAuthentication = 0;
constexpr std::uint8_t administrator = 4;
constexpr std::uint8_t processorAddress = 0x20;
constexpr std::uint8_t consoleAddress = 0x81;
constexpr std::array<std::uint8_t, 4> rmcpHeader{0x06, 0x00, 0xff, 0x07};  // class IPMI
constexpr std::size_t sessionHeaderSize = 10;  // of a session without code

void appendNumber(Bytes& bytes, std::uint32_t number) {
    for (unsigned shift = 0; shift < 32; shift += 8) {
        bytes.push_back(static_cast<std::uint8_t>(number >> shift));
    }
}

std::uint32_t numberAt(const Bytes& bytes, std::size_t position) {
    std::uint32_t number = 0;
    for (unsigned i = 0; i < 4; ++i) {
        number |= std::uint32_t{bytes.at(position + i)} << (8 * i);
    }
    return number;
}

/// Makes the sum of all bytes, itself included, 0.
std::uint8_t checksum(std::span<const std::uint8_t> bytes) {
    return static_cast<std::uint8_t>(-std::accumulate(bytes.begin(), bytes.end(), 0));
}

/// One message of IPMI over LAN, and the number by which its response is known.
Bytes messageOf(const IpmiRequest& request, std::uint8_t sequence) {
    Bytes message{processorAddress, static_cast<std::uint8_t>(request.netFn << 2U)};
    message.push_back(checksum(message));
    message.push_back(consoleAddress);
    message.push_back(static_cast<std::uint8_t>(sequence << 2U));
    message.push_back(request.command);
    message.insert(message.end(), request.data.begin(), request.data.end());
    message.push_back(checksum(std::span{message}.subspan(3)));
    return message;
}

}  // namespace

int RmcpSession::open() {
    close();
    socket_.reset(::socket(AF_INET, SOCK_DGRAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0));
    if (!socket_) {
        return errno;
    }
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_port = htons(port_);
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    const auto* const generic = static_cast<const sockaddr*>(static_cast<const void*>(&address));
    if (::connect(socket_.get(), generic, sizeof address) != 0) {
        return errno;
    }
    return logIn() ? 0 : ECONNREFUSED;
}

void RmcpSession::close() noexcept {
    socket_.reset();
    sessionId_ = 0;
    sessionSequence_ = 0;
    ids_.clear();
}

bool RmcpSession::logIn() {
    Bytes wanted(17);  // no authentication, and an empty user name
    wanted.front() = noAuthentication;
    const auto challenge = exchange({appRequest, 0x39, wanted});
    if (!challenge || challenge->data.size() < 21 || challenge->data.front() != 0) {
        return false;
    }
    sessionId_ = numberAt(challenge->data, 1);
    Bytes activate{noAuthentication, administrator};
    activate.insert(activate.end(), challenge->data.begin() + 5, challenge->data.begin() + 21);
    appendNumber(activate, 1);  // the first number of a packet from there
    const auto session = exchange({appRequest, 0x3a, activate});
    if (!session || session->data.size() < 11 || session->data.front() != 0) {
        return false;
    }
    sessionId_ = numberAt(session->data, 2);
    sessionSequence_ = numberAt(session->data, 6);
    const auto privilege = exchange({appRequest, 0x3b, {administrator}});
    return privilege && !privilege->data.empty() && privilege->data.front() == 0;
}

std::optional<IpmiResponse> RmcpSession::exchange(const IpmiRequest& request) {
    for (int attempt = 0; attempt < 50; ++attempt) {
        // Refused while the simulator does not listen yet.
        static_cast<void>(send(0, request));
        pollfd descriptor{.fd = socket_.get(), .events = POLLIN, .revents = 0};
        static_cast<void>(::poll(&descriptor, 1, 100));
        const IpmiReceived received = receive();
        if (received.error == 0 && received.response.command == request.command) {
            return received.response;
        }
        if (received.error == ECONNREFUSED) {
            static_cast<void>(::poll(nullptr, 0, 100));
        }
    }
    return std::nullopt;
}

int RmcpSession::send(long id, const IpmiRequest& request) {
    requestSequence_ = (requestSequence_ + 1) & 0x3fU;
    const Bytes message = messageOf(request, requestSequence_);
    Bytes packet{rmcpHeader.begin(), rmcpHeader.end()};
    packet.push_back(noAuthentication);
    appendNumber(packet, sessionSequence_);
    appendNumber(packet, sessionId_);
    packet.push_back(static_cast<std::uint8_t>(message.size()));
    packet.insert(packet.end(), message.begin(), message.end());
    if (::send(socket_.get(), packet.data(), packet.size(), 0) < 0) {
        return errno;
    }
    if (sessionSequence_ != 0) {
        ++sessionSequence_;
    }
    ids_[requestSequence_] = id;
    return 0;
}

IpmiReceived RmcpSession::receive() {
    std::array<std::uint8_t, 1024> buffer{};
    const ssize_t got = ::recv(socket_.get(), buffer.data(), buffer.size(), 0);
    if (got < 0) {
        return {.error = errno, .response = {}};
    }
    const auto packet = std::span{buffer}.first(static_cast<std::size_t>(got));
    const std::size_t start = rmcpHeader.size() + sessionHeaderSize;
    // Two addresses, two checksums, function, number, command and completion code.
    if (packet.size() < start + 8 || packet[rmcpHeader.size()] != noAuthentication ||
        packet[start - 1] != packet.size() - start) {
        return {.response = {}};
    }
    const auto message = packet.subspan(start);
    if (checksum(message) != 0) {
        return {.response = {}};
    }
    const auto known = ids_.extract(static_cast<std::uint8_t>(message[4] >> 2U));
    return {.id = known ? known.mapped() : 0,
            .response = {static_cast<std::uint8_t>(message[1] >> 2U),
                         message[5],
                         {message.begin() + 6, message.end() - 1}}};
}

}  // namespace ZR::Live
