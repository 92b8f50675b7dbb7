#pragma once

#include <memory>
#include <string>
#include <vector>

#include "SubscriptionStore.h"
#include "cimom/Forward.h"

namespace cimom::wbem {

/// The classes in which clients see the store: CIM_IndicationFilter,
/// CIM_ListenerDestinationCIMXML, CIM_IndicationSubscription, CIM_IndicationService with its
/// capabilities, and what ties these to each other.
[[nodiscard]] std::vector<std::unique_ptr<OwnClass>> subscriptionClasses(
    const std::shared_ptr<SubscriptionStore>& store, const ObjectManager& manager);

}  // namespace cimom::wbem
