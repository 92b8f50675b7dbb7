#pragma once

#include <string>

#include "kit/FaultMachine.h"
#include "kit/TemporaryDirectory.h"

namespace test {

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
