#pragma once

#include <sys/types.h>

#include <cstdint>
#include <string>

#include "LinuxSupport.h"

namespace ZR::Live {

/// Debian's simulator of service processors, running for one test on a port of the
/// loopback interface, with LAN on the given channel.
class Simulator {
  public:
    static constexpr const char* program = "/usr/bin/ipmi_sim";

    explicit Simulator(unsigned channel = 1);
    ~Simulator();
    Simulator(const Simulator&) = delete;
    Simulator& operator=(const Simulator&) = delete;

    [[nodiscard]] std::uint16_t port() const { return port_; }

    /// `source`: static, dhcp, bios or other.
    void configure(const std::string& source, const std::string& address) const;

    /// What it wrote: for the message of a failing test.
    [[nodiscard]] std::string output() const;

  private:
    void start();

    TemporaryDirectory directory_;
    std::uint16_t port_ = 0;
    pid_t process_ = -1;
};

}  // namespace ZR::Live
