#include "LeaseRules.h"

#include <cstdlib>
#include <optional>

namespace ZR::Live {
namespace {

// A client sets the address some moments before or after it writes the file.
constexpr std::int64_t tolerance = 10;  // seconds

constexpr std::int64_t sameMoment = 2;  // seconds, as both are counted in whole ones

constexpr std::int64_t endlessSpan = std::int64_t{100} * 365 * 24 * 3600;  // seconds

bool isNear(std::int64_t difference) noexcept {
    return difference >= -tolerance && difference <= tolerance;
}

/// The end of an address that has one.
std::int64_t endOf(const Address& address, std::int64_t now) noexcept {
    return now + address.validLifetime;
}

Standing standingBy(const Lease& lease, std::int64_t now) noexcept {
    return *lease.expires <= now ? Standing::Ended : Standing::Live;
}

Standing settlePermanent(const Lease& lease, std::int64_t now) noexcept {
    if (!lease.expires) {
        // A client that runs takes the claim back itself.
        return lease.clientAlive || leavesPermanent(lease) ? Standing::Live : Standing::Foreign;
    }
    if (isEndless(lease, now)) {
        return Standing::Live;
    }
    // The client would have given it an end.
    return leavesPermanent(lease) ? standingBy(lease, now) : Standing::Foreign;
}

/// Takes out times that no clock shows, so that all that follows can reckon with them.
void dropImpossibleTimes(Lease& lease) noexcept {
    constexpr std::int64_t lastSecond = 253'402'300'799;  // of the year 9999
    for (std::optional<std::int64_t>* time : {&lease.obtained, &lease.renews, &lease.rebinds}) {
        if (*time && (**time < 0 || **time > lastSecond)) {
            time->reset();
        }
    }
    if (lease.expires && *lease.expires < 0) {
        lease.expires = 0;
    }
    if (lease.expires && *lease.expires > lastSecond) {
        lease.expires = Lease::never;
    }
}

void move(Lease& lease, std::int64_t by) noexcept {
    for (std::optional<std::int64_t>* time :
         {&lease.obtained, &lease.renews, &lease.rebinds, &lease.expires}) {
        if (*time) {
            **time += by;
        }
    }
}

}  // namespace

bool leavesPermanent(const Lease& lease) noexcept {
    switch (lease.client) {
        case Client::Udhcpc:
        case Client::Ipconfig:
        case Client::KernelBoot:
        case Client::Connman:
            return true;
        case Client::Wicked:  // not known; while it runs, its word is enough
            return lease.clientAlive;
        default:
            return lease.bootp || lease.outlivesEnd;
    }
}

bool isEndless(const Lease& lease, std::int64_t now) noexcept {
    return lease.expires && *lease.expires > now + endlessSpan;
}

Standing settle(Lease& lease, const Address& address, std::int64_t now) noexcept {
    dropImpossibleTimes(lease);
    if (address.validLifetime == Address::infinite) {
        return settlePermanent(lease, now);
    }
    const std::int64_t end = endOf(address, now);
    if (!lease.expires) {
        lease.expires = end;
        return standingBy(lease, now);
    }
    if (isEndless(lease, now)) {
        return Standing::Foreign;
    }
    if (isNear(*lease.expires - end)) {
        // A client that was given the lease again may not have written that down.
        if (lease.clientAlive && std::abs(*lease.expires - end) > sameMoment) {
            move(lease, end - *lease.expires);
        }
        return standingBy(lease, now);
    }
    if (!lease.clientAlive && *lease.expires < end) {
        // Nothing renews a lease whose client is gone: the address may be another lease's.
        return *lease.expires <= now ? Standing::Foreign : Standing::Live;
    }
    move(lease, end - *lease.expires);
    return standingBy(lease, now);
}

bool endsTogether(const Lease& lease, const Address& address, std::int64_t now) noexcept {
    if (!lease.expires || *lease.expires < 0) {
        return false;
    }
    if (address.validLifetime == Address::infinite) {
        // That it has no end tells little, so that the client must run.
        return lease.clientAlive && (isEndless(lease, now) || leavesPermanent(lease));
    }
    return !isEndless(lease, now) && isNear(*lease.expires - endOf(address, now));
}

}  // namespace ZR::Live
