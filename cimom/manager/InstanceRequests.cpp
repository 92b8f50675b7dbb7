// Requests about instances: which providers are asked, and how.
#include <algorithm>

#include "broker/objects/BrokerRecords.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/Query.h"
#include "manager/GuardedCall.h"
#include "manager/ObjectManagerImplementation.h"
#include "manager/PathMatch.h"
#include "manager/RequestPath.h"

namespace cimom {

namespace {

/// Keeps the first instance that agrees with every key of a path, of however many.
/// For one call.
class FirstMatch final : public ResultReceiver<Instance> {
  public:
    explicit FirstMatch(const ObjectPath& wanted) : wanted_(wanted) {}
    void beginCall() override {}
    void take(std::optional<Instance> instance) override {
        if (!found && instance && hasKeys(*instance, wanted_)) {
            found = std::move(instance);
        }
    }
    void dropCall() override { found.reset(); }

    std::optional<Instance> found;

  private:
    const ObjectPath& wanted_;
};

/// Hands over what a query selects.
class SelectedInstances final : public ResultReceiver<Instance> {
  public:
    /// Borrows all.
    SelectedInstances(ResultReceiver<Instance>& client, const Query& query, const Query::IsA& isA)
        : client_(client), query_(query), isA_(isA) {}
    void beginCall() override { client_.beginCall(); }
    void take(std::optional<Instance> instance) override {
        if (instance && query_.matches(*instance, isA_)) {
            query_.project(*instance);
            client_.take(std::move(instance));
        }
    }
    void dropCall() override { client_.dropCall(); }

  private:
    ResultReceiver<Instance>& client_;
    const Query& query_;
    const Query::IsA& isA_;
};

/// Throws RequestRefused when there is no instance with the path.
void requireFound(const OwnClass& own, const ObjectPath& path) {
    if (!own.find(path)) {
        throw RequestRefused(CMPI_RC_ERR_NOT_FOUND, "");
    }
}

/// For calls that have no result, whatever the provider hands over.
class NoObjects final : public ResultReceiver<Instance> {
  public:
    void beginCall() override {}
    void take(std::optional<Instance> /*instance*/) override {}
    void dropCall() override {}
};

}  // namespace

CallOutcome ObjectManager::Implementation::callReading(const ServedClass& target, Reading reading,
                                                       ObjectPath path,
                                                       const InstanceRequest& request,
                                                       const AnyReceiver& receiver) {
    // Who serves a class sees that class, not the parent that was asked for.
    path.className = target.declaration->name;
    if (target.own != nullptr) {
        return readOwn(target, reading, path, receiver);
    }
    Status status;
    CMPIInstanceMI* const mi = target.provider->instance(path.nameSpace, status);
    if (mi == nullptr) {
        return {std::move(status)};
    }
    const CMPIInstanceMIFT& table = *mi->ft;
    const std::string who = "provider " + target.provider->name() + ": ";
    if (reading == Reading::names) {
        if (table.enumerateInstanceNames == nullptr) {
            return missingSlot(target.provider->name(), "enumerateInstanceNames");
        }
        return callProvider(settings(request.principal, 0), receiver,
                            who + "enumerateInstanceNames", path,
                            [&](const auto* context, const auto* result, const auto* op) {
                                return table.enumerateInstanceNames(mi, context, result, op);
                            });
    }
    const bool one = reading == Reading::one;
    const char* const slot = one ? "getInstance" : "enumerateInstances";
    const auto function = one ? table.getInstance : table.enumerateInstances;
    if (function == nullptr) {
        return missingSlot(target.provider->name(), slot);
    }
    PropertyNames names(request.propertyList);
    const CMPIFlags flags = one ? 0 : CMPI_FLAG_DeepInheritance;
    return callProvider(settings(request.principal, flags), receiver, who + slot, path,
                        [&](const auto* context, const auto* result, const auto* op) {
                            return function(mi, context, result, op, names.pointer());
                        });
}

CallOutcome ObjectManager::Implementation::callModify(const ServedClass& target,
                                                      const Instance& instance,
                                                      const InstanceRequest& request) {
    if (target.own != nullptr) {
        return {guardedOwn(*target.own, [&] {
            requireFound(*target.own, instance.path);
            target.own->modify(instance, request.propertyList, request.principal);
        })};
    }
    Status status;
    CMPIInstanceMI* const mi = target.provider->instance(instance.path.nameSpace, status);
    if (mi == nullptr) {
        return {std::move(status)};
    }
    const auto function = mi->ft->modifyInstance;
    if (function == nullptr) {
        return missingSlot(target.provider->name(), "modifyInstance");
    }
    PropertyNames names(request.propertyList);
    // In memory of its own: that of the call begins and ends with the call.
    broker::Arena arena;
    const CMPIInstance* const changed = broker::toRecord(arena, &repository_, instance);
    NoObjects nowhere;
    return callProvider(settings(request.principal, 0), &nowhere,
                        "provider " + target.provider->name() + ": modifyInstance", instance.path,
                        [&](const auto* context, const auto* result, const auto* op) {
                            return function(mi, context, result, op, changed, names.pointer());
                        });
}

CallOutcome ObjectManager::Implementation::callCreate(const ServedClass& target,
                                                      const Instance& instance,
                                                      const InstanceRequest& request,
                                                      ResultReceiver<ObjectPath>& receiver) {
    if (target.own != nullptr) {
        std::optional<ObjectPath> made;
        Status status = guardedOwn(*target.own,
                                   [&] { made = target.own->create(instance, request.principal); });
        if (made) {
            receiver.take(std::move(made));
        }
        return {std::move(status)};
    }
    Status status;
    CMPIInstanceMI* const mi = target.provider->instance(instance.path.nameSpace, status);
    if (mi == nullptr) {
        return {std::move(status)};
    }
    const auto function = mi->ft->createInstance;
    if (function == nullptr) {
        return missingSlot(target.provider->name(), "createInstance");
    }
    broker::Arena arena;
    const CMPIInstance* const record = broker::toRecord(arena, &repository_, instance);
    return callProvider(settings(request.principal, 0), &receiver,
                        "provider " + target.provider->name() + ": createInstance", instance.path,
                        [&](const auto* context, const auto* result, const auto* op) {
                            return function(mi, context, result, op, record);
                        });
}

CallOutcome ObjectManager::Implementation::callDelete(const ServedClass& target,
                                                      const ObjectPath& path,
                                                      const InstanceRequest& request) {
    if (target.own != nullptr) {
        return {guardedOwn(*target.own, [&] {
            requireFound(*target.own, path);
            target.own->remove(path, request.principal);
        })};
    }
    Status status;
    CMPIInstanceMI* const mi = target.provider->instance(path.nameSpace, status);
    if (mi == nullptr) {
        return {std::move(status)};
    }
    const auto function = mi->ft->deleteInstance;
    if (function == nullptr) {
        return missingSlot(target.provider->name(), "deleteInstance");
    }
    NoObjects nowhere;
    return callProvider(settings(request.principal, 0), &nowhere,
                        "provider " + target.provider->name() + ": deleteInstance", path,
                        [&](const auto* context, const auto* result, const auto* op) {
                            return function(mi, context, result, op);
                        });
}

RequestEnd ObjectManager::Implementation::enumerate(Reading reading, const ObjectPath& path,
                                                    const InstanceRequest& request,
                                                    const AnyReceiver& receiver) {
    const ServedClasses targets = servedInstances(path.className, path.nameSpace);
    const bool exact =
        targets.size() == 1 && sameName(targets.front()->declaration->name, path.className);
    std::vector<CallOutcome> calls;
    for (const ServedClass* const target : targets) {
        calls.push_back(callReading(*target, reading, path, request, receiver));
    }
    return endOf(calls, exact);
}

RequestEnd ObjectManager::Implementation::enumerateInstanceNames(
    ObjectPath path, const InstanceRequest& request, ResultReceiver<ObjectPath>& receiver) {
    return run(path, [&] {
        RequestedObjects<ObjectPath> requested(receiver, surroundings(path), request.propertyList);
        return enumerate(Reading::names, path, request, &requested);
    });
}

RequestEnd ObjectManager::Implementation::enumerateInstances(ObjectPath path,
                                                             const InstanceRequest& request,
                                                             ResultReceiver<Instance>& receiver) {
    return run(path, [&] {
        RequestedObjects<Instance> requested(receiver, surroundings(path), request.propertyList);
        return enumerate(Reading::instances, path, request, &requested);
    });
}

InstancesResult ObjectManager::Implementation::getFrom(const ServedClass& target,
                                                       const ObjectPath& path,
                                                       const InstanceRequest& request) {
    FirstMatch match(path);
    // Keys may be among the properties that the client does not want to see.
    const std::optional<std::vector<std::string>> allProperties;
    RequestedObjects<Instance> requested(match, surroundings(path), allProperties);
    RequestEnd end = endOf({callReading(target, Reading::one, path, request, &requested)},
                           sameName(target.declaration->name, path.className));
    InstancesResult result{std::move(end.status), {}, end.returnDoneCalls};
    if (!result.status.ok()) {
        return result;
    }
    if (!match.found) {
        result.status = {CMPI_RC_ERR_NOT_FOUND, ""};
        return result;
    }
    applyPropertyList(*match.found, request.propertyList);
    result.instances.push_back(std::move(match.found));
    return result;
}

InstancesResult ObjectManager::Implementation::getInstance(ObjectPath path,
                                                           const InstanceRequest& request) {
    try {
        InstancesResult whole;
        whole.status = canonical(path);
        if (!whole.status.ok()) {
            return whole;
        }
        whole.status = {CMPI_RC_ERR_NOT_FOUND, ""};
        for (const ServedClass* const target : servedInstances(path.className, path.nameSpace)) {
            InstancesResult result = getFrom(*target, path, request);
            result.returnDoneCalls += whole.returnDoneCalls;
            // After an error, another class may still have the instance; the first
            // error that tells more than that nothing was found is kept.
            if (result.status.ok() || whole.status.code == CMPI_RC_ERR_NOT_FOUND) {
                whole = std::move(result);
            } else {
                whole.returnDoneCalls = result.returnDoneCalls;
            }
            if (whole.status.ok()) {
                break;
            }
        }
        return whole;
    } catch (const broker::ConversionError& error) {
        return {{CMPI_RC_ERR_INVALID_PARAMETER, error.what()}, {}, 0};
    }
}

const ServedClass* ObjectManager::Implementation::ownerOf(const ObjectPath& path,
                                                          const std::string& principal) {
    for (const ServedClass* const target : servedInstances(path.className, path.nameSpace)) {
        // A path of a parent class that is not served itself belongs to the subclass that has
        // the instance.
        if (sameName(target->declaration->name, path.className) ||
            getFrom(*target, path, {std::nullopt, principal}).status.ok()) {
            return target;
        }
    }
    return nullptr;
}

PathsResult ObjectManager::Implementation::createInstance(Instance instance,
                                                          const InstanceRequest& request) {
    try {
        PathsResult whole;
        instance.path.keys.clear();
        whole.status = canonical(instance.path);
        if (whole.status.ok()) {
            whole.status = checkTexts(instance);
        }
        if (!whole.status.ok()) {
            return whole;
        }
        canonicalizeReferences(instance.properties, nameSpaces_);
        const ServedClasses targets =
            servedInstances(instance.path.className, instance.path.nameSpace);
        const auto target = std::ranges::find_if(targets, [&](const ServedClass* each) {
            return sameName(each->declaration->name, instance.path.className);
        });
        if (target == targets.end()) {
            whole.status = {CMPI_RC_ERR_NOT_SUPPORTED,
                            "nothing makes instances of " + instance.path.className};
            return whole;
        }
        for (const NamedValue& property : instance.properties) {
            const PropertyDeclaration* const declared =
                (*target)->declaration->property(property.name);
            if (declared != nullptr && declared->isKey() && !property.value.isNull()) {
                instance.path.keys.push_back({declared->name, property.value});
            }
        }
        CollectedObjects<ObjectPath> made;
        CallOutcome outcome = callCreate(**target, instance, request, made);
        whole.status = std::move(outcome.status);
        whole.returnDoneCalls = outcome.returnDoneCalls;
        if (whole.status.ok()) {
            // A provider that hands no path over takes the keys as they are.
            const bool given = !made.objects.empty() && made.objects.front();
            ObjectPath path = given ? *std::move(made.objects.front()) : std::move(instance.path);
            complete(path, surroundings(instance.path));
            whole.paths.emplace_back(std::move(path));
        }
        return whole;
    } catch (const broker::ConversionError& error) {
        return {{CMPI_RC_ERR_INVALID_PARAMETER, error.what()}, {}, 0};
    }
}

Status ObjectManager::Implementation::deleteInstance(ObjectPath path,
                                                     const InstanceRequest& request) {
    try {
        if (Status status = canonical(path); !status.ok()) {
            return status;
        }
        const ServedClass* const owner = ownerOf(path, request.principal);
        if (owner == nullptr) {
            return {CMPI_RC_ERR_NOT_FOUND, ""};
        }
        path.className = owner->declaration->name;
        return callDelete(*owner, path, request).status;
    } catch (const broker::ConversionError& error) {
        return {CMPI_RC_ERR_INVALID_PARAMETER, error.what()};
    }
}

RequestEnd ObjectManager::Implementation::execQuery(const std::string& nameSpace,
                                                    const Query& query,
                                                    const InstanceRequest& request,
                                                    ResultReceiver<Instance>& receiver) {
    ObjectPath path{"", nameSpace, query.className(), {}};
    return run(path, [&]() -> RequestEnd {
        if (const auto unknown = query.unknownProperty(*repository_.find(path.className))) {
            return {{CMPI_RC_ERR_INVALID_QUERY,
                     path.className + " has no property \"" + *unknown + '"'}};
        }
        const std::optional<std::vector<std::string>> everything;
        const Query::IsA isA = [this](std::string_view className, std::string_view ancestor) {
            return repository_.isA(className, ancestor);
        };
        SelectedInstances selected(receiver, query, isA);
        RequestedObjects<Instance> requested(selected, surroundings(path), everything);
        return enumerate(Reading::instances, path, {everything, request.principal}, &requested);
    });
}

InstancesResult ObjectManager::Implementation::modifyInstance(Instance instance,
                                                              const InstanceRequest& request) {
    try {
        InstancesResult whole;
        whole.status = canonical(instance.path);
        if (whole.status.ok()) {
            whole.status = checkTexts(instance);
        }
        if (!whole.status.ok()) {
            return whole;
        }
        canonicalizeReferences(instance.properties, nameSpaces_);
        const ServedClass* const owner = ownerOf(instance.path, request.principal);
        if (owner == nullptr) {
            whole.status = {CMPI_RC_ERR_NOT_FOUND, ""};
            return whole;
        }
        instance.path.className = owner->declaration->name;
        CallOutcome outcome = callModify(*owner, instance, request);
        whole.status = std::move(outcome.status);
        whole.returnDoneCalls = outcome.returnDoneCalls;
        return whole;
    } catch (const broker::ConversionError& error) {
        return {{CMPI_RC_ERR_INVALID_PARAMETER, error.what()}, {}, 0};
    }
}

}  // namespace cimom
