#include "http/Connections.h"

#include <sys/socket.h>

#include <algorithm>
#include <utility>
#include <vector>

namespace cimom::wbem {

Connections::Connection* Connections::opened(int socket, std::string address) {
    const std::lock_guard lock(mutex_);
    return &connections_.emplace_back(
        Connection{socket, std::move(address), Clock::now() + request_, nullptr, false});
}

void Connections::closed(Connection* connection) {
    const std::lock_guard lock(mutex_);
    const auto found =
        std::find_if(connections_.begin(), connections_.end(),
                     [connection](const Connection& each) { return &each == connection; });
    if (found != connections_.end()) {
        connections_.erase(found);
    }
}

void Connections::set(Connection& connection, std::chrono::seconds time,
                      std::shared_ptr<Exchange> exchange, bool responding) {
    const std::lock_guard lock(mutex_);
    connection.deadline = Clock::now() + time;
    connection.responding = responding;
    connection.exchange.swap(exchange);
}

void Connections::expectRequest(Connection& connection) {
    set(connection, request_, nullptr, false);
}

void Connections::expectResult(Connection& connection, std::shared_ptr<Exchange> exchange) {
    set(connection, request_, std::move(exchange), false);
}

void Connections::expectTaking(Connection& connection) {
    set(connection, response_, nullptr, true);
}

void Connections::endOverdue() {
    const Clock::time_point now = Clock::now();
    std::vector<std::shared_ptr<Exchange>> overdue;
    {
        const std::lock_guard lock(mutex_);
        for (Connection& connection : connections_) {
            if (connection.deadline > now) {
                continue;
            }
            if (connection.exchange) {
                overdue.push_back(connection.exchange);
            } else {
                // The thread that serves the connection sees its end, and closes it.
                // Should the client have gone already, nothing is left to do.
                static_cast<void>(::shutdown(connection.socket, SHUT_RDWR));
            }
        }
    }
    for (const auto& exchange : overdue) {
        exchange->finish(HttpResponse::failure(http::serviceUnavailable));
    }
}

void Connections::endAll() {
    std::vector<std::shared_ptr<Exchange>> open;
    {
        const std::lock_guard lock(mutex_);
        for (const Connection& connection : connections_) {
            if (connection.exchange) {
                open.push_back(connection.exchange);
            }
        }
    }
    for (const auto& exchange : open) {
        exchange->finish(HttpResponse::failure(http::serviceUnavailable));
    }
}

bool Connections::isBusy() const {
    const std::lock_guard lock(mutex_);
    return std::any_of(connections_.begin(), connections_.end(), [](const Connection& each) {
        return each.responding || each.exchange != nullptr;
    });
}

}  // namespace cimom::wbem
