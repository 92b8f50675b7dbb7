#include "SubscriptionClasses.h"

#include <algorithm>
#include <chrono>
#include <limits>
#include <utility>

#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/DateTimeText.h"
#include "cimom/Names.h"
#include "cimom/ObjectManager.h"
#include "cimom/OwnClass.h"
#include "cimom/Query.h"
#include "transport/HttpUrl.h"

namespace cimom::wbem {

namespace {

constexpr const char* interop = "root/interop";
constexpr const char* filterClass = "CIM_IndicationFilter";
constexpr const char* destinationClass = "CIM_ListenerDestinationCIMXML";
constexpr const char* subscriptionClass = "CIM_IndicationSubscription";
constexpr const char* serviceClass = "CIM_IndicationService";
constexpr const char* capabilitiesClass = "CIM_IndicationServiceCapabilities";
constexpr const char* systemClass = "CIM_ComputerSystem";
constexpr const char* serviceName = "indications";

/// Of names and URLs, in bytes.
constexpr std::size_t longestText = 2048;
constexpr std::size_t mostNameSpaces = 32;
constexpr std::int64_t inSecond = 1000000;  // microseconds

[[noreturn]] void refuseRequest(CMPIrc code, const std::string& reason) {
    throw RequestRefused(code, reason);
}

Value ofUnsigned(Type type, std::uint64_t number) {
    return {type, false, Scalar(number)};
}

Value ofBoolean(bool value) {
    return {Type::boolean, false, Scalar(value)};
}

Value ofReference(ObjectPath path) {
    return {Type::reference, false, Scalar(std::make_shared<const ObjectPath>(std::move(path)))};
}

Value ofMoment(Moment moment) {
    const auto text = cimom::toText(DateTime{false, moment});
    return text ? Value{Type::datetime, false, Scalar(*text)} : Value::null(Type::datetime, false);
}

// What clients send. The object manager has compared types with the class.

std::string textOf(const Instance& instance, const char* name) {
    const Value* const value = instance.property(name);
    const Scalar* const scalar = value == nullptr ? nullptr : value->scalar();
    const auto* const text = scalar == nullptr ? nullptr : std::get_if<std::string>(scalar);
    if (text != nullptr && text->size() > longestText) {
        refuseRequest(CMPI_RC_ERR_INVALID_PARAMETER, std::string(name) + " is too long");
    }
    return text == nullptr ? "" : *text;
}

std::string requiredText(const Instance& instance, const char* name) {
    std::string text = textOf(instance, name);
    if (text.empty()) {
        refuseRequest(CMPI_RC_ERR_INVALID_PARAMETER, std::string(name) + " is missing");
    }
    return text;
}

std::optional<std::uint64_t> numberOf(const Value* value) {
    const Scalar* const scalar = value == nullptr ? nullptr : value->scalar();
    const auto* const number = scalar == nullptr ? nullptr : std::get_if<std::uint64_t>(scalar);
    return number == nullptr ? std::nullopt : std::optional(*number);
}

/// A value of an enumeration, or the standard one for null.
template <typename Enumeration>
Enumeration chosen(const Instance& instance, const char* name, Enumeration standard,
                   std::initializer_list<Enumeration> offered) {
    const auto number = numberOf(instance.property(name));
    if (!number) {
        return standard;
    }
    for (const Enumeration each : offered) {
        if (static_cast<std::uint64_t>(each) == *number) {
            return each;
        }
    }
    refuseRequest(CMPI_RC_ERR_NOT_SUPPORTED,
                  std::string(name) + ' ' + std::to_string(*number) + " is not offered");
}

std::optional<std::uint64_t> durationOf(const Instance& instance) {
    const auto duration = numberOf(instance.property("SubscriptionDuration"));
    if (duration && *duration == 0) {
        refuseRequest(CMPI_RC_ERR_INVALID_PARAMETER, "SubscriptionDuration is 0");
    }
    return duration;
}

std::string keyOf(const ObjectPath& path, const char* name) {
    const Value* const value = path.key(name);
    const Scalar* const scalar = value == nullptr ? nullptr : value->scalar();
    const auto* const text = scalar == nullptr ? nullptr : std::get_if<std::string>(scalar);
    return text == nullptr ? "" : *text;
}

const ObjectPath* referenceOf(const Value* value) {
    const Scalar* const scalar = value == nullptr ? nullptr : value->scalar();
    const auto* const path =
        scalar == nullptr ? nullptr : std::get_if<std::shared_ptr<const ObjectPath>>(scalar);
    return path == nullptr ? nullptr : path->get();
}

/// What the classes have in common: the store, and the keys that the server gives.
class SubscriptionClass : public OwnClass {
  public:
    SubscriptionClass(const char* name, std::shared_ptr<SubscriptionStore> store,
                      const ObjectManager& manager)
        : OwnClass(name, {interop}), store_(std::move(store)), manager_(manager) {}

  protected:
    [[nodiscard]] ObjectPath pathOf(const char* className, const std::string& name) const {
        return {"",
                interop,
                className,
                {{"SystemCreationClassName", Value::ofString(systemClass)},
                 {"SystemName", Value::ofString(manager_.host())},
                 {"CreationClassName", Value::ofString(className)},
                 {"Name", Value::ofString(name)}}};
    }
    [[nodiscard]] ObjectPath subscriptionPath(const SubscriptionRecord& record) const {
        return {"",
                interop,
                subscriptionClass,
                {{"Filter", ofReference(pathOf(filterClass, record.filter))},
                 {"Handler", ofReference(pathOf(destinationClass, record.destination))}}};
    }
    [[nodiscard]] ObjectPath capabilitiesPath() const {
        return {"",
                interop,
                capabilitiesClass,
                {{"InstanceID",
                  Value::ofString("dhcp-client-provider:" + manager_.host() + ':' + serviceName)}}};
    }
    /// An instance that has its keys as properties, too.
    [[nodiscard]] static Instance instanceAt(ObjectPath path) {
        Instance instance{std::move(path), {}};
        instance.properties = instance.path.keys;
        return instance;
    }

    [[nodiscard]] SubscriptionStore& store() const noexcept { return *store_; }
    [[nodiscard]] const ObjectManager& manager() const noexcept { return manager_; }

  private:
    const std::shared_ptr<SubscriptionStore> store_;
    const ObjectManager& manager_;
};

void addElementName(Instance& instance, const std::string& name) {
    if (!name.empty()) {
        instance.properties.push_back({"ElementName", Value::ofString(name)});
    }
}

class FilterClass final : public SubscriptionClass {
  public:
    using SubscriptionClass::SubscriptionClass;

    [[nodiscard]] std::vector<Instance> instances(const std::string& /*nameSpace*/) const override {
        std::vector<Instance> all;
        for (const FilterRecord& record : store().records().filters) {
            Instance& instance = all.emplace_back(instanceAt(pathOf(filterClass, record.name)));
            addElementName(instance, record.elementName);
            Array nameSpaces;
            std::copy(record.sourceNameSpaces.begin(), record.sourceNameSpaces.end(),
                      std::back_inserter(nameSpaces));
            instance.properties.push_back({"SourceNamespaces", {Type::string, true, nameSpaces}});
            if (record.sourceNameSpaces.size() == 1) {
                instance.properties.push_back(
                    {"SourceNamespace", Value::ofString(record.sourceNameSpaces.front())});
            }
            instance.properties.push_back({"IndividualSubscriptionSupported", ofBoolean(true)});
            instance.properties.push_back({"Query", Value::ofString(record.query)});
            instance.properties.push_back({"QueryLanguage", Value::ofString(record.language)});
        }
        return all;
    }

    ObjectPath create(const Instance& instance, const std::string& principal) override {
        FilterRecord record;
        record.name = requiredText(instance, "Name");
        record.language = requiredText(instance, "QueryLanguage");
        record.elementName = textOf(instance, "ElementName");
        record.query = queryOf(instance, record.language);
        record.sourceNameSpaces = sourceNameSpaces(instance);
        store().create(record, principal);
        return pathOf(filterClass, record.name);
    }

    void remove(const ObjectPath& path, const std::string& principal) override {
        store().removeFilter(keyOf(path, "Name"), principal);
    }

  private:
    /// The query, which must be one of indications.
    [[nodiscard]] std::string queryOf(const Instance& instance, const std::string& language) const {
        const Value* const value = instance.property("Query");
        const Scalar* const scalar = value == nullptr ? nullptr : value->scalar();
        const auto* const text = scalar == nullptr ? nullptr : std::get_if<std::string>(scalar);
        if (text == nullptr) {
            refuseRequest(CMPI_RC_ERR_INVALID_PARAMETER, "Query is missing");
        }
        try {
            const Query query = Query::parse(language, *text);
            const ClassDeclaration* const from = manager().repository().find(query.className());
            if (from == nullptr || !isTrue(from->qualifier("Indication"))) {
                refuseRequest(CMPI_RC_ERR_INVALID_QUERY,
                              query.className() + " is not a class of indications");
            }
            if (const auto unknown = query.unknownProperty(*from)) {
                refuseRequest(CMPI_RC_ERR_INVALID_QUERY,
                              from->name + " has no property " + *unknown);
            }
        } catch (const QueryError& error) {
            refuseRequest(error.code, error.what());
        }
        return *text;
    }

    /// Those that are named, each once, or that of the filter itself.
    [[nodiscard]] std::vector<std::string> sourceNameSpaces(const Instance& instance) const {
        std::vector<std::string> wanted;
        const Value* const several = instance.property("SourceNamespaces");
        if (const Array* const array = several == nullptr ? nullptr : several->array()) {
            for (const Scalar& each : *array) {
                const auto* const text = std::get_if<std::string>(&each);
                wanted.push_back(text == nullptr ? "" : *text);
            }
        } else if (std::string one = textOf(instance, "SourceNamespace"); !one.empty()) {
            wanted.push_back(std::move(one));
        }
        if (wanted.empty()) {
            wanted.emplace_back(interop);
        }
        if (wanted.size() > mostNameSpaces) {
            refuseRequest(CMPI_RC_ERR_INVALID_PARAMETER, "SourceNamespaces are too many");
        }
        std::vector<std::string> found;
        for (const std::string& each : wanted) {
            const std::string* const known = manager().findNameSpace(each);
            if (known == nullptr) {
                refuseRequest(CMPI_RC_ERR_INVALID_NAMESPACE, "no namespace \"" + each + '"');
            }
            if (std::find(found.begin(), found.end(), *known) == found.end()) {
                found.push_back(*known);
            }
        }
        return found;
    }
};

class DestinationClass final : public SubscriptionClass {
  public:
    using SubscriptionClass::SubscriptionClass;

    [[nodiscard]] std::vector<Instance> instances(const std::string& /*nameSpace*/) const override {
        std::vector<Instance> all;
        for (const DestinationRecord& record : store().records().destinations) {
            Instance& instance =
                all.emplace_back(instanceAt(pathOf(destinationClass, record.name)));
            addElementName(instance, record.elementName);
            instance.properties.push_back({"Destination", Value::ofString(record.url)});
            instance.properties.push_back(
                {"PersistenceType",
                 ofUnsigned(Type::uint16, static_cast<std::uint64_t>(record.persistence))});
            instance.properties.push_back({"Protocol", ofUnsigned(Type::uint16, cimXml)});
        }
        return all;
    }

    ObjectPath create(const Instance& instance, const std::string& principal) override {
        DestinationRecord record;
        record.name = requiredText(instance, "Name");
        record.url = requiredText(instance, "Destination");
        record.elementName = textOf(instance, "ElementName");
        record.persistence = chosen(instance, "PersistenceType", Persistence::permanent,
                                    {Persistence::permanent, Persistence::transient});
        if (numberOf(instance.property("Protocol")).value_or(cimXml) != cimXml) {
            refuseRequest(CMPI_RC_ERR_NOT_SUPPORTED, "only CIM-XML is spoken");
        }
        try {
            static_cast<void>(readHttpUrl(record.url));
        } catch (const UrlError& error) {
            refuseRequest(CMPI_RC_ERR_INVALID_PARAMETER,
                          std::string("Destination: ") + error.what());
        }
        store().create(record, principal);
        return pathOf(destinationClass, record.name);
    }

    void remove(const ObjectPath& path, const std::string& principal) override {
        store().removeDestination(keyOf(path, "Name"), principal);
    }

  private:
    static constexpr std::uint64_t cimXml = 2;
};

class SubscribedClass final : public SubscriptionClass {
  public:
    using SubscriptionClass::SubscriptionClass;

    [[nodiscard]] std::vector<Instance> instances(const std::string& /*nameSpace*/) const override {
        const Moment moment = std::chrono::duration_cast<std::chrono::microseconds>(
                                  std::chrono::system_clock::now().time_since_epoch())
                                  .count();
        std::vector<Instance> all;
        for (const SubscriptionRecord& record : store().records().subscriptions) {
            Instance& instance = all.emplace_back(instanceAt(subscriptionPath(record)));
            const auto add = [&instance](const char* name, Value value) {
                instance.properties.push_back({name, std::move(value)});
            };
            add("OnFatalErrorPolicy",
                ofUnsigned(Type::uint16, static_cast<std::uint64_t>(record.policy)));
            add("SubscriptionState",
                ofUnsigned(Type::uint16, static_cast<std::uint64_t>(record.state)));
            add("TimeOfLastStateChange", ofMoment(record.stateChanged));
            add("SubscriptionStartTime", ofMoment(record.started));
            add("RepeatNotificationPolicy", ofUnsigned(Type::uint16, noRepetition));
            if (record.duration) {
                const auto passed = static_cast<std::uint64_t>(
                    std::max<Moment>(moment - record.started, 0) / inSecond);
                add("SubscriptionDuration", ofUnsigned(Type::uint64, *record.duration));
                add("SubscriptionTimeRemaining",
                    ofUnsigned(Type::uint64,
                               *record.duration - std::min(passed, *record.duration)));
            }
            if (!record.info.empty()) {
                add("SubscriptionInfo", Value::ofString(record.info));
            }
        }
        return all;
    }

    ObjectPath create(const Instance& instance, const std::string& principal) override {
        SubscriptionRecord record;
        record.filter = named(instance, "Filter", filterClass);
        record.destination = named(instance, "Handler", destinationClass);
        record.policy = chosen(instance, "OnFatalErrorPolicy", ErrorPolicy::ignore,
                               {ErrorPolicy::ignore, ErrorPolicy::disable, ErrorPolicy::remove});
        record.state = stateOf(instance);
        record.duration = durationOf(instance);
        record.info = textOf(instance, "SubscriptionInfo");
        if (numberOf(instance.property("RepeatNotificationPolicy")).value_or(noRepetition) !=
            noRepetition) {
            refuseRequest(CMPI_RC_ERR_NOT_SUPPORTED, "RepeatNotificationPolicy can only be 2");
        }
        store().create(record, principal);
        return subscriptionPath(record);
    }

    void modify(const Instance& instance,
                const std::optional<std::vector<std::string>>& propertyList,
                const std::string& principal) override {
        SubscriptionStore::Change change;
        const auto before = find(instance.path);
        for (const std::string& name : changed(instance, propertyList)) {
            if (sameName(name, "SubscriptionState")) {
                change.state = stateOf(instance);
            } else if (sameName(name, "SubscriptionDuration")) {
                change.duration = durationOf(instance);
            } else if (sameName(name, "SubscriptionInfo")) {
                change.info = textOf(instance, "SubscriptionInfo");
            } else {
                const Value* const now = before ? before->property(name) : nullptr;
                const Value* const wanted = instance.property(name);
                const bool same = now != nullptr && wanted != nullptr && *now == *wanted;
                const bool absent = now == nullptr && (wanted == nullptr || wanted->isNull());
                if (!same && !absent && !sameName(name, "SubscriptionTimeRemaining")) {
                    refuseRequest(CMPI_RC_ERR_NOT_SUPPORTED, name + " cannot be changed");
                }
            }
        }
        const auto [filter, destination] = ends(instance.path);
        store().change(filter, destination, change, principal);
    }

    void remove(const ObjectPath& path, const std::string& principal) override {
        const auto [filter, destination] = ends(path);
        store().removeSubscription(filter, destination, principal);
    }

  private:
    static constexpr std::uint64_t noRepetition = 2;

    static SubscriptionState stateOf(const Instance& instance) {
        return chosen(instance, "SubscriptionState", SubscriptionState::enabled,
                      {SubscriptionState::enabled, SubscriptionState::disabled});
    }

    /// What a client wants to be changed: what is listed, else all that it has sent.
    static std::vector<std::string> changed(
        const Instance& instance, const std::optional<std::vector<std::string>>& propertyList) {
        if (propertyList) {
            return *propertyList;
        }
        std::vector<std::string> names;
        for (const NamedValue& property : instance.properties) {
            names.push_back(property.name);
        }
        return names;
    }

    static std::pair<std::string, std::string> ends(const ObjectPath& path) {
        const ObjectPath* const filter = referenceOf(path.key("Filter"));
        const ObjectPath* const destination = referenceOf(path.key("Handler"));
        return {filter == nullptr ? "" : keyOf(*filter, "Name"),
                destination == nullptr ? "" : keyOf(*destination, "Name")};
    }

    /// The name of the object at the end of a subscription that is to be made. Its host is
    /// not compared: clients put the name there by which they reach the server.
    std::string named(const Instance& instance, const char* role, const char* className) const {
        const ObjectPath* const path = referenceOf(instance.property(role));
        if (path == nullptr) {
            refuseRequest(CMPI_RC_ERR_INVALID_PARAMETER, std::string(role) + " is missing");
        }
        if (!sameName(path->className, className) ||
            (!path->nameSpace.empty() && !sameName(path->nameSpace, interop))) {
            refuseRequest(CMPI_RC_ERR_NOT_FOUND,
                          std::string(role) + ": there is no such " + className);
        }
        return keyOf(*path, "Name");
    }
};

class ServiceClass final : public SubscriptionClass {
  public:
    using SubscriptionClass::SubscriptionClass;

    [[nodiscard]] std::vector<Instance> instances(const std::string& /*nameSpace*/) const override {
        Instance instance = instanceAt(pathOf(serviceClass, serviceName));
        const DeliverySettings& delivery = store().settings().delivery;
        const auto add = [&instance](const char* name, Value value) {
            instance.properties.push_back({name, std::move(value)});
        };
        const auto seconds = [](std::chrono::milliseconds time) {
            return ofUnsigned(
                Type::uint32,
                static_cast<std::uint64_t>(std::chrono::ceil<std::chrono::seconds>(time).count()));
        };
        constexpr std::uint64_t ignoreAction = 4;
        add("ElementName", Value::ofString("Indications"));
        add("Started", ofBoolean(true));
        add("FilterCreationEnabled", ofBoolean(true));
        add("DeliveryRetryAttempts", ofUnsigned(Type::uint16, delivery.retries));
        add("DeliveryRetryInterval", seconds(delivery.retryInterval));
        add("SubscriptionRemovalAction", ofUnsigned(Type::uint16, ignoreAction));
        add("SubscriptionRemovalTimeInterval", seconds(delivery.removalTime));
        return {std::move(instance)};
    }
};

class ServiceCapabilitiesClass final : public SubscriptionClass {
  public:
    using SubscriptionClass::SubscriptionClass;

    [[nodiscard]] std::vector<Instance> instances(const std::string& /*nameSpace*/) const override {
        Instance instance = instanceAt(capabilitiesPath());
        const SubscriptionLimits& limits = store().settings().limits;
        const auto add = [&instance](const char* name, Value value) {
            instance.properties.push_back({name, std::move(value)});
        };
        add("ElementName", Value::ofString("Indications"));
        for (const char* settable :
             {"FilterCreationEnabledIsSettable", "DeliveryRetryAttemptsIsSettable",
              "DeliveryRetryIntervalIsSettable", "SubscriptionRemovalActionIsSettable",
              "SubscriptionRemovalTimeIntervalIsSettable"}) {
            add(settable, ofBoolean(false));
        }
        constexpr std::uint64_t most = std::numeric_limits<std::uint16_t>::max();
        add("MaxListenerDestinations",
            ofUnsigned(Type::uint16, std::min<std::uint64_t>(limits.listeners, most)));
        add("MaxActiveSubscriptions", ofUnsigned(Type::uint32, limits.subscriptions));
        add("SubscriptionsPersisted", ofBoolean(!store().settings().directory.empty()));
        return {std::move(instance)};
    }
};

/// What the service can do is told by its capabilities.
class CapabilitiesOfServiceClass final : public SubscriptionClass {
  public:
    using SubscriptionClass::SubscriptionClass;

    [[nodiscard]] std::vector<Instance> instances(const std::string& /*nameSpace*/) const override {
        return {instanceAt({"",
                            interop,
                            className(),
                            {{"ManagedElement", ofReference(pathOf(serviceClass, serviceName))},
                             {"Capabilities", ofReference(capabilitiesPath())}}})};
    }
};

/// The service acts on all filters and destinations.
class AffectedClass final : public SubscriptionClass {
  public:
    using SubscriptionClass::SubscriptionClass;

    [[nodiscard]] std::vector<Instance> instances(const std::string& /*nameSpace*/) const override {
        const SubscriptionRecords records = store().records();
        std::vector<Instance> all;
        const auto add = [&](const char* affected, const std::string& name) {
            constexpr std::uint64_t manages = 5;
            Instance& instance = all.emplace_back(instanceAt(
                {"",
                 interop,
                 className(),
                 {{"AffectedElement", ofReference(pathOf(affected, name))},
                  {"AffectingElement", ofReference(pathOf(serviceClass, serviceName))}}}));
            instance.properties.push_back(
                {"ElementEffects", {Type::uint16, true, Array{Scalar(manages)}}});
        };
        for (const FilterRecord& record : records.filters) {
            add(filterClass, record.name);
        }
        for (const DestinationRecord& record : records.destinations) {
            add(destinationClass, record.name);
        }
        return all;
    }
};

}  // namespace

std::vector<std::unique_ptr<OwnClass>> subscriptionClasses(
    const std::shared_ptr<SubscriptionStore>& store, const ObjectManager& manager) {
    std::vector<std::unique_ptr<OwnClass>> all;
    all.push_back(std::make_unique<FilterClass>(filterClass, store, manager));
    all.push_back(std::make_unique<DestinationClass>(destinationClass, store, manager));
    all.push_back(std::make_unique<SubscribedClass>(subscriptionClass, store, manager));
    all.push_back(std::make_unique<ServiceClass>(serviceClass, store, manager));
    all.push_back(std::make_unique<ServiceCapabilitiesClass>(capabilitiesClass, store, manager));
    all.push_back(
        std::make_unique<CapabilitiesOfServiceClass>("CIM_ElementCapabilities", store, manager));
    all.push_back(std::make_unique<AffectedClass>("CIM_ServiceAffectsElement", store, manager));
    return all;
}

}  // namespace cimom::wbem
