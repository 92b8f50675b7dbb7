#pragma once

#include <cstdint>

#include "facts/Lease.h"
#include "kernel/Address.h"

namespace ZR::Live {

/// What a client's claim is worth against an address that the kernel has.
enum class Standing : std::uint8_t {
    Live,     ///< the address is the lease's, which has not ended
    Ended,    ///< the address is the lease's, which has ended
    Foreign,  ///< the same address, set by something else
};

/// Whether the client of a lease leaves addresses without an end, whatever the lease says.
[[nodiscard]] bool leavesPermanent(const Lease& lease) noexcept;

/// Whether a lease never ends. Some clients write an end of 136 years hence for that, which
/// is the longest lease time (RFC 2132 section 9.2). `now`: seconds since the epoch, as in
/// all of this file.
[[nodiscard]] bool isEndless(const Lease& lease, std::int64_t now) noexcept;

/// Compares a lease that was not released with the kernel's address of the same text.
///
/// The kernel counts an address's remaining lifetime by itself, so it is right where the
/// clock was set since the client wrote its file: the times of the lease are moved so that
/// its end is the kernel's, and likewise where the client was given the lease again since. That
/// of a client that is gone is never moved to a later time. A lease without a known end takes
/// that of the address.
[[nodiscard]] Standing settle(Lease& lease, const Address& address, std::int64_t now) noexcept;

/// Whether an address ends when a lease does, so that it is probably the lease's even if the
/// two do not name the same link.
[[nodiscard]] bool endsTogether(const Lease& lease, const Address& address,
                                std::int64_t now) noexcept;

}  // namespace ZR::Live
