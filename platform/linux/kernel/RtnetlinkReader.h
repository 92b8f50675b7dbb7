#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "kernel/Address.h"
#include "kernel/Link.h"
#include "kernel/NetlinkTransport.h"
#include "zrclient/Diagnostic.h"

namespace ZR::Live {

/// Links and addresses as the kernel had them at one time.
struct NetworkState {
    std::vector<Link> links;         ///< empty when they could not be read
    std::vector<Address> addresses;  ///< empty when they could not be read
    bool certain = true;             ///< false: incomplete, or mixed from two moments; read again
    std::vector<Diagnostic> diagnostics;

    bool operator==(const NetworkState&) const = default;
};

/// Reads links and addresses by rtnetlink dumps. The socket is its own: events
/// of a subscription would come between the parts of a dump.
class RtnetlinkReader {
  public:
    explicit RtnetlinkReader(std::unique_ptr<NetlinkTransport> transport = kernelTransport());

    /// Never throws apart from std::bad_alloc. Waits for responses until the deadline.
    ///
    /// Sending a request may itself wait, for as long as another process holds the kernel's
    /// lock of all links: the end of a namespace with a thousand bridges holds it for
    /// seconds. No deadline ends that wait. It moves the deadline, so that the response,
    /// which is then there, is still read; but no request is sent again after the deadline.
    [[nodiscard]] NetworkState read(Deadline deadline);

  private:
    struct Outcome;
    template <typename Fact, typename Parse>
    bool dump(std::uint16_t request, const char* what, Parse parse, std::vector<Fact>& facts,
              NetworkState& state, Deadline deadline);
    template <typename Fact, typename Parse>
    Outcome dumpOnce(std::uint16_t request, Parse parse, std::vector<Fact>& facts,
                     Deadline deadline);
    template <typename Fact, typename Parse>
    bool take(std::size_t size, std::uint16_t request, Parse parse, std::vector<Fact>& facts,
              Outcome& outcome) const;
    int ask(std::uint16_t request);

    std::unique_ptr<NetlinkTransport> transport_;
    bool open_ = false;
    std::uint32_t sequence_ = 0;
    Deadline::duration held_{};  // spent in asking, since the reading began
    std::vector<std::byte> buffer_;
};

}  // namespace ZR::Live
