#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <mutex>
#include <string>
#include <unordered_map>

#include "http/AddressShares.h"
#include "http/Exchange.h"

namespace cimom::wbem {

/// The open connections of a server: who may have one, and by when it has to have come
/// further. A client cannot hold one for ever by sending or taking a byte now and then, and the
/// clients of one address cannot hold them all. Safe for concurrent use.
class Connections {
  public:
    using Clock = std::chrono::steady_clock;

    /// Connections that were cut and are not closed yet; they count beyond the limit.
    static constexpr std::size_t mostEnding = 64;

    struct Connection {
        int socket = -1;
        AddressKey key{};
        std::string address;
        Clock::time_point deadline;
        Clock::time_point since;             ///< it has to bring a request
        Clock::time_point alone;             ///< the client has closed its side; zero: it has not
        std::shared_ptr<Exchange> exchange;  ///< while a worker has it
        bool responding = false;             ///< the client takes a response
        bool ending = false;                 ///< cut; the thread that serves it closes it
    };

    /// Borrows both.
    Connections(const Limits& limits, AddressShares& shares) : limits_(limits), shares_(shares) {}

    /// A new connection, which has to bring the head of a request. False when it has to be
    /// closed at once: its address has its share, or the server is full. When the server is
    /// full, an address with much fewer connections than another takes over one that is idle.
    /// The last quarter is for known addresses.
    [[nodiscard]] bool admit(int socket, const AddressKey& key, std::string address);
    /// Of a socket that was admitted; null for another. Lives until closed().
    [[nodiscard]] Connection* find(int socket);
    /// The socket is about to be closed.
    void closed(int socket);

    /// It has to bring a (further) request.
    void expectRequest(Connection& connection);
    /// Somebody else than its own thread has its request.
    void expectResult(Connection& connection, std::shared_ptr<Exchange> exchange);
    /// The client has to take the response.
    void expectTaking(Connection& connection);

    /// Ends what is overdue: a request that a worker has by a failure, else the connection; and
    /// connections whose client has gone.
    void endOverdue();
    /// Ends all requests that workers have by a failure, since the server ends.
    void endAll();
    /// Whether a response is still to be made or taken.
    [[nodiscard]] bool isBusy() const;

    /// How many connections were not admitted or taken over since the last call.
    [[nodiscard]] std::uint64_t takeTurnedAway();

  private:
    void set(Connection& connection, std::chrono::seconds time, std::shared_ptr<Exchange> exchange,
             bool responding);
    [[nodiscard]] bool makeRoomLocked(const AddressKey& key);
    void forgetLocked(int socket);
    void endLocked(Connection& connection);
    void endAbandonedLocked(Clock::time_point now);

    const Limits& limits_;
    AddressShares& shares_;
    mutable std::mutex mutex_;
    std::unordered_map<int, Connection> connections_;
    std::size_t ending_ = 0;
    std::uint64_t turnedAway_ = 0;
};

}  // namespace cimom::wbem
