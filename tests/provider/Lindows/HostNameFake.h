#pragma once

/// The kernel's gethostname does not fail on its own, so this one, linked in its
/// place, fails on demand and asks the kernel otherwise.
namespace test {

class HostNameFails {
  public:
    HostNameFails();
    ~HostNameFails();
    HostNameFails(const HostNameFails&) = delete;
    HostNameFails& operator=(const HostNameFails&) = delete;
};

}  // namespace test
