#pragma once

#include <cstddef>
#include <optional>
#include <utility>

#include "kernel/NetlinkTransport.h"
#include "kernel/NetworkChanges.h"
#include "kernel/RtnetlinkReader.h"

namespace ZR::Live {

/// Links and addresses as they were read last, of which only what changed is read again: on
/// a machine with thousands of links a dump of all of them is most of what a reading costs.
///
/// The kernel's messages tell which links changed. What they are now it is asked then, in the
/// same words as in a dump: a message has neither the order of a link's addresses, nor what
/// is left of their time. All is read again when it is not known what changed, when most of
/// it did, and where the kernel tells nothing of a change that matters.
class KeptNetwork {
  public:
    /// With fewer links a dump costs little, and nothing is kept.
    static constexpr std::size_t fewestLinks = 200;

    explicit KeptNetwork(RtnetlinkReader reader, std::size_t fewest = fewestLinks)
        : reader_(std::move(reader)), fewest_(fewest) {}

    /// The state now, by what changed since the last reading. Throws nothing but
    /// std::bad_alloc, after which all is read again. The deadline is RtnetlinkReader's.
    [[nodiscard]] NetworkState read(const NetworkChanges& changes, Deadline deadline);

  private:
    [[nodiscard]] NetworkState readAll(Deadline deadline);
    [[nodiscard]] bool update(NetworkState& state, const NetworkChanges& changes,
                              Deadline deadline);

    RtnetlinkReader reader_;
    std::size_t fewest_;
    std::optional<NetworkState> kept_;  // each in the order of the links' indexes
};

}  // namespace ZR::Live
