#include "broker/Broker.h"

#include <algorithm>
#include <chrono>
#include <thread>

#include "broker/BrokerTables.h"
#include "broker/RequestScope.h"
#include "broker/objects/BrokerRecords.h"

namespace cimom::broker {

Broker::Broker(const ClassRepository& classes, RequestHandler* handler,
               IndicationSink* sink) noexcept
    : classes_(&classes),
      handler_(handler),
      sink_(sink),
      record_{this, &brokerTable, &encapsulationTable, &threadTable, &memoryTable} {}

Broker::~Broker() = default;

Broker* Broker::of(const CMPIBroker* record) noexcept {
    return record != nullptr && record->bft == &brokerTable ? static_cast<Broker*>(record->hdl)
                                                            : nullptr;
}

void Broker::Released::operator()(CMPIContext* context) const noexcept {
    context->ft->release(context);
}

CMPIContext* Broker::prepareThread(const CMPIContext* context) {
    const ContextRecord* const record = contextOf(context);
    if (record == nullptr) {
        return nullptr;
    }
    std::unique_ptr<CMPIContext, Released> copy(record->ft->clone(record, nullptr));
    if (!copy) {
        return nullptr;
    }
    CMPIContext* const prepared = copy.get();
    const std::lock_guard lock(mutex_);
    prepared_.emplace(prepared, Prepared{std::move(copy), record->depth, 0});
    return prepared;
}

CMPIrc Broker::attachThread(const CMPIContext* context) {
    const std::lock_guard lock(mutex_);
    const auto found = prepared_.find(context);
    if (found == prepared_.end()) {
        return CMPI_RC_ERR_INVALID_HANDLE;
    }
    if (!RequestScope::attachThread(found->second.depth)) {
        return CMPI_RC_ERR_FAILED;
    }
    ++found->second.threads;
    return CMPI_RC_OK;
}

CMPIrc Broker::detachThread(const CMPIContext* context) {
    const std::lock_guard lock(mutex_);
    const auto found = prepared_.find(context);
    if (found == prepared_.end()) {
        return CMPI_RC_ERR_INVALID_HANDLE;
    }
    if (found->second.threads == 0 || !RequestScope::detachThread()) {
        return CMPI_RC_ERR_FAILED;
    }
    if (--found->second.threads == 0) {
        prepared_.erase(found);
    }
    return CMPI_RC_OK;
}

bool Broker::hasThreads() {
    const std::lock_guard lock(mutex_);
    return std::ranges::any_of(prepared_,
                               [](const auto& each) { return each.second.threads != 0; });
}

void Broker::close() {
    constexpr std::chrono::milliseconds pause(1);
    handler_ = nullptr;
    while (askings_ != 0) {
        std::this_thread::sleep_for(pause);
    }
}

}  // namespace cimom::broker
