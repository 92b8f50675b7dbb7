#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
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

    /// Reads one link and its addresses, in the order in which read() has them: empty when
    /// there is no such link. nullopt when that cannot be known for certain. The same holds
    /// as of read(). A kernel before Linux 4.20 sends the addresses of all links for it.
    [[nodiscard]] std::optional<NetworkState> readLink(std::uint32_t ifindex, Deadline deadline);

  private:
    struct Outcome;
    /// A dump of all links or addresses; or one link, or the addresses of one.
    struct Request {
        std::uint16_t type = 0;
        std::uint32_t ifindex = 0;

        [[nodiscard]] bool isForOneLink() const;
    };
    template <typename Fact, typename Parse>
    bool dump(const Request& request, const char* what, Parse parse, std::vector<Fact>& facts,
              NetworkState& state, Deadline deadline);
    template <typename Fact, typename Parse>
    Outcome dumpOnce(const Request& request, Parse parse, std::vector<Fact>& facts,
                     Deadline deadline);
    template <typename Fact, typename Parse>
    bool take(std::size_t size, const Request& request, Parse parse, std::vector<Fact>& facts,
              Outcome& outcome) const;
    int ask(const Request& request);

    std::unique_ptr<NetlinkTransport> transport_;
    bool open_ = false;
    std::uint32_t sequence_ = 0;
    Deadline::duration held_{};  // spent in asking, since the reading began
    std::vector<std::byte> buffer_;
};

}  // namespace ZR::Live
