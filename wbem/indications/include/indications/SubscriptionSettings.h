#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <functional>
#include <optional>
#include <string>

namespace cimom::wbem {

/// How indications are handed over to listeners.
struct DeliverySettings {
    unsigned retries = 3;  ///< after the first attempt
    std::chrono::milliseconds retryInterval{30000};
    std::chrono::milliseconds patience{10000};  ///< for a listener to respond
    std::size_t queued = 1000;                  ///< indications that wait for one listener
    std::size_t queuedBytes = 4U << 20U;        ///< of their texts together
    /// How long a listener may fail without a success in between before it is given up.
    std::chrono::milliseconds removalTime{std::chrono::hours(24)};
    /// A PEM file of who vouches for listeners; none: the system's.
    std::optional<std::string> caCertificates;

    bool operator==(const DeliverySettings&) const = default;
};

/// What a client may leave at the server.
struct SubscriptionLimits {
    std::size_t filters = 64;        ///< of one user
    std::size_t listeners = 16;      ///< of one user
    std::size_t subscriptions = 64;  ///< of one user
    std::size_t allListeners = 64;   ///< of all users; each that is subscribed for has a thread

    bool operator==(const SubscriptionLimits&) const = default;
};

struct SubscriptionSettings {
    /// Where subscriptions and what waits for delivery are kept. It is made if need be, and
    /// belongs to one server alone. Empty: they end with the server.
    std::filesystem::path directory;
    DeliverySettings delivery;
    SubscriptionLimits limits;
    /// Whether it is a user of the server, so that what users leave behind who are none any
    /// more can be removed by the others. Empty: there are no users.
    std::function<bool(const std::string& name)> isUser;
};

/// Gets a line for the administrator. Called from many threads; must not throw.
using SubscriptionLog = std::function<void(const std::string& line)>;

}  // namespace cimom::wbem
