#pragma once

#include <chrono>
#include <list>
#include <memory>
#include <mutex>
#include <string>

#include "http/Exchange.h"

namespace cimom::wbem {

/// The open connections of a server, each with a time at which it has to have
/// come further: a client cannot hold one for ever by sending or taking a byte now
/// and then. Safe for concurrent use.
class Connections {
  public:
    using Clock = std::chrono::steady_clock;

    struct Connection {
        int socket = -1;
        std::string address;
        Clock::time_point deadline;
        std::shared_ptr<Exchange> exchange;  ///< while a worker has it
        bool responding = false;             ///< the client takes a response
    };

    Connections(std::chrono::seconds request, std::chrono::seconds response)
        : request_(request), response_(response) {}

    /// A new connection, which has to bring a request. Lives until closed().
    Connection* opened(int socket, std::string address);
    /// The socket is about to be closed.
    void closed(Connection* connection);

    /// It has to bring a (further) request.
    void expectRequest(Connection& connection);
    /// A worker has its request.
    void expectResult(Connection& connection, std::shared_ptr<Exchange> exchange);
    /// The client has to take the response.
    void expectTaking(Connection& connection);

    /// Ends what is overdue: a request that a worker has by a failure, else the connection.
    void endOverdue();
    /// Ends all requests that workers have by a failure, since the server ends.
    void endAll();
    /// Whether a response is still to be made or taken.
    [[nodiscard]] bool isBusy() const;

  private:
    void set(Connection& connection, std::chrono::seconds time, std::shared_ptr<Exchange> exchange,
             bool responding);

    const std::chrono::seconds request_;
    const std::chrono::seconds response_;
    mutable std::mutex mutex_;
    std::list<Connection> connections_;
};

}  // namespace cimom::wbem
