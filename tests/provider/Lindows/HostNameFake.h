#pragma once

/// The kernel's gethostname does not fail on its own, so this one, linked in its
/// place, fails or tells an empty name on demand and asks the kernel otherwise.
namespace test {

enum class HostName { real, fails, isEmpty };

/// What gethostname does from here on, until the end of the object; the tree that was
/// set is read before.
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

}  // namespace test
