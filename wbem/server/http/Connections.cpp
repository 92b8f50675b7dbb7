#include "http/Connections.h"

#include <poll.h>
#include <sys/ioctl.h>
#include <sys/socket.h>

#include <algorithm>
#include <map>
#include <utility>
#include <vector>

namespace cimom::wbem {

namespace {

/// Longer than a thread takes from the last byte of a request to expectResult(): a client may
/// close its side behind its request.
constexpr std::chrono::milliseconds patienceWhenAlone{300};
/// The same while there are bytes to read: the thread may be busy.
constexpr std::chrono::seconds patienceWithBytes{2};

bool isIdle(const Connections::Connection& connection) {
    return connection.exchange == nullptr && !connection.responding && !connection.ending;
}

}  // namespace

bool Connections::admit(int socket, const AddressKey& key, std::string address) {
    const std::lock_guard lock(mutex_);
    // Were it still here, the number would be free again: the connection would have ended before
    // its thread had taken it.
    forgetLocked(socket);
    if (!shares_.addConnection(key)) {
        ++turnedAway_;
        return false;
    }
    const std::size_t open = connections_.size() - ending_;
    const std::size_t most =
        limits_.connections - (shares_.isKnown(key) ? 0 : limits_.connections / 4);
    if (open >= most && !makeRoomLocked(key)) {
        shares_.removeConnection(key);
        ++turnedAway_;
        return false;
    }
    const auto now = Clock::now();
    connections_.emplace(socket, Connection{socket, key, std::move(address),
                                            now + std::min(limits_.head, limits_.request), now,
                                            Clock::time_point(), nullptr, false, false});
    return true;
}

bool Connections::makeRoomLocked(const AddressKey& key) {
    if (ending_ >= mostEnding) {
        return false;
    }
    struct Idle {
        std::size_t open = 0;
        Connection* oldest = nullptr;
    };
    std::map<AddressKey, Idle> addresses;
    Idle* most = nullptr;
    for (auto& [socket, connection] : connections_) {
        Idle& idle = addresses[connection.key];
        idle.open += connection.ending ? 0 : 1;
        if (isIdle(connection) &&
            (idle.oldest == nullptr || connection.since < idle.oldest->since)) {
            idle.oldest = &connection;
        }
        if (idle.oldest != nullptr && (most == nullptr || idle.open > most->open)) {
            most = &idle;
        }
    }
    // With fewer, two addresses would take connections from each other again and again.
    if (most == nullptr || most->open < addresses[key].open + 2) {
        return false;
    }
    endLocked(*most->oldest);
    ++turnedAway_;
    return true;
}

Connections::Connection* Connections::find(int socket) {
    const std::lock_guard lock(mutex_);
    const auto found = connections_.find(socket);
    return found == connections_.end() ? nullptr : &found->second;
}

void Connections::closed(int socket) {
    const std::lock_guard lock(mutex_);
    forgetLocked(socket);
}

void Connections::forgetLocked(int socket) {
    const auto found = connections_.find(socket);
    if (found == connections_.end()) {
        return;
    }
    if (found->second.ending) {
        --ending_;
    }
    shares_.removeConnection(found->second.key);
    connections_.erase(found);
}

void Connections::set(Connection& connection, std::chrono::seconds time,
                      std::shared_ptr<Exchange> exchange, bool responding) {
    const std::lock_guard lock(mutex_);
    connection.since = Clock::now();
    connection.deadline = connection.since + time;
    connection.alone = Clock::time_point();
    connection.responding = responding;
    connection.exchange.swap(exchange);
}

void Connections::expectRequest(Connection& connection) {
    set(connection, limits_.request, nullptr, false);
}

void Connections::expectResult(Connection& connection, std::shared_ptr<Exchange> exchange) {
    set(connection, limits_.request, std::move(exchange), false);
}

void Connections::expectTaking(Connection& connection) {
    set(connection, limits_.response, nullptr, true);
}

void Connections::endLocked(Connection& connection) {
    if (!connection.ending) {
        connection.ending = true;
        ++ending_;
    }
    // The thread that serves the connection sees its end, and closes it. Should the client have
    // gone already, nothing is left to do.
    static_cast<void>(::shutdown(connection.socket, SHUT_RDWR));
}

void Connections::endAbandonedLocked(Clock::time_point now) {
    // libmicrohttpd asks epoll for changes alone, and misses the end of a connection that comes
    // together with the last bytes: the connection would count until its deadline.
    std::vector<pollfd> sockets;
    for (const auto& [socket, connection] : connections_) {
        if (isIdle(connection)) {
            sockets.push_back({socket, POLLRDHUP, 0});
        }
    }
    if (::poll(sockets.data(), sockets.size(), 0) <= 0) {
        return;
    }
    for (const pollfd& each : sockets) {
        Connection& connection = connections_.at(each.fd);
        if (each.revents == 0) {
            connection.alone = Clock::time_point();
        } else if (connection.alone == Clock::time_point()) {
            connection.alone = now;
        } else {
            int bytes = 0;
            const bool hasBytes = ::ioctl(each.fd, FIONREAD, &bytes) == 0 && bytes > 0;
            if (now - connection.alone > (hasBytes ? patienceWithBytes : patienceWhenAlone)) {
                endLocked(connection);
            }
        }
    }
}

void Connections::endOverdue() {
    const Clock::time_point now = Clock::now();
    std::vector<std::shared_ptr<Exchange>> overdue;
    {
        const std::lock_guard lock(mutex_);
        for (auto& [socket, connection] : connections_) {
            if (connection.deadline > now) {
                continue;
            }
            if (connection.exchange) {
                overdue.push_back(connection.exchange);
            } else {
                endLocked(connection);
            }
        }
        endAbandonedLocked(now);
    }
    for (const auto& exchange : overdue) {
        exchange->finish(HttpResponse::failure(http::serviceUnavailable));
    }
}

void Connections::endAll() {
    std::vector<std::shared_ptr<Exchange>> open;
    {
        const std::lock_guard lock(mutex_);
        for (const auto& [socket, connection] : connections_) {
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
    return std::any_of(connections_.begin(), connections_.end(), [](const auto& each) {
        return each.second.responding || each.second.exchange != nullptr;
    });
}

std::uint64_t Connections::takeTurnedAway() {
    const std::lock_guard lock(mutex_);
    return std::exchange(turnedAway_, 0);
}

}  // namespace cimom::wbem
