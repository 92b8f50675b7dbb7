#pragma once

namespace test {

/// A machine with states that the provider must tell apart.
class Machine {
  public:
    Machine() = default;
    Machine(const Machine&) = delete;
    Machine& operator=(const Machine&) = delete;
    virtual ~Machine() = default;

    /// Takes the machine into a state, in such a way that it must be read anew even if
    /// it is in that state already.
    virtual void enter(unsigned state) = 0;
};

}  // namespace test
