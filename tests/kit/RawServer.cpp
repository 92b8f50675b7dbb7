#include "kit/RawServer.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <system_error>
#include <utility>

namespace test {

namespace {

[[noreturn]] void fail(const char* what) {
    throw std::system_error(errno, std::generic_category(), what);
}

/// A listening socket, and its port.
std::pair<ZR::UniqueFd, std::uint16_t> listenAnywhere() {
    ZR::UniqueFd fd(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0));
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    socklen_t size = sizeof address;
    auto* const any = reinterpret_cast<sockaddr*>(&address);
    if (!fd || ::bind(fd.get(), any, size) != 0 || ::listen(fd.get(), 64) != 0 ||
        ::getsockname(fd.get(), any, &size) != 0) {
        fail("listening socket");
    }
    return {std::move(fd), ntohs(address.sin_port)};
}

/// Whether head and body are there, or the beginning of something other than HTTP: of
/// TLS, whose first record is of type 22 (RFC 8446, 5.1).
bool isWhole(const std::string& request) {
    if (request.starts_with('\x16')) {
        return true;
    }
    const std::size_t end = request.find("\r\n\r\n");
    if (end == std::string::npos) {
        return false;
    }
    const std::string name = "Content-Length: ";
    const std::size_t length = request.find(name);
    const std::size_t body =
        length < end ? std::stoul(request.substr(length + name.size())) : std::size_t{0};
    return request.size() >= end + 4 + body;
}

std::string receive(int fd) {
    std::string request;
    std::array<char, 4096> piece{};
    while (!isWhole(request)) {
        const ssize_t got = ::recv(fd, piece.data(), piece.size(), 0);
        if (got <= 0) {
            break;
        }
        request.append(piece.data(), static_cast<std::size_t>(got));
    }
    return request;
}

/// The other side may have closed before all is sent, which is what a test wants then.
void send(int fd, const std::string& text) {
    std::size_t sent = 0;
    while (sent < text.size()) {
        const ssize_t now = ::send(fd, text.data() + sent, text.size() - sent, MSG_NOSIGNAL);
        if (now <= 0) {
            return;
        }
        sent += static_cast<std::size_t>(now);
    }
}

}  // namespace

RawServer::RawServer(std::vector<std::string> responses) : responses_(std::move(responses)) {
    std::tie(listening_, port_) = listenAnywhere();
    std::array<int, 2> ends{};
    if (::pipe(ends.data()) != 0) {
        fail("pipe");
    }
    end_.reset(ends[0]);
    ender_.reset(ends[1]);
    thread_ = std::thread([this] { serve(); });
}

RawServer::~RawServer() {
    ender_.reset();
    thread_.join();
}

std::string RawServer::url() const {
    return "http://127.0.0.1:" + std::to_string(port_);
}

std::vector<std::string> RawServer::requests() const {
    const std::lock_guard lock(mutex_);
    return requests_;
}

void RawServer::serve() {
    std::size_t next = 0;
    while (true) {
        std::array<pollfd, 2> waiting{{{listening_.get(), POLLIN, 0}, {end_.get(), POLLIN, 0}}};
        if (::poll(waiting.data(), waiting.size(), -1) < 0 || waiting[1].revents != 0) {
            return;
        }
        ZR::UniqueFd connection(::accept4(listening_.get(), nullptr, nullptr, SOCK_CLOEXEC));
        if (next >= responses_.size()) {
            held_.push_back(std::move(connection));
            continue;
        }
        std::string request = receive(connection.get());
        {
            const std::lock_guard lock(mutex_);
            requests_.push_back(std::move(request));
        }
        send(connection.get(), responses_[next++]);
    }
}

std::uint16_t deadPort() {
    return listenAnywhere().second;
}

std::string httpResponse(const std::string& body, const std::string& status,
                         const std::string& headers) {
    return "HTTP/1.1 " + status + "\r\nContent-Type: application/xml\r\nConnection: close\r\n" +
           headers + "Content-Length: " + std::to_string(body.size()) + "\r\n\r\n" + body;
}

std::string cimResponse(const std::string& method, const std::string& content) {
    return httpResponse(
        "<CIM CIMVERSION='2.0' DTDVERSION='2.0'><MESSAGE ID='1' PROTOCOLVERSION="
        "'1.0'><SIMPLERSP><IMETHODRESPONSE NAME='" +
        method + "'>" + content + "</IMETHODRESPONSE></SIMPLERSP></MESSAGE></CIM>");
}

}  // namespace test
