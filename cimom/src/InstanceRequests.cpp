// Requests about instances: which providers are asked, and how.
#include <algorithm>

#include "ObjectManagerImplementation.h"
#include "PathMatch.h"
#include "RequestPath.h"

namespace cimom {

namespace {

CallOutcome failed(Status status) {
    return {std::move(status), {}};
}

CallOutcome withoutSlot(const Provider& provider, const char* slot) {
    return failed(
        {CMPI_RC_ERR_NOT_SUPPORTED, "provider " + provider.name() + " does not offer " + slot});
}

}  // namespace

CallOutcome ObjectManager::Implementation::callReading(const ServedClass& target, Reading reading,
                                                       ObjectPath path,
                                                       const InstanceRequest& request) {
    Status status;
    CMPIInstanceMI* const mi = target.provider->instance(path.nameSpace, status);
    if (mi == nullptr) {
        return failed(std::move(status));
    }
    // The provider sees the class that it serves, not the parent that was asked for.
    path.className = target.declaration->name;
    const CMPIInstanceMIFT& table = *mi->ft;
    const std::string who = "provider " + target.provider->name() + ": ";
    if (reading == Reading::names) {
        if (table.enumerateInstanceNames == nullptr) {
            return withoutSlot(*target.provider, "enumerateInstanceNames");
        }
        return callProvider(settings(request.principal, 0), Kind::paths,
                            who + "enumerateInstanceNames", path,
                            [&](const auto* context, const auto* result, const auto* op) {
                                return table.enumerateInstanceNames(mi, context, result, op);
                            });
    }
    const bool one = reading == Reading::one;
    const char* const slot = one ? "getInstance" : "enumerateInstances";
    const auto function = one ? table.getInstance : table.enumerateInstances;
    if (function == nullptr) {
        return withoutSlot(*target.provider, slot);
    }
    PropertyNames names(request.propertyList);
    const CMPIFlags flags = one ? 0 : CMPI_FLAG_DeepInheritance;
    return callProvider(settings(request.principal, flags), Kind::instances, who + slot, path,
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
        return failed(std::move(status));
    }
    const auto function = mi->ft->modifyInstance;
    if (function == nullptr) {
        return withoutSlot(*target.provider, "modifyInstance");
    }
    PropertyNames names(request.propertyList);
    // In memory of its own: that of the call begins and ends with the call.
    broker::Arena arena;
    const CMPIInstance* const changed = broker::toRecord(arena, &*schema_, instance);
    return callProvider(settings(request.principal, 0), Kind::instances,
                        "provider " + target.provider->name() + ": modifyInstance", instance.path,
                        [&](const auto* context, const auto* result, const auto* op) {
                            return function(mi, context, result, op, changed, names.pointer());
                        });
}

ObjectManager::Implementation::Outcomes ObjectManager::Implementation::enumerate(
    Reading reading, const ObjectPath& path, const InstanceRequest& request) {
    Outcomes outcomes;
    const ServedClasses targets = servedInstances(path.className, path.nameSpace);
    outcomes.exact =
        targets.size() == 1 && sameName(targets.front()->declaration->name, path.className);
    for (const ServedClass* const target : targets) {
        outcomes.calls.push_back(callReading(*target, reading, path, request));
    }
    return outcomes;
}

PathsResult ObjectManager::Implementation::enumerateInstanceNames(ObjectPath path,
                                                                  const InstanceRequest& request) {
    try {
        if (Status status = canonical(path); !status.ok()) {
            return {std::move(status), {}, 0};
        }
        return pathsFrom(enumerate(Reading::names, path, request), path.nameSpace);
    } catch (const broker::ConversionError& error) {
        return {{CMPI_RC_ERR_INVALID_PARAMETER, error.what()}, {}, 0};
    }
}

InstancesResult ObjectManager::Implementation::enumerateInstances(ObjectPath path,
                                                                  const InstanceRequest& request) {
    try {
        if (Status status = canonical(path); !status.ok()) {
            return {std::move(status), {}, 0};
        }
        InstancesResult result =
            instancesFrom(enumerate(Reading::instances, path, request), path.nameSpace);
        applyPropertyList(result, request.propertyList);
        return result;
    } catch (const broker::ConversionError& error) {
        return {{CMPI_RC_ERR_INVALID_PARAMETER, error.what()}, {}, 0};
    }
}

InstancesResult ObjectManager::Implementation::getFrom(const ServedClass& target,
                                                       const ObjectPath& path,
                                                       const InstanceRequest& request) {
    Outcomes outcomes;
    outcomes.exact = sameName(target.declaration->name, path.className);
    outcomes.calls.push_back(callReading(target, Reading::one, path, request));
    InstancesResult result = instancesFrom(std::move(outcomes), path.nameSpace);
    if (!result.status.ok()) {
        return result;
    }
    const auto found = std::find_if(
        result.instances.begin(), result.instances.end(),
        [&path](const auto& instance) { return instance && hasKeys(*instance, path); });
    if (found == result.instances.end()) {
        result.status = {CMPI_RC_ERR_NOT_FOUND, ""};
        result.instances.clear();
        return result;
    }
    std::swap(result.instances.front(), *found);
    result.instances.resize(1);
    return result;
}

InstancesResult ObjectManager::Implementation::getInstance(ObjectPath path,
                                                           const InstanceRequest& request) {
    try {
        InstancesResult answer;
        answer.status = canonical(path);
        if (!answer.status.ok()) {
            return answer;
        }
        answer.status = {CMPI_RC_ERR_NOT_FOUND, ""};
        for (const ServedClass* const target : servedInstances(path.className, path.nameSpace)) {
            InstancesResult result = getFrom(*target, path, request);
            result.returnDoneCalls += answer.returnDoneCalls;
            // After an error, another class may still have the instance; the first
            // error that tells more than that nothing was found is kept.
            if (result.status.ok() || answer.status.code == CMPI_RC_ERR_NOT_FOUND) {
                answer = std::move(result);
            } else {
                answer.returnDoneCalls = result.returnDoneCalls;
            }
            if (answer.status.ok()) {
                applyPropertyList(answer, request.propertyList);
                break;
            }
        }
        return answer;
    } catch (const broker::ConversionError& error) {
        return {{CMPI_RC_ERR_INVALID_PARAMETER, error.what()}, {}, 0};
    }
}

InstancesResult ObjectManager::Implementation::modifyInstance(Instance instance,
                                                              const InstanceRequest& request) {
    try {
        InstancesResult answer;
        answer.status = canonical(instance.path);
        if (answer.status.ok()) {
            answer.status = checkTexts(instance);
        }
        if (!answer.status.ok()) {
            return answer;
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
            Outcomes outcomes;
            outcomes.exact = true;
            outcomes.calls.push_back(callModify(*target, instance, request));
            answer = instancesFrom(std::move(outcomes), wanted.nameSpace);
            // Whatever the provider delivered: a modification has no result.
            answer.instances.clear();
            return answer;
        }
        answer.status = {CMPI_RC_ERR_NOT_FOUND, ""};
        return answer;
    } catch (const broker::ConversionError& error) {
        return {{CMPI_RC_ERR_INVALID_PARAMETER, error.what()}, {}, 0};
    }
}

}  // namespace cimom
