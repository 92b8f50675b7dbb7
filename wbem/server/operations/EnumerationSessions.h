#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <unordered_map>

#include "operations/Spool.h"
#include "wbem/Limits.h"

namespace cimom::wbem {

/// The rest of a result that a client pulls in portions (DSP0200, 5.4.2).
struct EnumerationSession {
    enum class Kind { paths, instances };

    Kind kind = Kind::paths;
    std::shared_ptr<const Spool> records;  ///< all objects, as PulledRecords has them
    std::size_t position = 0;              ///< of the next one
    std::size_t left = 0;                  ///< objects that are still to come
    std::chrono::seconds timeout{0};       ///< of silence, after which it is forgotten
    std::optional<std::string> user;       ///< who opened it; no other user may go on
    std::string address;                   ///< from where it was opened
};

/// The open enumeration sessions of a server, by the contexts that clients hold.
/// Contexts are random numbers of 128 bits, which cannot be guessed. Sessions that
/// were silent for too long are forgotten. Safe for concurrent use.
class EnumerationSessions {
  public:
    using Clock = std::chrono::steady_clock;
    /// `now` is what tells the time.
    explicit EnumerationSessions(SessionLimits limits,
                                 std::function<Clock::time_point()> now = Clock::now);

    /// The time-out for what a client asks for. Throws CimError with
    /// invalidOperationTimeout for 0, which would be for ever, and for too long a one.
    [[nodiscard]] std::chrono::seconds timeoutFor(std::optional<std::uint32_t> wanted) const;

    /// Keeps a session, and gives its context. Throws CimError with
    /// serverLimitsExceeded when there are too many, of all clients or of the same user or
    /// address.
    [[nodiscard]] std::string open(EnumerationSession session);

    /// Runs `use` on the session of the context, whose silence begins anew; forgets
    /// it when nothing is left in it. Throws CimError with invalidEnumerationContext
    /// when the user has no such session. Sessions wait for each other meanwhile.
    void use(const std::string& context, const std::optional<std::string>& user,
             const std::function<void(EnumerationSession&)>& use);

    void close(const std::string& context, const std::optional<std::string>& user);

    /// Forgets what has been silent for too long.
    void expire();
    [[nodiscard]] std::size_t count() const;

  private:
    struct Entry {
        EnumerationSession session;
        Clock::time_point end;
    };
    using Entries = std::unordered_map<std::string, Entry>;

    void expireLocked(Clock::time_point now);
    Entries::iterator find(const std::string& context, const std::optional<std::string>& user);

    const SessionLimits limits_;
    const std::function<Clock::time_point()> now_;
    mutable std::mutex mutex_;
    Entries entries_;
};

}  // namespace cimom::wbem
