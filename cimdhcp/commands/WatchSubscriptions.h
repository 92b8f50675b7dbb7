#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "client/RemoteClient.h"
#include "client/ServerUrl.h"
#include "listener/Listener.h"

namespace cimdhcp {

/// The name of what a run of this program leaves at servers: host, user and process, so that
/// a later run of the same user on the same machine knows whose process has ended.
class WatchName {
  public:
    /// Of this process.
    WatchName();
    WatchName(std::string host, std::string user, std::uint64_t process, std::uint64_t start);

    [[nodiscard]] const std::string& text() const noexcept { return text_; }
    /// Whether the name of a filter or destination begins with that of a process of the same
    /// user and host that runs no more, or with this one. `isRunning` tells whether a process that
    /// started at that moment (clock ticks since the boot) is there.
    [[nodiscard]] bool mayRemove(
        std::string_view name,
        const std::function<bool(std::uint64_t process, std::uint64_t start)>& isRunning) const;

  private:
    std::string prefix_;
    std::string text_;
};

/// Listens for what servers tell of changes. Safe for concurrent use.
class WatchSubscriptions {
  public:
    /// Where to listen: an address of this machine; none: the one that a server is reached
    /// from. `changed` is called with the number of a server, in threads of listeners.
    WatchSubscriptions(std::optional<std::string> address, std::size_t servers,
                       std::function<void(std::size_t)> changed);

    /// Removes what earlier runs have left at a server, and subscribes, unless that has been
    /// done. Throws Failure.
    void subscribe(std::size_t server, const ServerUrl& url, RemoteClient& client);
    /// Removes what subscribe() has left. Throws Failure.
    void unsubscribe(std::size_t server, RemoteClient& client);
    /// Whether there may be something to remove.
    [[nodiscard]] bool hasLeft(std::size_t server) const;

  private:
    enum class State : std::uint8_t { nothing, begun, complete };

    /// The URL where a server tells of changes.
    std::string destinationOf(std::size_t server, const ServerUrl& url);
    void set(std::size_t server, State state);

    const std::optional<std::string> address_;
    const std::function<void(std::size_t)> changed_;
    const WatchName name_;
    const std::string secret_;  ///< of the URLs, so that no stranger wakes this program
    mutable std::mutex mutex_;
    std::vector<State> states_;
    std::map<std::string, std::unique_ptr<cimom::wbem::Listener>> listeners_;  ///< by address
};

}  // namespace cimdhcp
