#pragma once

#include <string>
#include <utility>
#include <vector>

#include "facts/ClientFacts.h"
#include "formats/Files.h"
#include "kernel/Sockets.h"

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

    /// Keeps the processes, to compare with, as they were read: other readers may learn more
    /// of them.
    void keepProcesses(const ClientFacts& facts);

    /// Keeps the sockets, likewise, and the processes of which they were believed to be.
    void keepSockets(const ClientFacts& facts);

    /// Looks whether clients or their sockets differ from what was kept. What cannot be read
    /// counts as not there.
    [[nodiscard]] bool changed();

  private:
    Roots roots_;
    std::string lastProcess_;  // its number, as the kernel writes it
    /// A process gets the name of its program some time after its number: it is looked for
    /// once more when no other has started.
    bool settled_ = false;
    std::vector<PacketSocket> packetSockets_;
    ClientFacts processes_;  // nothing else
    ClientFacts sockets_;    // and the processes of which they were believed to be
};

}  // namespace ZR::Live
