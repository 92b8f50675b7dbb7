#pragma once

#include <cstddef>
#include <memory>

#include "cimom/Forward.h"
#include "indications/SubscriptionSettings.h"

namespace cimom::wbem {

class SubscriptionStore;

/// What clients want to be told of, and who tells them: filters, listener destinations and
/// subscriptions as classes of the object manager in root/interop, kept over restarts, and
/// the indications that go to the listeners of the subscriptions.
class Subscriptions {
  public:
    /// Serves the classes from now on, and goes on with the subscriptions that are kept. To be
    /// made before the manager carries requests out. Borrows manager and hub; what stays
    /// behind in the classes of the manager does no harm. A file of subscriptions that cannot be
    /// read is told to the log and kept aside; throws std::system_error when the directory cannot
    /// be used.
    Subscriptions(ObjectManager& manager, IndicationHub& hub, SubscriptionSettings settings,
                  SubscriptionLog log);
    /// Ends deliveries; what waits is kept for the next start. Requests about the classes are
    /// refused from then on.
    ~Subscriptions();
    Subscriptions(const Subscriptions&) = delete;
    Subscriptions& operator=(const Subscriptions&) = delete;

    /// How many subscriptions there are.
    [[nodiscard]] std::size_t count() const;

  private:
    std::shared_ptr<SubscriptionStore> store_;
};

}  // namespace cimom::wbem
