#include "Simulator.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <netinet/in.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <filesystem>
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

}  // namespace ZR::Live
