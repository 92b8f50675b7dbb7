#pragma once

namespace ZR::Testing {

enum class HostName { real, fails, isEmpty };

/// What gethostname does during the life of one of these. The kernel's does not fail on
/// its own, so programs that link kit_host_name have one in its place, which fails with
/// EFAULT or tells an empty name on demand, and asks the kernel otherwise.
class FakeHostName {
  public:
    explicit FakeHostName(HostName behaviour);
    ~FakeHostName();
    FakeHostName(const FakeHostName&) = delete;
    FakeHostName& operator=(const FakeHostName&) = delete;
};

class HostNameFails : public FakeHostName {
  public:
    HostNameFails() : FakeHostName(HostName::fails) {}
};

class HostNameIsEmpty : public FakeHostName {
  public:
    HostNameIsEmpty() : FakeHostName(HostName::isEmpty) {}
};

}  // namespace ZR::Testing
