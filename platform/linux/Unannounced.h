#pragma once

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "facts/ClientFacts.h"
#include "formats/Roots.h"

namespace ZR::Live {

/// What nothing notifies of: processes that start, sockets that are opened and closed.
///
/// A look at them is cheap as long as no process started anywhere on the machine, which the
/// kernel's last process number tells. Only then are the processes read, as a reading does.
class Unannounced {
  public:
    explicit Unannounced(Roots roots) : roots_(std::move(roots)) {}

    /// To be called before the processes are read, so that nothing falls in between.
    void begin();

    /// Keeps what was read since begin(), to compare with: the processes as they were read,
    /// before other readers learnt more of them, and the sockets.
    void keepProcesses(const ClientFacts& facts);
    void keepSockets(const ClientFacts& facts) { known_.sockets = facts.sockets; }

    /// Looks whether clients or their sockets differ from what was kept. What cannot be read
    /// counts as not there.
    [[nodiscard]] bool changed();

  private:
    Roots roots_;
    std::string lastProcess_;  // its number, as the kernel writes it
    /// A process gets the name of its program some time after its number: it is looked for
    /// once more when no other has started.
    bool settled_ = false;
    std::vector<std::uint32_t> packetLinks_;
    ClientFacts known_;  // processes and sockets alone
};

}  // namespace ZR::Live
