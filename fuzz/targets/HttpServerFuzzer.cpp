// Bytes that a stranger sends to the whole server: HTTP, CIM-XML and the real provider.
// Everything is sent at once, and all responses are read until the connection ends, or
// until nothing more comes: a request that is not whole has half a minute to become so.
// Whatever came, the next client gets a response.
#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <charconv>
#include <map>
#include <optional>

#include "Input.h"
#include "cimom/Names.h"
#include "support/FuzzMachine.h"
#include "wbem/Server.h"
#include "zrcommon/UniqueFd.h"

namespace {

cimom::wbem::ServerSettings settings() {
    cimom::wbem::ServerSettings settings;
    settings.port = 0;
    settings.limits.ioThreads = 1;
    settings.limits.workers = 1;
    return settings;
}

cimom::wbem::Server& server() {
    static cimom::wbem::Server server(fuzz::machine(), settings(),
                                      [](cimom::wbem::LogKind, const std::string&) {});
    return server;
}

ZR::UniqueFd connected() {
    ZR::UniqueFd fd(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0));
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    address.sin_port = htons(server().port());
    // Ports of connections that have ended are free again at once.
    const linger reset{1, 0};
    fuzz::require(
        ::setsockopt(fd.get(), SOL_SOCKET, SO_LINGER, &reset, sizeof reset) == 0 &&
            ::connect(fd.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address) == 0,
        "the server takes connections");
    return fd;
}

/// Whether something comes within the time. The fuzzer's own timer interrupts the
/// waiting now and then, which is not silence.
bool comes(int fd, int milliseconds) {
    pollfd readable{fd, POLLIN, 0};
    int ready = 0;
    do {
        ready = ::poll(&readable, 1, milliseconds);
    } while (ready < 0 && errno == EINTR);
    return ready == 1;
}

/// What the server sends until it ends the connection or is silent for the time.
std::string received(int fd, int milliseconds) {
    std::string responses;
    std::array<char, 65536> piece{};
    for (;;) {
        if (!comes(fd, milliseconds)) {
            return responses;
        }
        const ssize_t size = ::recv(fd, piece.data(), piece.size(), 0);
        if (size <= 0) {
            return responses;  // its end, or a reset for what the server would not read
        }
        responses.append(piece.data(), static_cast<std::size_t>(size));
    }
}

void send(int fd, std::string_view bytes) {
    while (!bytes.empty()) {
        const ssize_t sent = ::send(fd, bytes.data(), bytes.size(), MSG_NOSIGNAL);
        if (sent <= 0) {
            return;  // the server has heard enough
        }
        bytes.remove_prefix(static_cast<std::size_t>(sent));
    }
}

struct LessName {
    bool operator()(const std::string& a, const std::string& b) const {
        return std::lexicographical_compare(
            a.begin(), a.end(), b.begin(), b.end(),
            [](char x, char y) { return cimom::lowered(x) < cimom::lowered(y); });
    }
};

/// Takes a line with its line end; nothing when it is not whole.
std::optional<std::string_view> takeLine(std::string_view& text) {
    const std::size_t end = text.find("\r\n");
    if (end == std::string_view::npos) {
        return std::nullopt;
    }
    const std::string_view line = text.substr(0, end);
    text.remove_prefix(end + 2);
    return line;
}

std::size_t numberOf(std::string_view text, int base) {
    std::size_t number = 0;
    const auto [stop, error] =
        std::from_chars(text.data(), text.data() + text.size(), number, base);
    fuzz::require(error == std::errc() && stop == text.data() + text.size(),
                  "a length is a number");
    return number;
}

std::optional<std::string> takeBytes(std::string_view& text, std::size_t size) {
    if (text.size() < size) {
        return std::nullopt;
    }
    std::string taken(text.substr(0, size));
    text.remove_prefix(size);
    return taken;
}

std::optional<std::string> takeChunks(std::string_view& text) {
    std::string body;
    for (;;) {
        const auto line = takeLine(text);
        if (!line) {
            return std::nullopt;
        }
        const auto chunk = takeBytes(text, numberOf(*line, 16));
        const auto end = chunk ? takeLine(text) : std::nullopt;
        if (!end) {
            return std::nullopt;
        }
        fuzz::require(end->empty(), "a chunk is as long as it says");
        if (chunk->empty()) {
            return body;
        }
        body += *chunk;
    }
}

/// Takes one response and checks it; false when it is not whole, or ends with the connection.
bool takeResponse(std::string_view& text) {
    const auto status = takeLine(text);
    if (!status) {
        return false;
    }
    const bool known = status->starts_with("HTTP/1.1 ") || status->starts_with("HTTP/1.0 ");
    fuzz::require(known && status->size() >= 12, "a response begins with a status");
    const std::string_view code = status->substr(9, 3);
    std::map<std::string, std::string, LessName> headers;
    for (;;) {
        const auto line = takeLine(text);
        if (!line) {
            return false;
        }
        if (line->empty()) {
            break;
        }
        const std::size_t colon = line->find(':');
        fuzz::require(colon != std::string_view::npos, "a header has a name");
        const std::size_t value = line->find_first_not_of(' ', colon + 1);
        headers.emplace(line->substr(0, colon),
                        value == std::string_view::npos ? "" : line->substr(value));
    }
    if (code == "100") {
        return true;
    }
    std::optional<std::string> body;
    if (const auto length = headers.find("Content-Length"); length != headers.end()) {
        body = takeBytes(text, numberOf(length->second, 10));
    } else if (headers.contains("Transfer-Encoding")) {
        body = takeChunks(text);
    } else {
        text = {};  // the body ends with the connection
        return false;
    }
    if (body && code == "200") {
        fuzz::validResponse(*body);
    }
    return body.has_value();
}

/// Sends bytes and checks the responses; false when there was none.
bool ask(std::string_view bytes, int milliseconds) {
    const ZR::UniqueFd fd = connected();
    send(fd.get(), bytes);
    // Fails where the server was faster.
    static_cast<void>(::shutdown(fd.get(), SHUT_WR));
    const std::string responses = received(fd.get(), milliseconds);
    std::string_view rest = responses;
    while (takeResponse(rest)) {
    }
    return !responses.empty();
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    constexpr int shortTime = 40;
    constexpr int longTime = 20'000;
    // What most requests lack that are not whole: the end of the head, the last chunk,
    // and a part of the body.
    static const std::string ending = "\r\n\r\n0\r\n\r\n" + std::string(1500, ' ') + "\r\n\r\n";
    if (!ask(std::string(fuzz::text(data, size)) + ending, shortTime)) {
        fuzz::require(ask("GET / HTTP/1.1\r\nHost: h\r\nConnection: close\r\n\r\n", longTime),
                      "the next client gets a response");
    }
    return 0;
}
