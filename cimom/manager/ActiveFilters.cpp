#include "manager/ActiveFilters.h"

#include <algorithm>
#include <optional>
#include <utility>

#include "broker/Broker.h"
#include "broker/RequestScope.h"
#include "broker/objects/BrokerRecords.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Names.h"
#include "cimom/Query.h"
#include "manager/GuardedCall.h"
#include "manager/RequestPath.h"
#include "manager/RequestedObjects.h"

namespace cimom {

namespace {

/// A provider that is registered for indications, and which filters it has accepted.
class IndicationProvider {
  public:
    explicit IndicationProvider(Provider& provider) : provider_(provider) {}

    [[nodiscard]] const Provider& provider() const noexcept { return provider_; }

    /// Null when the library cannot be had.
    [[nodiscard]] CMPIIndicationMI* record(const std::string& nameSpace, Status& status) {
        return provider_.indication(nameSpace, status);
    }
    [[nodiscard]] const broker::Broker* broker() const { return provider_.broker(); }

    /// Held while one of its functions about filters runs.
    std::mutex mutex;
    /// The classes and namespaces of the filters that it has accepted.
    std::vector<std::pair<std::string, std::string>> accepted;
    bool enabled = false;

  private:
    Provider& provider_;
};

struct ServedIndication {
    const ClassDeclaration* declaration;
    IndicationProvider* provider;
    std::vector<std::string> nameSpaces;

    [[nodiscard]] bool isIn(std::string_view nameSpace) const noexcept {
        return std::ranges::any_of(
            nameSpaces, [nameSpace](const auto& one) { return sameName(one, nameSpace); });
    }
};

}  // namespace

/// What subscriptions share with the manager, which may end before them.
class ActiveFilters::Core {
  public:
    /// One subscription.
    struct Filter {
        /// A provider that has accepted the filter for one namespace.
        struct Acceptance {
            IndicationProvider* provider;
            std::string nameSpace;
            std::unique_ptr<broker::Arena> memory;  ///< of the expression
            const CMPISelectExp* expression;
        };

        std::optional<Query> query;  ///< there once it is active
        std::string fromClass;
        IndicationFilter asked;
        IndicationReceiver receiver;
        std::vector<Acceptance> acceptances;  ///< used by who activates or ends it

        std::mutex mutex;  ///< held while the receiver runs
        bool ended = false;
        std::vector<const broker::Broker*> sources;  ///< of the providers that accepted it
    };
    using FilterPointer = std::shared_ptr<Filter>;

    explicit Core(const Surroundings& surroundings) : here_(surroundings) {}

    void serve(const ClassDeclaration& declaration, Provider& provider,
               const std::vector<std::string>& nameSpaces);
    [[nodiscard]] Status activate(const FilterPointer& filter);
    void end(const FilterPointer& filter);
    CMPIrc take(const broker::Broker& from, Instance indication);
    void close();

  private:
    [[nodiscard]] Status read(Filter& filter) const;
    Status activateAt(IndicationProvider& provider, const std::string& nameSpace, Filter& filter);
    /// With endings_ held.
    void endOne(const FilterPointer& filter);
    void deactivate(Filter::Acceptance& acceptance, const Filter& filter);
    void hand(Filter& filter, const broker::Broker& from, const Indication& indication);
    void log(const Status& status) const;

    const Surroundings here_;
    std::vector<std::unique_ptr<IndicationProvider>> providers_;
    std::vector<ServedIndication> served_;

    std::mutex mutex_;
    std::vector<FilterPointer> filters_;  ///< those that indications go to
    bool closed_ = false;
    std::mutex endings_;  ///< held while a subscription ends, or all of them
};

namespace {

/// A call of a slot of the provider; `invoke` gets the record, the context and the path of
/// the class. A slot that is missing has nothing against it.
template <typename Slot, typename Invoke>
Status callSlot(const IndicationProvider& provider, CMPIIndicationMI* mi, Slot slot,
                const char* name, const ObjectPath& path, const std::string& principal,
                const ClassRepository& classes, Invoke&& invoke) {
    if (slot == nullptr) {
        return {};
    }
    if (Status tooDeep = checkDepth(); !tooDeep.ok()) {
        return tooDeep;
    }
    broker::RequestScope scope;
    broker::Arena& arena = scope.arena();
    const CMPIContext* const context = broker::makeContext(arena, path.nameSpace, principal, 0,
                                                           broker::RequestScope::depthOfThread());
    const CMPIObjectPath* const record =
        broker::makePath(arena, &classes, path.nameSpace, path.className);
    const std::string who = "provider " + provider.provider().name() + ": " + name;
    Status status =
        guardedCall(who, [&] { return std::forward<Invoke>(invoke)(slot, mi, context, record); });
    if (!status.ok() && status.message.empty()) {
        status.message = who + " failed";
    }
    return status;
}

}  // namespace

void ActiveFilters::Core::serve(const ClassDeclaration& declaration, Provider& provider,
                                const std::vector<std::string>& nameSpaces) {
    const auto known = std::ranges::find_if(
        providers_, [&](const auto& one) { return &one->provider() == &provider; });
    IndicationProvider& serving =
        known != providers_.end()
            ? **known
            : *providers_.emplace_back(std::make_unique<IndicationProvider>(provider));
    served_.push_back({&declaration, &serving, nameSpaces});
}

void ActiveFilters::Core::log(const Status& status) const {
    if (!status.ok() && here_.log) {
        here_.log(status.message);
    }
}

Status ActiveFilters::Core::read(Filter& filter) const {
    try {
        filter.query = Query::parse(filter.asked.queryLanguage, filter.asked.query);
    } catch (const QueryError& error) {
        return {error.code, error.what()};
    }
    const std::string& className = filter.query->className();
    if (filter.asked.sourceNameSpaces.empty()) {
        return {CMPI_RC_ERR_INVALID_NAMESPACE, "the filter names no source namespace"};
    }
    for (std::string& nameSpace : filter.asked.sourceNameSpaces) {
        ObjectPath path{{}, nameSpace, className, {}};
        if (Status status = canonicalize(path, here_.classes, here_.nameSpaces); !status.ok()) {
            return status;
        }
        nameSpace = path.nameSpace;
        filter.fromClass = path.className;
    }
    const ClassDeclaration& declaration = *here_.classes.find(filter.fromClass);
    if (!isTrue(declaration.qualifier("Indication"))) {
        return {CMPI_RC_ERR_INVALID_QUERY, filter.fromClass + " is not a class of indications"};
    }
    if (const auto unknown = filter.query->unknownProperty(declaration)) {
        return {CMPI_RC_ERR_INVALID_QUERY,
                filter.fromClass + " has no property \"" + *unknown + '"'};
    }
    return {};
}

Status ActiveFilters::Core::activate(const FilterPointer& filter) {
    if (Status status = read(*filter); !status.ok()) {
        return status;
    }
    {
        // A provider may deliver before its function returns.
        const std::lock_guard lock(mutex_);
        if (closed_) {
            return {CMPI_RC_ERR_FAILED, "the object manager is being ended"};
        }
        filters_.push_back(filter);
    }
    Status refusal{CMPI_RC_ERR_NOT_SUPPORTED,
                   "no provider is registered for indications of class " + filter->fromClass};
    bool asked = false;
    for (const std::string& nameSpace : filter->asked.sourceNameSpaces) {
        std::vector<IndicationProvider*> called;
        for (const ServedIndication& served : served_) {
            if (!served.isIn(nameSpace) ||
                !here_.classes.isA(served.declaration->name, filter->fromClass) ||
                std::ranges::find(called, served.provider) != called.end()) {
                continue;
            }
            called.push_back(served.provider);
            Status status = activateAt(*served.provider, nameSpace, *filter);
            log(status);
            if (!std::exchange(asked, true)) {
                refusal = std::move(status);
            }
        }
    }
    if (!filter->acceptances.empty()) {
        return {};
    }
    end(filter);
    return refusal;
}

Status ActiveFilters::Core::activateAt(IndicationProvider& provider, const std::string& nameSpace,
                                       Filter& filter) {
    const std::lock_guard lock(provider.mutex);
    Status status;
    CMPIIndicationMI* const mi = provider.record(nameSpace, status);
    if (mi == nullptr) {
        return status;
    }
    const CMPIIndicationMIFT& table = *mi->ft;
    const ObjectPath path{{}, nameSpace, filter.fromClass, {}};
    const char* const className = filter.fromClass.c_str();
    const std::string& owner = filter.asked.owner;
    auto memory = std::make_unique<broker::Arena>();
    const CMPISelectExp* const expression = broker::makeSelectExp(
        *memory, here_.classes, filter.asked.query, filter.asked.queryLanguage);
    status = callSlot(provider, mi, table.authorizeFilter, "authorizeFilter", path, owner,
                      here_.classes, [&](auto slot, auto* self, auto* context, auto* op) {
                          return slot(self, context, expression, className, op, owner.c_str());
                      });
    if (!status.ok()) {
        return status;
    }
    {
        const std::lock_guard receiving(filter.mutex);
        filter.sources.push_back(provider.broker());
    }
    const std::pair<std::string, std::string> accepted{filter.fromClass, nameSpace};
    const bool first = std::ranges::find(provider.accepted, accepted) == provider.accepted.end();
    status = callSlot(provider, mi, table.activateFilter, "activateFilter", path, owner,
                      here_.classes, [&](auto slot, auto* self, auto* context, auto* op) {
                          return slot(self, context, expression, className, op,
                                      static_cast<CMPIBoolean>(first ? 1 : 0));
                      });
    if (!status.ok()) {
        const std::lock_guard receiving(filter.mutex);
        filter.sources.erase(std::ranges::find(filter.sources, provider.broker()));
        return status;
    }
    provider.accepted.push_back(accepted);
    filter.acceptances.push_back({&provider, nameSpace, std::move(memory), expression});
    if (!std::exchange(provider.enabled, true)) {
        // Older providers have a function without a status here; whatever it is, the filter
        // is active.
        log(callSlot(provider, mi, table.enableIndications, "enableIndications", path, owner,
                     here_.classes, [](auto slot, auto* self, auto* context, auto* /*op*/) {
                         return slot(self, context);
                     }));
    }
    return {};
}

void ActiveFilters::Core::deactivate(Filter::Acceptance& acceptance, const Filter& filter) {
    IndicationProvider& provider = *acceptance.provider;
    const std::lock_guard lock(provider.mutex);
    Status status;
    CMPIIndicationMI* const mi = provider.record(acceptance.nameSpace, status);
    if (mi == nullptr) {
        return;
    }
    const ObjectPath path{{}, acceptance.nameSpace, filter.fromClass, {}};
    const std::pair<std::string, std::string> accepted{filter.fromClass, acceptance.nameSpace};
    provider.accepted.erase(std::ranges::find(provider.accepted, accepted));
    const bool last = std::ranges::find(provider.accepted, accepted) == provider.accepted.end();
    log(callSlot(provider, mi, mi->ft->deActivateFilter, "deActivateFilter", path,
                 filter.asked.owner, here_.classes,
                 [&](auto slot, auto* self, auto* context, auto* op) {
                     return slot(self, context, acceptance.expression, filter.fromClass.c_str(), op,
                                 static_cast<CMPIBoolean>(last ? 1 : 0));
                 }));
    if (provider.accepted.empty() && std::exchange(provider.enabled, false)) {
        log(callSlot(provider, mi, mi->ft->disableIndications, "disableIndications", path,
                     filter.asked.owner, here_.classes,
                     [](auto slot, auto* self, auto* context, auto* /*op*/) {
                         return slot(self, context);
                     }));
    }
}

void ActiveFilters::Core::end(const FilterPointer& filter) {
    const std::lock_guard ending(endings_);
    endOne(filter);
}

void ActiveFilters::Core::endOne(const FilterPointer& filter) {
    {
        const std::lock_guard lock(mutex_);
        std::erase(filters_, filter);
    }
    {
        const std::lock_guard receiving(filter->mutex);
        filter->ended = true;
    }
    for (Filter::Acceptance& acceptance : filter->acceptances) {
        deactivate(acceptance, *filter);
    }
    filter->acceptances.clear();
}

void ActiveFilters::Core::close() {
    // A subscription that a subscriber is ending has ended then, too.
    const std::lock_guard ending(endings_);
    std::vector<FilterPointer> left;
    {
        const std::lock_guard lock(mutex_);
        closed_ = true;
        left = filters_;
    }
    for (const FilterPointer& filter : left) {
        endOne(filter);
    }
}

CMPIrc ActiveFilters::Core::take(const broker::Broker& from, Instance indication) {
    std::vector<FilterPointer> filters;
    {
        const std::lock_guard lock(mutex_);
        if (closed_) {
            return CMPI_RC_ERR_FAILED;
        }
        filters = filters_;
    }
    complete(indication, {here_.host, indication.path.nameSpace});
    const Indication whole{std::move(indication), std::chrono::system_clock::now()};
    for (const FilterPointer& filter : filters) {
        hand(*filter, from, whole);
    }
    return CMPI_RC_OK;
}

void ActiveFilters::Core::hand(Filter& filter, const broker::Broker& from,
                               const Indication& indication) {
    const ObjectPath& path = indication.instance.path;
    if (std::ranges::none_of(filter.asked.sourceNameSpaces,
                             [&](const auto& one) { return sameName(one, path.nameSpace); }) ||
        !filter.query->matches(indication.instance, [this](auto one, auto other) {
            return here_.classes.isA(one, other);
        })) {
        return;
    }
    Indication selected = indication;
    filter.query->project(selected.instance);
    const std::lock_guard receiving(filter.mutex);
    if (filter.ended || std::ranges::find(filter.sources, &from) == filter.sources.end()) {
        return;
    }
    try {
        filter.receiver(selected);
    } catch (const std::exception& error) {
        log({CMPI_RC_ERR_FAILED, std::string("an indication of class ") + path.className +
                                     " was lost: " + error.what()});
    }
}

/// What a subscriber holds. The manager may have ended before.
class ActiveFilters::Active final : public IndicationSubscription::Ended {
  public:
    Active(std::weak_ptr<Core> core, Core::FilterPointer filter)
        : core_(std::move(core)), filter_(std::move(filter)) {}
    ~Active() override {
        if (const auto core = core_.lock()) {
            core->end(filter_);
        }
    }
    Active(const Active&) = delete;
    Active& operator=(const Active&) = delete;

  private:
    std::weak_ptr<Core> core_;
    Core::FilterPointer filter_;
};

ActiveFilters::ActiveFilters(const Surroundings& surroundings)
    : core_(std::make_shared<Core>(surroundings)) {}

ActiveFilters::~ActiveFilters() = default;

void ActiveFilters::serve(const ClassDeclaration& declaration, Provider& provider,
                          const std::vector<std::string>& nameSpaces) {
    core_->serve(declaration, provider, nameSpaces);
}

IndicationActivation ActiveFilters::activate(const IndicationFilter& filter,
                                             IndicationReceiver receiver) {
    auto active = std::make_shared<Core::Filter>();
    active->asked = filter;
    active->receiver = std::move(receiver);
    auto subscription = std::make_unique<Active>(core_, active);
    Status status = core_->activate(active);
    if (!status.ok()) {
        return {std::move(status), {}};
    }
    return {std::move(status), IndicationSubscription(std::move(subscription))};
}

CMPIrc ActiveFilters::take(const broker::Broker& from, Instance indication) {
    return core_->take(from, std::move(indication));
}

void ActiveFilters::close() {
    core_->close();
}

}  // namespace cimom
