#pragma once

#include <string>

#include "kit/Files.h"

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

/// A machine in a tree file, which the environment names to the provider.
class TreeMachine final : public Machine {
  public:
    TreeMachine();
    void enter(unsigned state) override;

    /// The text of the file in a state, of any number.
    [[nodiscard]] static std::string tree(unsigned state);

  private:
    ZR::Testing::TemporaryDirectory directory_;
};

}  // namespace test
