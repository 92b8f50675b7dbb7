#include "SubscriptionStore.h"

#include <fcntl.h>
#include <sys/file.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <random>
#include <system_error>
#include <utility>

#include "cimom/OwnClass.h"
#include "cimxml/ExportMessage.h"

namespace cimom::wbem {

namespace {

Moment now() {
    return std::chrono::duration_cast<std::chrono::microseconds>(
               std::chrono::system_clock::now().time_since_epoch())
        .count();
}

/// A text that no other start of a server has, on a machine without a clock of its own either.
std::string startText() {
    std::random_device random;
    std::array<char, 64> text{};
    static_cast<void>(std::snprintf(text.data(), text.size(), "%lld-%08x%08x",
                                    static_cast<long long>(now()), random(), random()));
    return text.data();
}

[[noreturn]] void refuse(CMPIrc code, const std::string& reason) {
    throw RequestRefused(code, reason);
}

template <typename Record>
auto findRecord(Record& records, const std::string& name) {
    return std::find_if(records.begin(), records.end(),
                        [&name](const auto& record) { return record.name == name; });
}

auto findSubscription(std::vector<SubscriptionRecord>& subscriptions, const std::string& filter,
                      const std::string& destination) {
    return std::find_if(subscriptions.begin(), subscriptions.end(),
                        [&](const SubscriptionRecord& each) {
                            return each.filter == filter && each.destination == destination;
                        });
}

template <typename Record>
void requireRoom(const std::vector<Record>& records, const std::string& user, std::size_t limit,
                 const char* what) {
    const auto count = std::count_if(records.begin(), records.end(), [&user](const Record& record) {
        return record.creator == user;
    });
    if (static_cast<std::size_t>(count) >= limit) {
        refuse(CMPI_RC_ERR_FAILED, "no more than " + std::to_string(limit) + ' ' + what +
                                       (user.empty() ? " are kept" : " are kept for a user"));
    }
}

/// When a subscription ends; none: it does not.
std::optional<Moment> endOf(const SubscriptionRecord& subscription) {
    constexpr std::uint64_t microseconds = 1000000;
    constexpr std::uint64_t longest = std::uint64_t{1}
                                      << 42U;  // seconds, of which a Moment has room
    if (!subscription.duration || *subscription.duration > longest) {
        return std::nullopt;
    }
    return subscription.started + static_cast<Moment>(*subscription.duration * microseconds);
}

std::string nameOf(const SubscriptionRecord& subscription) {
    return "subscription of filter \"" + subscription.filter + "\" for listener \"" +
           subscription.destination + '"';
}

}  // namespace

SubscriptionStore::SubscriptionStore(IndicationHub& hub, std::string host,
                                     SubscriptionSettings settings, SubscriptionLog log)
    : hub_(hub),
      host_(std::move(host)),
      settings_(std::move(settings)),
      log_(std::move(log)),
      serverStart_(startText()) {
    if (kept()) {
        std::filesystem::create_directories(settings_.directory);
        std::filesystem::permissions(settings_.directory, std::filesystem::perms::owner_all);
        lockDirectory();
        load();
    }
    thread_ = std::thread([this] { maintain(); });
}

SubscriptionStore::~SubscriptionStore() {
    stop();
}

void SubscriptionStore::lockDirectory() {
    const std::filesystem::path file = settings_.directory / "lock";
    lock_.reset(::open(file.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600));
    if (!lock_) {
        throw std::system_error(errno, std::generic_category(), file.string());
    }
    if (::flock(lock_.get(), LOCK_EX | LOCK_NB) != 0) {
        throw std::system_error(errno, std::generic_category(),
                                settings_.directory.string() + " belongs to another server");
    }
}

void SubscriptionStore::load() {
    const std::filesystem::path file = settings_.directory / "subscriptions.json";
    try {
        records_ = readRecords(file).value_or(SubscriptionRecords{});
    } catch (const std::runtime_error& error) {
        std::filesystem::path aside = file;
        aside += ".bad";
        std::error_code failed;
        std::filesystem::rename(file, aside, failed);
        log_(file.string() + ": " + error.what() +
             "; the server begins without subscriptions, it is kept as " + aside.string());
    }
}

void SubscriptionStore::start() {
    const std::lock_guard changes(changes_);
    for (const SubscriptionRecord& subscription : records_.subscriptions) {
        if (subscription.state != SubscriptionState::enabled) {
            continue;
        }
        if (const Status status = activate(subscription, records_); !status.ok()) {
            log_(nameOf(subscription) + " cannot be taken up again: " +
                 std::string(statusName(status.code)) + ' ' + status.message);
        }
    }
}

void SubscriptionStore::stop() {
    {
        const std::lock_guard lock(tasksMutex_);
        ending_ = true;
    }
    wake_.notify_all();
    if (thread_.joinable()) {
        thread_.join();
    }
    const std::lock_guard changes(changes_);
    stopped_ = true;
    for (auto& [key, subscription] : active_) {
        subscription.end();
    }
    active_.clear();
    for (const auto& [name, delivery] : deliveries_) {
        delivery->stop();
    }
    deliveries_.clear();
    lock_.reset();
}

SubscriptionRecords SubscriptionStore::records() const {
    const std::lock_guard lock(recordsMutex_);
    return records_;
}

void SubscriptionStore::replace(SubscriptionRecords records) {
    try {
        if (kept()) {
            writeRecords(settings_.directory / "subscriptions.json", records);
        }
    } catch (const std::system_error& error) {
        log_(error.what());
        refuse(CMPI_RC_ERR_FAILED, "the server cannot keep it");
    }
    {
        const std::lock_guard lock(recordsMutex_);
        records_ = std::move(records);
    }
    {
        const std::lock_guard lock(tasksMutex_);
        look_ = true;
    }
    wake_.notify_all();
}

void SubscriptionStore::requireRunning() const {
    if (stopped_) {
        refuse(CMPI_RC_ERR_FAILED, "the server ends");
    }
}

void SubscriptionStore::requireOwner(const std::string& creator, const std::string& user) const {
    const bool orphan = creator.empty() || !settings_.isUser || !settings_.isUser(creator);
    if (creator != user && !orphan) {
        refuse(CMPI_RC_ERR_ACCESS_DENIED, "only the user who created it may change or delete it");
    }
}

void SubscriptionStore::create(FilterRecord filter, const std::string& user) {
    const std::lock_guard changes(changes_);
    requireRunning();
    SubscriptionRecords changed = records_;
    if (findRecord(changed.filters, filter.name) != changed.filters.end()) {
        refuse(CMPI_RC_ERR_ALREADY_EXISTS, "there is a filter of that name");
    }
    requireRoom(changed.filters, user, settings_.limits.filters, "filters");
    filter.creator = user;
    changed.filters.push_back(std::move(filter));
    replace(std::move(changed));
}

void SubscriptionStore::create(DestinationRecord destination, const std::string& user) {
    const std::lock_guard changes(changes_);
    requireRunning();
    SubscriptionRecords changed = records_;
    if (findRecord(changed.destinations, destination.name) != changed.destinations.end()) {
        refuse(CMPI_RC_ERR_ALREADY_EXISTS, "there is a destination of that name");
    }
    requireRoom(changed.destinations, user, settings_.limits.listeners, "destinations");
    if (changed.destinations.size() >= settings_.limits.allListeners) {
        refuse(CMPI_RC_ERR_FAILED, "no more than " + std::to_string(settings_.limits.allListeners) +
                                       " destinations are kept");
    }
    destination.creator = user;
    destination.id = changed.nextId++;
    destination.created = now();
    changed.destinations.push_back(std::move(destination));
    replace(std::move(changed));
}

void SubscriptionStore::create(SubscriptionRecord subscription, const std::string& user) {
    const std::lock_guard changes(changes_);
    requireRunning();
    SubscriptionRecords changed = records_;
    if (findRecord(changed.filters, subscription.filter) == changed.filters.end()) {
        refuse(CMPI_RC_ERR_NOT_FOUND, "there is no such filter");
    }
    if (findRecord(changed.destinations, subscription.destination) == changed.destinations.end()) {
        refuse(CMPI_RC_ERR_NOT_FOUND, "there is no such destination");
    }
    if (findSubscription(changed.subscriptions, subscription.filter, subscription.destination) !=
        changed.subscriptions.end()) {
        refuse(CMPI_RC_ERR_ALREADY_EXISTS, "the filter is subscribed to for that destination");
    }
    requireRoom(changed.subscriptions, user, settings_.limits.subscriptions, "subscriptions");
    subscription.creator = user;
    subscription.started = now();
    subscription.stateChanged = subscription.started;
    changed.subscriptions.push_back(subscription);
    if (subscription.state == SubscriptionState::enabled) {
        if (const Status status = activate(subscription, changed); !status.ok()) {
            refuse(status.code, status.message);
        }
    }
    try {
        replace(std::move(changed));
    } catch (const RequestRefused&) {
        deactivate({subscription.filter, subscription.destination});
        throw;
    }
}

void SubscriptionStore::change(const std::string& filter, const std::string& destination,
                               const Change& change, const std::string& user) {
    const std::lock_guard changes(changes_);
    requireRunning();
    SubscriptionRecords changed = records_;
    const auto found = findSubscription(changed.subscriptions, filter, destination);
    if (found == changed.subscriptions.end()) {
        refuse(CMPI_RC_ERR_NOT_FOUND, "");
    }
    requireOwner(found->creator, user);
    if (change.duration) {
        found->duration = *change.duration;
        found->started = now();
    }
    if (change.info) {
        found->info = *change.info;
    }
    const bool switched = change.state && *change.state != found->state;
    if (switched) {
        found->state = *change.state;
        found->stateChanged = now();
    }
    const SubscriptionRecord after = *found;
    const bool begins = switched && after.state == SubscriptionState::enabled;
    if (begins) {
        if (const Status status = activate(after, changed); !status.ok()) {
            refuse(status.code, status.message);
        }
    }
    try {
        replace(std::move(changed));
    } catch (const RequestRefused&) {
        if (begins) {
            deactivate({filter, destination});
        }
        throw;
    }
    if (switched && !begins) {
        deactivate({filter, destination});
    }
}

template <typename Record>
void SubscriptionStore::takeOut(std::vector<Record>& records,
                                const std::vector<SubscriptionRecord>& subscriptions,
                                std::string SubscriptionRecord::*end, const std::string& name,
                                const std::string& user, const char* inUse) const {
    const auto found = findRecord(records, name);
    if (found == records.end()) {
        refuse(CMPI_RC_ERR_NOT_FOUND, "");
    }
    requireOwner(found->creator, user);
    if (std::any_of(subscriptions.begin(), subscriptions.end(),
                    [&](const SubscriptionRecord& each) { return each.*end == name; })) {
        refuse(CMPI_RC_ERR_FAILED, inUse);
    }
    records.erase(found);
}

void SubscriptionStore::removeFilter(const std::string& name, const std::string& user) {
    const std::lock_guard changes(changes_);
    requireRunning();
    SubscriptionRecords changed = records_;
    takeOut(changed.filters, changed.subscriptions, &SubscriptionRecord::filter, name, user,
            "the filter is subscribed to");
    replace(std::move(changed));
}

void SubscriptionStore::removeDestination(const std::string& name, const std::string& user) {
    const std::lock_guard changes(changes_);
    requireRunning();
    SubscriptionRecords changed = records_;
    takeOut(changed.destinations, changed.subscriptions, &SubscriptionRecord::destination, name,
            user, "the destination is subscribed for");
    replace(std::move(changed));
}

void SubscriptionStore::removeSubscription(const std::string& filter,
                                           const std::string& destination,
                                           const std::string& user) {
    const std::lock_guard changes(changes_);
    requireRunning();
    SubscriptionRecords changed = records_;
    const auto found = findSubscription(changed.subscriptions, filter, destination);
    if (found == changed.subscriptions.end()) {
        refuse(CMPI_RC_ERR_NOT_FOUND, "");
    }
    requireOwner(found->creator, user);
    changed.subscriptions.erase(found);
    replace(std::move(changed));
    deactivate({filter, destination});
}

Status SubscriptionStore::activate(const SubscriptionRecord& subscription,
                                   const SubscriptionRecords& records) {
    const auto filter = findRecord(records.filters, subscription.filter);
    const auto destination = findRecord(records.destinations, subscription.destination);
    IndicationFilter wanted;
    wanted.query = filter->query;
    wanted.queryLanguage = filter->language;
    wanted.sourceNameSpaces = filter->sourceNameSpaces;
    wanted.owner = subscription.creator;
    auto activation = hub_.activate(
        wanted, [delivery = deliveryTo(*destination), name = filter->name](const Indication& got) {
            delivery->add(indicationText(got.instance, name));
        });
    if (activation.status.ok()) {
        active_[{subscription.filter, subscription.destination}] =
            std::move(activation.subscription);
    } else {
        endIdleDelivery(subscription.destination);
    }
    return activation.status;
}

void SubscriptionStore::deactivate(const Key& key) {
    active_.erase(key);
    endIdleDelivery(key.second);
}

void SubscriptionStore::endIdleDelivery(const std::string& destination) {
    const auto delivery = deliveries_.find(destination);
    if (delivery != deliveries_.end() &&
        std::none_of(active_.begin(), active_.end(),
                     [&](const auto& each) { return each.first.second == destination; })) {
        delivery->second->discard();
        deliveries_.erase(delivery);
    }
}

std::shared_ptr<Delivery> SubscriptionStore::deliveryTo(const DestinationRecord& destination) {
    std::shared_ptr<Delivery>& delivery = deliveries_[destination.name];
    if (!delivery) {
        const std::string id = std::to_string(destination.id);
        delivery = std::make_shared<Delivery>(
            Delivery::Listener{
                destination.name, readHttpUrl(destination.url),
                host_ + '#' + serverStart_ + '#' + id + '-' + std::to_string(destination.created),
                kept() ? settings_.directory / ("queue-" + id) : std::filesystem::path()},
            settings_.delivery, log_, [this, number = destination.id] {
                {
                    const std::lock_guard lock(tasksMutex_);
                    failing_.push_back(number);
                }
                wake_.notify_all();
            });
    }
    return delivery;
}

std::optional<Moment> SubscriptionStore::nextEnd() const {
    std::optional<Moment> next;
    for (const SubscriptionRecord& subscription : records().subscriptions) {
        if (const auto end = endOf(subscription); end && (!next || *end < *next)) {
            next = end;
        }
    }
    return next;
}

/// Ends what has lasted long enough, and what belongs to listeners that have been given up.
void SubscriptionStore::maintain() {
    std::unique_lock lock(tasksMutex_);
    while (!ending_) {
        look_ = false;
        const std::vector<std::uint64_t> failing = std::exchange(failing_, {});
        lock.unlock();
        for (const std::uint64_t destination : failing) {
            giveUp(destination);
        }
        endExpired();
        const auto end = nextEnd();
        lock.lock();
        const auto wanted = [this] { return ending_ || look_ || !failing_.empty(); };
        if (end) {
            // The clock may be set meanwhile: the end is looked at again now and then.
            constexpr std::chrono::microseconds longest(std::chrono::minutes(1));
            constexpr std::chrono::microseconds shortest(std::chrono::milliseconds(100));
            const std::chrono::microseconds left(*end - now());
            wake_.wait_for(lock, std::clamp(left, shortest, longest), wanted);
        } else {
            wake_.wait(lock, wanted);
        }
    }
}

void SubscriptionStore::endExpired() {
    const std::lock_guard changes(changes_);
    SubscriptionRecords changed = records_;
    std::vector<Key> ended;
    std::erase_if(changed.subscriptions, [&ended, moment = now()](const SubscriptionRecord& each) {
        const auto end = endOf(each);
        if (!end || *end > moment) {
            return false;
        }
        ended.emplace_back(each.filter, each.destination);
        return true;
    });
    if (ended.empty()) {
        return;
    }
    try {
        replace(std::move(changed));
    } catch (const RequestRefused&) {
        return;  // it is in the log; the next look tries again
    }
    for (const Key& key : ended) {
        deactivate(key);
    }
}

void SubscriptionStore::giveUp(std::uint64_t destinationId) {
    const std::lock_guard changes(changes_);
    SubscriptionRecords changed = records_;
    const auto destination =
        std::find_if(changed.destinations.begin(), changed.destinations.end(),
                     [destinationId](const auto& each) { return each.id == destinationId; });
    if (destination == changed.destinations.end()) {
        return;
    }
    const std::string name = destination->name;
    const bool transient = destination->persistence == Persistence::transient;
    std::vector<Key> ended;
    std::erase_if(changed.subscriptions, [&](SubscriptionRecord& each) {
        if (each.destination != name) {
            return false;
        }
        const bool removed = transient || each.policy == ErrorPolicy::remove;
        const bool disabled =
            each.policy == ErrorPolicy::disable && each.state == SubscriptionState::enabled;
        if (removed || disabled) {
            log_("listener \"" + name + "\" has been silent for too long: the " + nameOf(each) +
                 (removed ? " is removed" : " is disabled"));
            ended.emplace_back(each.filter, each.destination);
        }
        if (disabled) {
            each.state = SubscriptionState::disabled;
            each.stateChanged = now();
        }
        return removed;
    });
    if (transient) {
        changed.destinations.erase(destination);
    }
    if (changed == records_) {
        return;
    }
    try {
        replace(std::move(changed));
    } catch (const RequestRefused&) {
        return;  // it is in the log; the listener fails again
    }
    for (const Key& key : ended) {
        deactivate(key);
    }
}

}  // namespace cimom::wbem
