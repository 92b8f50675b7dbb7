#pragma once

#include <functional>
#include <string>

namespace ZR::Live {

/// Whether this process may make namespaces.
[[nodiscard]] bool mayMakeNamespaces();

/// Runs a test's body in a child process with network, mount, process and host
/// name namespaces of its own: with "/proc" of its own processes, empty "/run" and
/// "/var/lib", and no link but loopback. Whatever the body starts or makes ends
/// with it, even when it crashes or takes longer than the seconds given. True when
/// no expectation failed in it; its messages appear among those of the test.
[[nodiscard]] bool passesInNamespaces(unsigned seconds, const std::function<void()>& body);

/// Runs a shell command and expects it to succeed; returns what it printed.
std::string run(const std::string& command);

/// Another network namespace, held by a process, until the object goes.
class OtherNamespace {
  public:
    OtherNamespace();
    OtherNamespace(const OtherNamespace&) = delete;
    OtherNamespace& operator=(const OtherNamespace&) = delete;
    ~OtherNamespace();

    /// The process in it, which names it for ip(8) and nsenter(1).
    [[nodiscard]] std::string process() const { return std::to_string(process_); }

  private:
    int process_ = -1;
};

}  // namespace ZR::Live

/// Begins a test that needs namespaces of its own.
#define ZR_NEEDS_NAMESPACES()                                                      \
    do {                                                                           \
        if (!ZR::Live::mayMakeNamespaces()) {                                      \
            GTEST_SKIP() << "making namespaces needs root; run this test as root"; \
        }                                                                          \
    } while (false)
