// Requests about instances: which providers are asked, and how.
#include <algorithm>

#include "broker/objects/BrokerInstance.h"
#include "cimom/ClassDeclaration.h"
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
    Status status;
    CMPIInstanceMI* const mi = target.provider->instance(path.nameSpace, status);
    if (mi == nullptr) {
        return {std::move(status)};
    }
    // The provider sees the class that it serves, not the parent that was asked for.
    path.className = target.declaration->name;
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
        const ObjectPath wanted = instance.path;
        for (const ServedClass* const target :
             servedInstances(wanted.className, wanted.nameSpace)) {
            // A path of a parent class that is not served itself belongs to the
            // subclass that has the instance.
            const std::string& className = target->declaration->name;
            if (!sameName(className, wanted.className) &&
                !getFrom(*target, wanted, {std::nullopt, request.principal}).status.ok()) {
                continue;
            }
            instance.path.className = className;
            const CallOutcome outcome = callModify(*target, instance, request);
            whole.status = outcome.status;
            whole.returnDoneCalls = outcome.returnDoneCalls;
            return whole;
        }
        whole.status = {CMPI_RC_ERR_NOT_FOUND, ""};
        return whole;
    } catch (const broker::ConversionError& error) {
        return {{CMPI_RC_ERR_INVALID_PARAMETER, error.what()}, {}, 0};
    }
}

}  // namespace cimom
