#pragma once

#include <cstdint>
#include <filesystem>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

/// What clients have left at the server, as plain facts, and the file in which it stays.
namespace cimom::wbem {

/// Microseconds since 1970-01-01 UTC.
using Moment = std::int64_t;

struct FilterRecord {
    std::string name;
    std::string creator;  ///< empty: no user was known
    std::string query;
    std::string language;
    std::vector<std::string> sourceNameSpaces;
    std::string elementName;  ///< may be empty

    bool operator==(const FilterRecord&) const = default;
};

enum class Persistence : std::uint16_t { permanent = 2, transient = 3 };

struct DestinationRecord {
    std::uint64_t id = 0;  ///< of no other destination before or after it
    std::string name;
    std::string creator;
    std::string url;
    Persistence persistence = Persistence::permanent;
    std::string elementName;
    Moment created = 0;

    bool operator==(const DestinationRecord&) const = default;
};

enum class ErrorPolicy : std::uint16_t { ignore = 2, disable = 3, remove = 4 };
enum class SubscriptionState : std::uint16_t { enabled = 2, disabled = 4 };

struct SubscriptionRecord {
    std::string filter;       ///< its name
    std::string destination;  ///< its name
    std::string creator;
    ErrorPolicy policy = ErrorPolicy::ignore;
    SubscriptionState state = SubscriptionState::enabled;
    std::optional<std::uint64_t> duration;  ///< seconds from the start
    std::string info;
    Moment started = 0;
    Moment stateChanged = 0;

    bool operator==(const SubscriptionRecord&) const = default;
};

struct SubscriptionRecords {
    std::uint64_t nextId = 1;
    std::vector<FilterRecord> filters;
    std::vector<DestinationRecord> destinations;
    std::vector<SubscriptionRecord> subscriptions;

    bool operator==(const SubscriptionRecords&) const = default;
};

[[nodiscard]] std::string toJson(const SubscriptionRecords& records);
/// Throws std::runtime_error for a text that is not such records, and for records that do
/// not fit each other.
[[nodiscard]] SubscriptionRecords subscriptionRecords(std::string_view text);

/// Replaces the file at once, so that it is never seen half written. Throws
/// std::system_error.
void writeRecords(const std::filesystem::path& file, const SubscriptionRecords& records);
/// Nothing when there is no file. Throws std::runtime_error, also for one that others than
/// its owner could have written.
[[nodiscard]] std::optional<SubscriptionRecords> readRecords(const std::filesystem::path& file);

}  // namespace cimom::wbem
