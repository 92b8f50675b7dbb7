#include "Simulator.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <csignal>
#include <filesystem>
#include <numeric>
#include <span>
#include <system_error>

#include "zrcommon/UniqueFd.h"

namespace ZR::Live {

namespace {

/// A port that was free a moment ago. The kernel does not give it out again at once.
std::uint16_t freePort() {
    const UniqueFd socket{::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0)};
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    socklen_t size = sizeof address;
    auto* const generic = static_cast<sockaddr*>(static_cast<void*>(&address));
    if (::bind(socket.get(), generic, size) != 0 ||
        ::getsockname(socket.get(), generic, &size) != 0) {
        throw std::system_error(errno, std::generic_category(), "free port");
    }
    return ntohs(address.sin_port);
}

}  // namespace

Simulator::Simulator(unsigned channel) : port_(freePort()) {
    const std::string settings = directory_.path("/settings");
    directory_.write("/lan.conf",
                     "name \"simulated\"\n"
                     "set_working_mc 0x20\n"
                     "  startlan " +
                         std::to_string(channel) +
                         "\n"
                         "    addr 127.0.0.1 " +
                         std::to_string(port_) +
                         "\n"
                         "    priv_limit admin\n"
                         "    allowed_auths_callback none\n"
                         "    allowed_auths_user none\n"
                         "    allowed_auths_operator none\n"
                         "    allowed_auths_admin none\n"
                         "    lan_config_program \"" +
                         directory_.path("/settings.sh") +
                         "\"\n"
                         "  endlan\n"
                         "  user 1 true \"\" \"test\" admin 10 none\n");
    directory_.write("/sim.emu",
                     "mc_setbmc 0x20\n"
                     "mc_add 0x20 0 no-device-sdrs 0x23 9 8 0x9f 0x1291 0xf02 persist_sdr\n"
                     "mc_enable 0x20\n");
    // Called as "get NAME..." it prints lines NAME:VALUE.
    directory_.write("/settings.sh",
                     "#!/bin/sh\n"
                     "[ \"$1\" = get ] || exit 0\n"
                     "shift\n"
                     "for name; do grep \"^$name:\" " +
                         settings +
                         "; done\n"
                         "exit 0\n");
    std::filesystem::permissions(directory_.path("/settings.sh"),
                                 std::filesystem::perms::owner_all);
    std::filesystem::create_directory(directory_.path("/state"));
    configure("dhcp", "198.51.100.77");
    start();
}

Simulator::~Simulator() {
    ::kill(process_, SIGKILL);
    while (::waitpid(process_, nullptr, 0) < 0 && errno == EINTR) {
    }
}

void Simulator::configure(const std::string& source, const std::string& address) const {
    directory_.write("/settings", "ip_addr_src:" + source +
                                      "\n"
                                      "ip_addr:" +
                                      address +
                                      "\n"
                                      "mac_addr:52:54:00:ab:cd:ef\n"
                                      "subnet_mask:255.255.255.0\n"
                                      "default_gw_ip_addr:198.51.100.1\n"
                                      "default_gw_mac_addr:52:54:00:00:00:01\n"
                                      "backup_gw_ip_addr:0.0.0.0\n"
                                      "backup_gw_mac_addr:00:00:00:00:00:00\n");
}

std::string Simulator::output() const {
    return File::read(directory_.path("/output")).value_or(std::string{});
}

void Simulator::start() {
    const std::string lan = directory_.path("/lan.conf");
    const std::string emulation = directory_.path("/sim.emu");
    const std::string state = directory_.path("/state");
    const std::string output = directory_.path("/output");
    const pid_t parent = ::getpid();
    process_ = ::fork();
    if (process_ < 0) {
        throw std::system_error(errno, std::generic_category(), "fork");
    }
    if (process_ == 0) {
        // It must not outlive the test, however that ends.
        ::prctl(PR_SET_PDEATHSIG, SIGKILL);
        const int nowhere = ::open("/dev/null", O_RDONLY);
        const int file = ::open(output.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600);
        if (::getppid() == parent && ::dup2(nowhere, 0) >= 0 && ::dup2(file, 1) >= 0 &&
            ::dup2(file, 2) >= 0) {
            ::execl(program, program, "-n", "-c", lan.c_str(), "-f", emulation.c_str(), "-s",
                    state.c_str(), nullptr);
        }
        ::_exit(127);
    }
}

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
