#include "indications/Subscriptions.h"

#include <utility>

#include "SubscriptionClasses.h"
#include "SubscriptionStore.h"
#include "cimom/ObjectManager.h"
#include "cimom/OwnClass.h"

namespace cimom::wbem {

Subscriptions::Subscriptions(ObjectManager& manager, IndicationHub& hub,
                             SubscriptionSettings settings, SubscriptionLog log)
    : store_(std::make_shared<SubscriptionStore>(hub, manager.host(), std::move(settings),
                                                 std::move(log))) {
    for (auto& own : subscriptionClasses(store_, manager)) {
        manager.serve(std::move(own));
    }
    store_->start();
}

std::size_t Subscriptions::count() const {
    return store_->records().subscriptions.size();
}

Subscriptions::~Subscriptions() {
    store_->stop();
}

}  // namespace cimom::wbem
