#pragma once

/// The kernel's gethostname does not fail on its own, so this one, linked in its
/// place, fails on demand and asks the kernel otherwise.
namespace test {

class HostNameFails {
  public:
    /// From here on; the tree that was set is read before.
    HostNameFails();
    ~HostNameFails();
    HostNameFails(const HostNameFails&) = delete;
    HostNameFails& operator=(const HostNameFails&) = delete;
};

}  // namespace test
