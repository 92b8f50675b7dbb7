#pragma once

#include <condition_variable>
#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "Delivery.h"
#include "SubscriptionRecords.h"
#include "cimom/Indications.h"
#include "indications/SubscriptionSettings.h"
#include "zrcommon/UniqueFd.h"

namespace cimom::wbem {

/// The filters, destinations and subscriptions of a server: what may be done to them, where
/// they are kept, and the deliveries and active filters that follow from them. Safe for
/// concurrent use. Functions that change something throw RequestRefused.
class SubscriptionStore {
  public:
    /// Borrows the hub. `host` stands in the contexts of sequences.
    SubscriptionStore(IndicationHub& hub, std::string host, SubscriptionSettings settings,
                      SubscriptionLog log);
    ~SubscriptionStore();
    SubscriptionStore(const SubscriptionStore&) = delete;
    SubscriptionStore& operator=(const SubscriptionStore&) = delete;

    /// Activates what is enabled.
    void start();
    /// Ends deliveries and filters; nothing can be changed any more.
    void stop();

    [[nodiscard]] SubscriptionRecords records() const;
    [[nodiscard]] const SubscriptionSettings& settings() const noexcept { return settings_; }

    /// Records without creator, id and times, which they get here.
    void create(FilterRecord filter, const std::string& user);
    void create(DestinationRecord destination, const std::string& user);
    void create(SubscriptionRecord subscription, const std::string& user);

    /// What of a subscription can be changed.
    struct Change {
        std::optional<SubscriptionState> state;
        std::optional<std::optional<std::uint64_t>> duration;
        std::optional<std::string> info;
    };
    void change(const std::string& filter, const std::string& destination, const Change& change,
                const std::string& user);

    void removeFilter(const std::string& name, const std::string& user);
    void removeDestination(const std::string& name, const std::string& user);
    void removeSubscription(const std::string& filter, const std::string& destination,
                            const std::string& user);

  private:
    using Key = std::pair<std::string, std::string>;  ///< filter and destination

    [[nodiscard]] bool kept() const noexcept { return !settings_.directory.empty(); }
    void lockDirectory();
    void load();
    /// Makes the records those, on disk and here. Throws RequestRefused; then nothing changes.
    void replace(SubscriptionRecords records);
    void requireRunning() const;
    /// Whether the user may change what that one has made.
    void requireOwner(const std::string& creator, const std::string& user) const;
    /// Takes a record out that the user may remove and that is at the end of no subscription.
    template <typename Record>
    void takeOut(std::vector<Record>& records, const std::vector<SubscriptionRecord>& subscriptions,
                 std::string SubscriptionRecord::*end, const std::string& name,
                 const std::string& user, const char* inUse) const;

    /// Begins to send what the subscription selects.
    [[nodiscard]] Status activate(const SubscriptionRecord& subscription,
                                  const SubscriptionRecords& records);
    void deactivate(const Key& key);
    /// Ends the delivery to a destination that no active subscription names.
    void endIdleDelivery(const std::string& destination);
    std::shared_ptr<Delivery> deliveryTo(const DestinationRecord& destination);

    void maintain();
    void endExpired();
    void giveUp(std::uint64_t destinationId);
    [[nodiscard]] std::optional<Moment> nextEnd() const;

    IndicationHub& hub_;
    const std::string host_;
    const SubscriptionSettings settings_;
    const SubscriptionLog log_;
    const std::string serverStart_;  ///< in the contexts of sequences

    /// Held while something changes, which may take as long as providers take; then records_
    /// changes under recordsMutex_, too.
    std::mutex changes_;
    mutable std::mutex recordsMutex_;
    SubscriptionRecords records_;
    bool stopped_ = false;

    ZR::UniqueFd lock_;  ///< of the directory, which is this store's until it stops

    // Under changes_.
    std::map<Key, IndicationSubscription> active_;
    std::map<std::string, std::shared_ptr<Delivery>> deliveries_;

    // What the thread is to look after; it ends with the store.
    std::mutex tasksMutex_;
    std::condition_variable wake_;
    std::vector<std::uint64_t> failing_;  ///< ids of destinations
    bool look_ = false;
    bool ending_ = false;
    std::thread thread_;
};

}  // namespace cimom::wbem
