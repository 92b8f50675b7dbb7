#pragma once

#include <array>
#include <atomic>
#include <chrono>
#include <cstdint>
#include <functional>
#include <map>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "wbem/Users.h"

namespace cimom::wbem {

/// A user whose password was right.
struct Identity {
    std::string name;
    Role role = Role::read;

    bool operator==(const Identity&) const = default;
};

/// Checks the credentials of requests (RFC 7617). Safe for concurrent use.
///
/// A check takes as long as yescrypt does. What was right is remembered for a
/// minute by a keyed digest, never by the password itself.
class Authenticator {
  public:
    using Clock = std::chrono::steady_clock;
    explicit Authenticator(std::vector<User> users,
                           std::function<Clock::time_point()> now = Clock::now);

    /// Knows other users from now on, and forgets what was right.
    void renew(std::vector<User> users);

    /// The identity of credentials that were right a short time ago. Quick.
    [[nodiscard]] std::optional<Identity> remembered(std::string_view authorization);

    /// The identity that an Authorization header proves; none when it proves none.
    /// Takes equally long for known and unknown users.
    [[nodiscard]] std::optional<Identity> check(std::string_view authorization);

    /// For the log: the user whom a header names, or "an unknown user": what stands
    /// there may be a password in the wrong field.
    [[nodiscard]] std::string claimedUser(std::string_view authorization) const;

    /// How many requests were refused so far, this one included.
    std::uint64_t countRefusal() noexcept { return ++refusals_; }

  private:
    using Digest = std::array<unsigned char, 32>;
    struct Memory {
        Identity identity;
        Clock::time_point end;
    };

    [[nodiscard]] Digest digest(std::string_view authorization) const;
    [[nodiscard]] std::optional<User> find(std::string_view name) const;

    const std::function<Clock::time_point()> now_;
    std::array<unsigned char, 32> key_{};
    std::string dummyHash_;  ///< what passwords of unknown users are compared with
    mutable std::mutex mutex_;
    std::vector<User> users_;
    std::map<Digest, Memory> memory_;
    std::atomic<std::uint64_t> refusals_{0};
};

}  // namespace cimom::wbem
