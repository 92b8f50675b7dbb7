#pragma once

#include <chrono>
#include <cstddef>

namespace cimom::wbem {

/// How many results clients may pull in portions, and for how long one may rest.
struct SessionLimits {
    std::size_t sessions = 128;  ///< open at the same time
    std::size_t each = 32;       ///< of these, of one user, and of one address
    std::chrono::seconds defaultTimeout{60};
    std::chrono::seconds longestTimeout{600};

    bool operator==(const SessionLimits&) const = default;
};

/// What one client may cost. Every limit has a default and a range; none can be
/// switched off, and 0 is in none of the ranges.
struct Limits {
    std::size_t headerLine = 8192;       ///< bytes of one header, name and value
    std::size_t headers = 16384;         ///< bytes of all headers together
    std::size_t body = 1U << 20U;        ///< bytes of a request's body
    std::size_t depth = 64;              ///< of XML elements
    std::size_t connections = 512;       ///< at the same time
    std::size_t connectionsEach = 128;   ///< of these, of an address that is not known
    std::size_t connectionRate = 20;     ///< new ones of such an address in a second, then
    std::size_t checksEach = 8;          ///< passwords of an address that are checked or refused
    std::size_t refusalsEach = 60;       ///< wrong passwords of an address in a minute
    std::size_t memory = 48U << 20U;     ///< bytes that all requests take
    std::size_t workers = 4;             ///< operations that are carried out at the same time
    std::size_t ioThreads = 2;           ///< threads that read requests and send responses
    std::size_t stuck = 16;              ///< further workers, for those that do not come back
    std::size_t waiting = 256;           ///< requests that wait for a worker
    std::size_t result = 1U << 30U;      ///< bytes of the XML of one result
    std::chrono::seconds head{5};        ///< for the head of a first request, and TLS before it
    std::chrono::seconds request{30};    ///< for a request to arrive, and for its operation
    std::chrono::seconds response{300};  ///< for a response to be taken
    SessionLimits sessions;

    /// Throws std::invalid_argument, which names the limit and its range, for the
    /// first that is out of its range.
    void check() const;

    bool operator==(const Limits&) const = default;
};

}  // namespace cimom::wbem
