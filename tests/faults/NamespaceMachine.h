#pragma once

#include "kit/TreeMachine.h"

namespace test {

/// The machine that the process is on, in namespaces of its own: with a bridge eth0,
/// whose lease is from one server or another.
class LiveMachine final : public Machine {
  public:
    LiveMachine();
    void enter(unsigned state) override;
};

}  // namespace test
