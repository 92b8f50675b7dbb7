#include "kernel/RtnetlinkReader.h"

#include <libmnl/libmnl.h>
#include <linux/if_addr.h>
#include <linux/if_link.h>
#include <linux/rtnetlink.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <optional>
#include <span>
#include <utility>

#include "formats/Files.h"
#include "kernel/Attributes.h"

namespace ZR::Live {
namespace {

// A dump that was interrupted or lost parts is asked for this often in all.
constexpr int attempts = 3;
// The kernel fills datagrams of up to 32 KiB; one link with many virtual
// functions may need more.
constexpr std::size_t firstBufferSize = std::size_t{32} << 10U;
constexpr std::size_t largestBufferSize = std::size_t{1} << 20U;

/// The errno in a message of the kernel, which has it negated; EBADMSG where there is none.
int errorIn(std::optional<std::int32_t> code) {
    return code && *code < 0 && *code != INT32_MIN ? -*code : EBADMSG;
}

/// A deadline moved by so long; one that never comes stays so.
Deadline later(Deadline deadline, std::chrono::steady_clock::duration by) {
    return deadline > Deadline::max() - by ? Deadline::max() : deadline + by;
}

}  // namespace

/// How one dump ended.
struct RtnetlinkReader::Outcome {
    enum class End : std::uint8_t {
        Complete,
        Interrupted,  // complete, but the kernel says that it changed meanwhile
        Lost,         // parts are missing; worth another try
        Failed,
    };
    End end = End::Failed;
    int refusal = 0;  // the errno of a response that refuses
    std::string reason;
    std::size_t unreadable = 0;  // messages that cannot be parsed
    bool interrupted = false;
};

RtnetlinkReader::RtnetlinkReader(std::unique_ptr<NetlinkTransport> transport)
    : transport_(std::move(transport)), buffer_(firstBufferSize) {}

NetworkState RtnetlinkReader::read(Deadline deadline) {
    NetworkState state;
    held_ = {};
    if (dump({RTM_GETLINK}, "links", parseLink, state.links, state, deadline)) {
        // Without links there is nothing that an address could belong to.
        dump({RTM_GETADDR}, "addresses", parseAddress, state.addresses, state, deadline);
    }
    return state;
}

std::optional<NetworkState> RtnetlinkReader::readLink(std::uint32_t ifindex, Deadline deadline) {
    using End = Outcome::End;
    std::optional<NetworkState> state{std::in_place};
    held_ = {};
    const Outcome link = dumpOnce({RTM_GETLINK, ifindex}, parseLink, state->links, deadline);
    if (link.refusal == ENODEV) {
        return state;
    }
    if (link.end != End::Complete || link.unreadable != 0) {
        return std::nullopt;
    }
    const Outcome addresses =
        dumpOnce({RTM_GETADDR, ifindex}, parseAddress, state->addresses, deadline);
    if (addresses.end != End::Complete || addresses.unreadable != 0) {
        return std::nullopt;
    }
    std::erase_if(state->addresses,
                  [ifindex](const Address& address) { return address.ifindex != ifindex; });
    return state;
}

bool RtnetlinkReader::Request::isForOneLink() const {
    return type == RTM_GETLINK && ifindex != 0;
}

template <typename Fact, typename Parse>
bool RtnetlinkReader::dump(const Request& request, const char* what, Parse parse,
                           std::vector<Fact>& facts, NetworkState& state, Deadline deadline) {
    using End = Outcome::End;
    Outcome outcome;
    for (int attempt = 0; attempt < attempts; ++attempt) {
        if (attempt > 0 && std::chrono::steady_clock::now() >= deadline) {
            break;
        }
        facts.clear();
        outcome = dumpOnce(request, parse, facts, deadline);
        if (outcome.end == End::Complete || outcome.end == End::Failed) {
            break;
        }
    }
    const std::string about = std::string{"network "} + what + ": ";
    if (outcome.unreadable != 0) {
        state.certain = false;
        state.diagnostics.emplace_back(about + std::to_string(outcome.unreadable) +
                                       " malformed messages left out");
    }
    if (outcome.end == End::Complete) {
        return true;
    }
    state.certain = false;
    state.diagnostics.emplace_back(about + outcome.reason);
    if (outcome.end == End::Interrupted) {
        return true;
    }
    facts.clear();
    return false;
}

template <typename Fact, typename Parse>
RtnetlinkReader::Outcome RtnetlinkReader::dumpOnce(const Request& request, Parse parse,
                                                   std::vector<Fact>& facts, Deadline deadline) {
    using End = Outcome::End;
    Outcome outcome;
    if (const int error = ask(request); error != 0) {
        outcome.reason = "cannot be asked for: " + reasonOf(error);
        return outcome;
    }
    // Whatever ends the dump early leaves parts of it in the socket, and the kernel
    // refuses another dump while one is going on: such a socket is not used again.
    open_ = false;
    for (;;) {
        const Datagram datagram = transport_->receive(buffer_, later(deadline, held_));
        if (datagram.error == ENOBUFS) {
            outcome.end = End::Lost;
            outcome.reason = "parts of the response were lost";
            return outcome;
        }
        if (datagram.error != 0) {
            outcome.reason = "no response: " + reasonOf(datagram.error);
            return outcome;
        }
        // Any process may send to a netlink port that it guesses.
        const bool fromKernel = datagram.sender == 0;
        if (fromKernel && datagram.truncated) {
            const bool grows = buffer_.size() < largestBufferSize;
            if (grows) {
                buffer_.resize(buffer_.size() * 2);
            }
            outcome.end = grows ? End::Lost : End::Failed;
            outcome.reason = "the response is longer than the buffer";
            return outcome;
        }
        if (fromKernel && take(datagram.size, request, parse, facts, outcome)) {
            open_ = outcome.end == End::Complete || outcome.end == End::Interrupted;
            return outcome;
        }
        if (std::chrono::steady_clock::now() >= later(deadline, held_)) {
            outcome.reason = "no complete response in time";
            return outcome;
        }
    }
}

/// Takes the messages of one datagram. True when the dump is over.
template <typename Fact, typename Parse>
bool RtnetlinkReader::take(std::size_t size, const Request& request, Parse parse,
                           std::vector<Fact>& facts, Outcome& outcome) const {
    using End = Outcome::End;
    std::span<const std::byte> rest = std::span{buffer_}.first(size);
    // libmnl's own walk takes a length of 2 GiB and more for a negative one, which fits.
    while (const auto message = valueAt<nlmsghdr>(rest)) {
        if (message->nlmsg_len < NLMSG_HDRLEN || message->nlmsg_len > rest.size()) {
            break;
        }
        const auto bytes = rest.first(message->nlmsg_len);
        rest = rest.subspan(std::min<std::size_t>(NLMSG_ALIGN(bytes.size()), rest.size()));
        if (message->nlmsg_seq != sequence_) {
            continue;  // the rest of a response that was given up
        }
        if ((message->nlmsg_flags & NLM_F_DUMP_INTR) != 0) {
            outcome.interrupted = true;
        }
        const auto code = valueAt<std::int32_t>(bytes.subspan(NLMSG_HDRLEN));
        switch (message->nlmsg_type) {
            case NLMSG_NOOP:
                break;
            case NLMSG_OVERRUN:
                outcome.end = End::Lost;
                outcome.reason = "parts of the response were lost";
                return true;
            case NLMSG_ERROR:
                if (code && *code == 0) {
                    if (!request.isForOneLink()) {
                        break;  // an acknowledgement
                    }
                    outcome.end = facts.size() == 1 ? End::Complete : End::Lost;
                    return true;
                }
                outcome.refusal = errorIn(code);
                outcome.reason = "refused: " + reasonOf(outcome.refusal);
                return true;
            case NLMSG_DONE:
                if (code && *code < 0) {
                    outcome.reason = "broken off: " + reasonOf(errorIn(code));
                } else {
                    outcome.end = outcome.interrupted ? End::Interrupted : End::Complete;
                    outcome.reason = outcome.interrupted ? "changed while they were read" : "";
                }
                return true;
            default:
                // A response's type is its request's less two.
                if (message->nlmsg_type != request.type - 2) {
                    break;
                }
                if (auto fact = parse(bytes)) {
                    facts.push_back(*std::move(fact));
                } else {
                    ++outcome.unreadable;
                }
        }
    }
    if (!rest.empty()) {
        ++outcome.unreadable;
    }
    return false;
}

int RtnetlinkReader::ask(const Request& request) {
    if (!open_) {
        if (const int error = transport_->open(); error != 0) {
            return error;
        }
        open_ = true;
    }
    alignas(nlmsghdr) std::array<std::byte, 64> space{};
    nlmsghdr* const message = ::mnl_nlmsg_put_header(space.data());
    message->nlmsg_type = request.type;
    // One link comes without an end of its own, which the acknowledgement is then.
    message->nlmsg_flags = NLM_F_REQUEST | (request.isForOneLink() ? NLM_F_ACK : NLM_F_DUMP);
    message->nlmsg_seq = ++sequence_;
    if (request.type == RTM_GETLINK) {
        ifinfomsg info{};
        info.ifi_index = static_cast<int>(request.ifindex);
        std::memcpy(::mnl_nlmsg_put_extra_header(message, sizeof info), &info, sizeof info);
        // The counters are a quarter of the response, and are not needed.
        ::mnl_attr_put_u32(message, IFLA_EXT_MASK, RTEXT_FILTER_SKIP_STATS);
    } else {
        ifaddrmsg info{};
        info.ifa_index = request.ifindex;
        std::memcpy(::mnl_nlmsg_put_extra_header(message, sizeof info), &info, sizeof info);
    }
    const auto asking = std::chrono::steady_clock::now();
    const int error = transport_->send(std::span{space}.first(message->nlmsg_len));
    held_ += std::chrono::steady_clock::now() - asking;
    open_ = error == 0;
    return error;
}

}  // namespace ZR::Live
