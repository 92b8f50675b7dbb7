// Requests about instances: which providers are asked, and how.
#include <algorithm>

#include "manager/ObjectManagerImplementation.h"
#include "manager/PathMatch.h"
#include "manager/RequestPath.h"

namespace cimom {

namespace {

/// Keeps the first instance that agrees with every key of a path, of however many.
class FirstMatch final : public Receiver<Instance> {
  public:
    explicit FirstMatch(const ObjectPath& wanted) : wanted_(wanted) {}
    void take(std::optional<Instance> instance) override {
        if (!found && instance && hasKeys(*instance, wanted_)) {
            found = std::move(instance);
        }
    }
    [[nodiscard]] std::size_t mark() override { return found ? 1 : 0; }
    void backTo(std::size_t mark) override {
        if (mark == 0) {
            found.reset();
        }
    }

    std::optional<Instance> found;

  private:
    const ObjectPath& wanted_;
};

/// For calls that have no result, whatever the provider delivers.
Sink nowhere() {
    return {broker::ResultCollector::Kind::instances,
            {nullptr, [](const std::optional<Instance>&) {}},
            [] { return std::size_t{0}; },
            [](std::size_t) {}};
}

}  // namespace

CallOutcome ObjectManager::Implementation::callReading(const ServedClass& target, Reading reading,
                                                       ObjectPath path,
                                                       const InstanceRequest& request,
                                                       const Sink& sink) {
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
        return callProvider(settings(request.principal, 0), sink, who + "enumerateInstanceNames",
                            path, [&](const auto* context, const auto* result, const auto* op) {
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
    return callProvider(settings(request.principal, flags), sink, who + slot, path,
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
    const CMPIInstance* const changed = broker::toRecord(arena, &*schema_, instance);
    return callProvider(settings(request.principal, 0), nowhere(),
                        "provider " + target.provider->name() + ": modifyInstance", instance.path,
                        [&](const auto* context, const auto* result, const auto* op) {
                            return function(mi, context, result, op, changed, names.pointer());
                        });
}

ObjectManager::Implementation::Outcomes ObjectManager::Implementation::enumerate(
    Reading reading, const ObjectPath& path, const InstanceRequest& request, const Sink& sink) {
    Outcomes outcomes;
    const ServedClasses targets = servedInstances(path.className, path.nameSpace);
    outcomes.exact =
        targets.size() == 1 && sameName(targets.front()->declaration->name, path.className);
    for (const ServedClass* const target : targets) {
        outcomes.calls.push_back(callReading(*target, reading, path, request, sink));
    }
    return outcomes;
}

RequestEnd ObjectManager::Implementation::enumerateInstanceNames(ObjectPath path,
                                                                 const InstanceRequest& request,
                                                                 Receiver<ObjectPath>& receiver) {
    return run(path, [&] {
        return enumerate(Reading::names, path, request,
                         sinkTo(receiver, path.nameSpace, std::nullopt, everything));
    });
}

RequestEnd ObjectManager::Implementation::enumerateInstances(ObjectPath path,
                                                             const InstanceRequest& request,
                                                             Receiver<Instance>& receiver) {
    return run(path, [&] {
        return enumerate(Reading::instances, path, request,
                         sinkTo(receiver, path.nameSpace, request.propertyList, everything));
    });
}

InstancesResult ObjectManager::Implementation::getFrom(const ServedClass& target,
                                                       const ObjectPath& path,
                                                       const InstanceRequest& request) {
    FirstMatch match(path);
    // Keys may be among the properties that the client does not want to see.
    const std::optional<std::vector<std::string>> allProperties;
    const Sink sink = sinkTo(match, path.nameSpace, allProperties, everything);
    RequestEnd end = endOf({callReading(target, Reading::one, path, request, sink)},
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
            const CallOutcome outcome = callModify(*target, instance, request);
            answer.status = outcome.status;
            answer.returnDoneCalls = outcome.returnDoneCalls;
            return answer;
        }
        answer.status = {CMPI_RC_ERR_NOT_FOUND, ""};
        return answer;
    } catch (const broker::ConversionError& error) {
        return {{CMPI_RC_ERR_INVALID_PARAMETER, error.what()}, {}, 0};
    }
}

}  // namespace cimom
