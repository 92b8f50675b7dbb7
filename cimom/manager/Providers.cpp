#include "manager/Providers.h"

#include <algorithm>
#include <chrono>
#include <thread>
#include <utility>

#include "broker/RequestScope.h"
#include "broker/objects/BrokerRecords.h"
#include "cimom/Registrations.h"
#include "manager/GuardedCall.h"

namespace cimom {

namespace {

/// Calls the provider's own factory, else the one that serves any name. A
/// factory that does not offer the kind or the name lets the other one try.
template <typename Record>
Record* create(const ProviderLibrary& library, const CMPIBroker* broker, const std::string& name,
               const char* kind, const std::string& nameSpace, Status& status) {
    using Specific = Record* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
    using Generic = Record* (*)(const CMPIBroker*, const CMPIContext*, const char*, CMPIStatus*);
    const std::string suffix = std::string("_Create_") + kind + "MI";
    const auto specific = library.function<Specific>(name + suffix);
    const auto generic = library.function<Generic>("_Generic" + suffix);
    if (specific == nullptr && generic == nullptr) {
        status = {CMPI_RC_ERR_NOT_SUPPORTED, library.file().string() + ": neither " + name +
                                                 suffix + " nor _Generic" + suffix + " is in it"};
        return nullptr;
    }
    broker::RequestScope scope;
    const CMPIContext* const context =
        broker::makeContext(scope.arena(), nameSpace, "", 0, broker::RequestScope::depthOfThread());
    Record* record = nullptr;
    const auto call = [&](const std::string& symbol, auto&& factory) {
        status = guardedCall(library.file().string() + ": " + symbol, [&] {
            // Factories of older stub macros never write the status.
            CMPIStatus code{CMPI_RC_OK, nullptr};
            record = factory(&code);
            return code;
        });
        if (record != nullptr) {
            status = {};
        } else if (status.ok()) {
            status = {CMPI_RC_ERR_FAILED,
                      library.file().string() + ": " + symbol + " gave nothing"};
        } else if (status.message.empty()) {
            status.message = library.file().string() + ": " + symbol + " failed";
        }
    };
    if (specific != nullptr) {
        call(name + suffix, [&](CMPIStatus* rc) { return specific(broker, context, rc); });
    }
    const bool tryGeneric = specific == nullptr || status.code == CMPI_RC_ERR_NOT_FOUND ||
                            status.code == CMPI_RC_ERR_NOT_SUPPORTED;
    if (record == nullptr && generic != nullptr && tryGeneric) {
        call("_Generic" + suffix,
             [&](CMPIStatus* rc) { return generic(broker, context, name.c_str(), rc); });
    }
    if (record != nullptr && record->ft == nullptr) {
        status = {CMPI_RC_ERR_FAILED, library.file().string() + ": the " + kind + " record of " +
                                          name + " has no function table"};
        return nullptr;
    }
    return record;
}

}  // namespace

Provider::Provider(Providers& owner, std::string location, std::string name)
    : owner_(owner), location_(std::move(location)), name_(std::move(name)) {}

template <typename Record>
Record* Provider::record(std::atomic<Record*>& slot, const char* kind, const std::string& nameSpace,
                         Status& status) {
    if (Record* const made = slot.load(std::memory_order_acquire)) {
        return made;
    }
    const std::lock_guard lock(owner_.mutex_);
    if (Record* const made = slot.load(std::memory_order_acquire)) {
        return made;
    }
    if (owner_.closing_ || creating_) {
        status = {CMPI_RC_ERR_FAILED, "provider " + name_ + " is asked while it is being " +
                                          (creating_ ? "created" : "ended")};
        return nullptr;
    }
    if (Status tooDeep = checkDepth(); !tooDeep.ok()) {
        status = std::move(tooDeep);
        return nullptr;
    }
    struct Creating {
        bool& flag;
        explicit Creating(bool& creating) : flag(creating) { creating = true; }
        ~Creating() { flag = false; }
        Creating(const Creating&) = delete;
        Creating& operator=(const Creating&) = delete;
    };
    try {
        const Providers::Loaded& loaded = owner_.load(location_);
        const ProviderLibrary& library = *loaded.library;
        const CMPIBroker* const broker = loaded.broker->record();
        const Creating creating(creating_);
        auto* const made = create<Record>(library, broker, name_, kind, nameSpace, status);
        status.noProvider = made == nullptr;
        slot.store(made, std::memory_order_release);
        return made;
    } catch (const LoadError& error) {
        status = {CMPI_RC_ERR_FAILED, error.what(), true};
        return nullptr;
    }
}

CMPIInstanceMI* Provider::instance(const std::string& nameSpace, Status& status) {
    return record(instance_, "Instance", nameSpace, status);
}

CMPIAssociationMI* Provider::association(const std::string& nameSpace, Status& status) {
    return record(association_, "Association", nameSpace, status);
}

CMPIIndicationMI* Provider::indication(const std::string& nameSpace, Status& status) {
    return record(indication_, "Indication", nameSpace, status);
}

const broker::Broker* Provider::broker() const {
    const std::lock_guard lock(owner_.mutex_);
    const auto loaded = std::ranges::find_if(
        owner_.loaded_, [this](const auto& one) { return one.location == location_; });
    return loaded == owner_.loaded_.end() ? nullptr : loaded->broker.get();
}

Providers::Providers(std::vector<std::filesystem::path> directories, const ClassRepository& classes,
                     RequestHandler* handler, broker::IndicationSink* sink)
    : directories_(std::move(directories)), classes_(classes), handler_(handler), sink_(sink) {}

Provider& Providers::provider(const std::string& location, const std::string& name) {
    const std::lock_guard lock(mutex_);
    for (const auto& one : providers_) {
        if (one->location() == location && one->name() == name) {
            return *one;
        }
    }
    return *providers_.emplace_back(std::make_unique<Provider>(*this, location, name));
}

Providers::Loaded& Providers::load(const std::string& location) {
    const auto found = std::find_if(loaded_.begin(), loaded_.end(),
                                    [&](const Loaded& one) { return one.location == location; });
    if (found != loaded_.end()) {
        return *found;
    }
    auto library = std::make_unique<ProviderLibrary>(location, directories_);
    auto broker = std::make_unique<broker::Broker>(classes_, handler_, sink_);
    return loaded_.emplace_back(Loaded{location, std::move(broker), std::move(library)});
}

void Providers::cleanUp(Provider& provider) {
    const auto end = [&](auto* record, const char* kind) {
        // Two providers may share one static record, which is cleaned up once.
        if (record == nullptr || record->ft->cleanup == nullptr ||
            std::find(cleaned_.begin(), cleaned_.end(), record) != cleaned_.end()) {
            return;
        }
        cleaned_.push_back(record);
        broker::RequestScope scope;
        const CMPIContext* const context =
            broker::makeContext(scope.arena(), "", "", 0, broker::RequestScope::depthOfThread());
        // The provider is gone now, whatever its status is.
        static_cast<void>(guardedCall(provider.name() + ": cleanup of " + kind,
                                      [&] { return record->ft->cleanup(record, context, 1); }));
    };
    // First, since it may have a thread that asks for what the others serve.
    end(provider.indication_.exchange(nullptr), "Indication");
    end(provider.instance_.exchange(nullptr), "Instance");
    end(provider.association_.exchange(nullptr), "Association");
}

bool Providers::end() {
    {
        const std::lock_guard lock(mutex_);
        closing_ = true;
    }
    for (const auto& provider : providers_) {
        cleanUp(*provider);
    }
    bool ended = true;
    for (const Loaded& loaded : loaded_) {
        if (!threadsEnd(*loaded.broker)) {
            loaded.broker->close();
            ended = false;
        }
    }
    return ended;
}

/// Whether the threads of a provider end, which its cleanup should have awaited.
bool Providers::threadsEnd(broker::Broker& broker) {
    constexpr std::chrono::seconds patience(1);
    constexpr std::chrono::milliseconds pause(5);
    const auto end = std::chrono::steady_clock::now() + patience;
    while (broker.hasThreads()) {
        if (std::chrono::steady_clock::now() >= end) {
            return false;
        }
        std::this_thread::sleep_for(pause);
    }
    return true;
}

Providers::~Providers() {
    if (!closing_) {
        // Who keeps them alone has nothing that could stay for a thread.
        static_cast<void>(end());
    }
}

}  // namespace cimom
