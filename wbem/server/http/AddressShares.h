#pragma once

#include <sys/socket.h>

#include <array>
#include <chrono>
#include <cstddef>
#include <functional>
#include <map>
#include <mutex>
#include <utility>

#include "wbem/Limits.h"

namespace cimom::wbem {

/// An address as shares are counted: an IPv4 address whole, an IPv6 address by its first 64
/// bits, since one machine can have any number of addresses with the same.
using AddressKey = std::array<unsigned char, 16>;

/// All zero for null and for another family than IP.
[[nodiscard]] AddressKey addressKey(const sockaddr* address);

/// What the clients of each address have of the server, so that those of one cannot take what
/// others need. Safe for concurrent use.
///
/// An address is known for ten minutes after a request from it was admitted; a server without
/// users admits every request.
class AddressShares {
  public:
    using Clock = std::chrono::steady_clock;
    /// `now` is what tells the time.
    explicit AddressShares(const Limits& limits,
                           std::function<Clock::time_point()> now = Clock::now);

    /// A request from the address was admitted.
    void admitted(const AddressKey& key);
    [[nodiscard]] bool isKnown(const AddressKey& key) const;

    /// Whether the address may have one more connection; counts it then. Looks at its own share
    /// alone, not at the whole. An address that is not known may open its share at once, and
    /// then so many in a second: each costs a TLS handshake.
    [[nodiscard]] bool addConnection(const AddressKey& key);
    void removeConnection(const AddressKey& key);
    [[nodiscard]] std::size_t connections(const AddressKey& key) const;

    /// Whether one more password from the address may be checked; counts it then, until
    /// endCheck().
    [[nodiscard]] bool beginCheck(const AddressKey& key);
    /// The client has its response, or is admitted.
    void endCheck(const AddressKey& key);
    /// A password was wrong. Beyond its share of these, an address has no share of checks.
    void refused(const AddressKey& key);

    /// Whether there is so much memory for requests of the address; takes it then, until
    /// giveMemory(). An address has at most half of all.
    [[nodiscard]] bool takeMemory(const AddressKey& key, std::size_t bytes);
    void giveMemory(const AddressKey& key, std::size_t bytes);
    /// Whether takeMemory() would succeed.
    [[nodiscard]] bool hasMemory(const AddressKey& key, std::size_t bytes) const;
    /// Whether much memory has been given since the last call: the allocator may then hold it.
    [[nodiscard]] bool gaveMuch();

    /// Forgets addresses that have nothing and are not known.
    void tidy();

  private:
    struct Share {
        std::size_t connections = 0;
        std::size_t checks = 0;
        std::size_t memory = 0;
        Clock::time_point knownUntil{};
        // A rate, as the time up to which its events are paid for.
        Clock::time_point connectionsPaid{};
        Clock::time_point refusalsPaid{};
    };

    [[nodiscard]] bool isKnownLocked(const Share& share) const;
    [[nodiscard]] bool hasMemoryLocked(const Share* share, std::size_t bytes) const;
    [[nodiscard]] const Share* findLocked(const AddressKey& key) const;

    const std::size_t connectionsEach_;
    const std::size_t checksEach_;
    const std::size_t memory_;
    const Clock::duration connectionInterval_;
    const Clock::duration connectionBurst_;
    const Clock::duration refusalInterval_;
    const Clock::duration refusalBurst_;
    const std::function<Clock::time_point()> now_;
    mutable std::mutex mutex_;
    std::map<AddressKey, Share> shares_;
    std::size_t memoryTaken_ = 0;
    std::size_t memoryGiven_ = 0;
};

/// Memory that one request of an address has, given back at the end. Used by one thread at a
/// time.
class RequestMemory {
  public:
    /// Borrows the shares.
    RequestMemory(AddressShares& shares, const AddressKey& key) : shares_(shares), key_(key) {}
    ~RequestMemory() { shrinkTo(0); }
    RequestMemory(const RequestMemory&) = delete;
    RequestMemory& operator=(const RequestMemory&) = delete;

    [[nodiscard]] std::size_t size() const noexcept { return size_; }
    /// Has at least so much from now on; false, and nothing changes, when there is not.
    [[nodiscard]] bool growTo(std::size_t size);
    void shrinkTo(std::size_t size);

  private:
    AddressShares& shares_;
    const AddressKey key_;
    std::size_t size_ = 0;
};

}  // namespace cimom::wbem
