#include "operations/EnumerationSessions.h"

#include <sys/random.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <system_error>
#include <utility>

#include "cimxml/Errors.h"

namespace cimom::wbem {

namespace {

std::string randomContext() {
    std::array<unsigned char, 16> bytes{};
    if (::getrandom(bytes.data(), bytes.size(), 0) != static_cast<ssize_t>(bytes.size())) {
        throw std::system_error(errno, std::generic_category(), "getrandom");
    }
    static constexpr std::string_view digits = "0123456789abcdef";
    std::string text;
    for (const unsigned char byte : bytes) {
        text += digits[byte >> 4U];
        text += digits[byte & 0xFU];
    }
    return text;
}

}  // namespace

EnumerationSessions::EnumerationSessions(SessionLimits limits,
                                         std::function<Clock::time_point()> now)
    : limits_(limits), now_(std::move(now)) {}

std::chrono::seconds EnumerationSessions::timeoutFor(std::optional<std::uint32_t> wanted) const {
    if (!wanted) {
        return limits_.defaultTimeout;
    }
    const std::chrono::seconds timeout(*wanted);
    if (timeout.count() == 0 || timeout > limits_.longestTimeout) {
        throw CimError(CimStatus::invalidOperationTimeout,
                       "OperationTimeout may be 1 to " +
                           std::to_string(limits_.longestTimeout.count()) + " seconds");
    }
    return timeout;
}

std::string EnumerationSessions::open(EnumerationSession session) {
    const auto now = now_();
    const std::lock_guard lock(mutex_);
    expireLocked(now);
    if (entries_.size() >= limits_.sessions) {
        throw CimError(
            CimStatus::serverLimitsExceeded,
            "there are " + std::to_string(entries_.size()) + " open enumerations already");
    }
    const auto ofUser =
        std::count_if(entries_.begin(), entries_.end(), [&session](const auto& entry) {
            return session.user && entry.second.session.user == session.user;
        });
    const auto ofAddress = std::count_if(
        entries_.begin(), entries_.end(),
        [&session](const auto& entry) { return entry.second.session.address == session.address; });
    if (static_cast<std::size_t>(std::max(ofUser, ofAddress)) >= limits_.each) {
        throw CimError(CimStatus::serverLimitsExceeded,
                       "there are " + std::to_string(limits_.each) +
                           " open enumerations of the same " +
                           (ofUser >= ofAddress ? "user" : "address") + " already");
    }
    std::string context = randomContext();
    const auto end = now + session.timeout;
    entries_.emplace(context, Entry{std::move(session), end});
    return context;
}

void EnumerationSessions::use(const std::string& context, const std::optional<std::string>& user,
                              const std::function<void(EnumerationSession&)>& use) {
    const auto now = now_();
    const std::lock_guard lock(mutex_);
    expireLocked(now);
    const auto found = find(context, user);
    use(found->second.session);
    found->second.end = now + found->second.session.timeout;
    if (found->second.session.left == 0) {
        entries_.erase(found);
    }
}

void EnumerationSessions::close(const std::string& context,
                                const std::optional<std::string>& user) {
    const auto now = now_();
    const std::lock_guard lock(mutex_);
    expireLocked(now);
    entries_.erase(find(context, user));
}

void EnumerationSessions::expire() {
    const auto now = now_();
    const std::lock_guard lock(mutex_);
    expireLocked(now);
}

std::size_t EnumerationSessions::count() const {
    const std::lock_guard lock(mutex_);
    return entries_.size();
}

void EnumerationSessions::expireLocked(Clock::time_point now) {
    std::erase_if(entries_, [now](const auto& entry) { return entry.second.end <= now; });
}

EnumerationSessions::Entries::iterator EnumerationSessions::find(
    const std::string& context, const std::optional<std::string>& user) {
    const auto found = entries_.find(context);
    // The same error whether there is no such session or another user has it: a client
    // does not learn which contexts exist.
    if (found == entries_.end() || found->second.session.user != user) {
        throw CimError(CimStatus::invalidEnumerationContext,
                       "there is no such enumeration, or not any more");
    }
    return found;
}

}  // namespace cimom::wbem
