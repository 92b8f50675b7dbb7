#pragma once

namespace ZR::Testing {

/// The kernel's gethostname does not fail on its own. Programs that link kit_host_name
/// have this one in its place, which fails with EFAULT as long as one of these lives,
/// and asks the kernel otherwise.
class HostNameFails {
  public:
    HostNameFails();
    ~HostNameFails();
    HostNameFails(const HostNameFails&) = delete;
    HostNameFails& operator=(const HostNameFails&) = delete;
};

}  // namespace ZR::Testing
