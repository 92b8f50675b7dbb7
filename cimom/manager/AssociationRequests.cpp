// Requests about associations: which providers are asked, and what they leave
// to be filtered.
#include <algorithm>

#include "cimom/ClassDeclaration.h"
#include "manager/AssociationFilter.h"
#include "manager/ObjectManagerImplementation.h"

namespace cimom {

namespace {

const char* pointer(const std::optional<std::string>& text) noexcept {
    return text ? text->c_str() : nullptr;
}

Instance asInstance(const ObjectPath& path) {
    return {path, {}};
}
const Instance& asInstance(const Instance& instance) noexcept {
    return instance;
}
const ObjectPath& pathOf(const ObjectPath& path) noexcept {
    return path;
}
const ObjectPath& pathOf(const Instance& instance) noexcept {
    return instance.path;
}

/// Passes a result on, and knows whether there is anything in it that counts.
template <typename Object>
class CountedResult final : public ResultReceiver<Object> {
  public:
    explicit CountedResult(ResultReceiver<Object>& client) noexcept : client_(client) {}

    void beginCall() override {
        ofCall_ = 0;
        client_.beginCall();
    }
    void take(std::optional<Object> object) override {
        ++ofCall_;
        ++count_;
        client_.take(std::move(object));
    }
    void dropCall() override {
        count_ -= ofCall_;
        ofCall_ = 0;
        client_.dropCall();
    }

    [[nodiscard]] bool empty() const noexcept { return count_ == 0; }

  private:
    ResultReceiver<Object>& client_;
    std::size_t ofCall_ = 0;
    std::size_t count_ = 0;
};

/// The classes of each provider, in the order of the first, without own ones.
std::vector<std::pair<Provider*, std::vector<const ServedClass*>>> byProvider(
    const std::vector<const ServedClass*>& classes) {
    std::vector<std::pair<Provider*, std::vector<const ServedClass*>>> found;
    for (const ServedClass* const one : classes) {
        if (one->own != nullptr) {
            continue;
        }
        auto entry =
            std::ranges::find(found, one->provider, [](const auto& each) { return each.first; });
        if (entry == found.end()) {
            entry = found.insert(found.end(), {one->provider, {}});
        }
        entry->second.push_back(one);
    }
    return found;
}

}  // namespace

ObjectManager::Implementation::Associations ObjectManager::Implementation::associationsOf(
    const ObjectPath& source, const std::optional<std::string>& className,
    const AssociationRequest& request) const {
    Associations found;
    found.classes = className ? servedAssociations(*className, source.nameSpace) : associations_;
    found.exact = className && found.classes.size() == 1 &&
                  sameName(found.classes.front()->declaration->name, *className);
    // A provider is asked about any source if the client named its class, since what it
    // responds is the response.
    const auto sourceClass = found.exact ? std::nullopt : std::optional(source.className);
    std::erase_if(found.classes, [&](const ServedClass* one) {
        return !one->isIn(source.nameSpace) ||
               !canConnect(*one->declaration, sourceClass, std::nullopt, request.role,
                           request.resultRole, repository_);
    });
    return found;
}

bool ObjectManager::Implementation::canBeAssociator(const ServedClasses& associations,
                                                    const ObjectPath& source,
                                                    const std::string& className,
                                                    const AssociationRequest& request) const {
    return repository_.find(className) == nullptr ||
           std::ranges::any_of(associations, [&](const ServedClass* one) {
               return canConnect(*one->declaration, source.className, className, request.role,
                                 request.resultRole, repository_);
           });
}

CallOutcome ObjectManager::Implementation::noted(const Provider& provider, const ObjectPath& path,
                                                 CallOutcome outcome) const {
    const Status& status = outcome.status;
    if (!status.ok() && (status.noProvider || !hasNothing(status)) && configuration_.log) {
        configuration_.log("provider " + provider.name() +
                           " failed in a request about associations of a " + path.className + ": " +
                           std::string(statusName(status.code)) +
                           (status.message.empty() ? "" : ": " + status.message));
    }
    return outcome;
}

template <typename Slot, typename Invoke>
CallOutcome ObjectManager::Implementation::callAssociation(
    Provider& provider, Slot CMPIAssociationMIFT::*slot, const char* name, const ObjectPath& path,
    const std::string& principal, const AnyReceiver& receiver, Invoke&& invoke) {
    Status status;
    CMPIAssociationMI* const mi = provider.association(path.nameSpace, status);
    if (mi == nullptr) {
        return {std::move(status)};
    }
    const Slot function = mi->ft->*slot;
    if (function == nullptr) {
        return missingSlot(provider.name(), name);
    }
    return callProvider(settings(principal, 0), receiver,
                        "provider " + provider.name() + ": " + name, path,
                        [&](const auto* context, const auto* result, const auto* op) {
                            return invoke(function, mi, context, result, op);
                        });
}

CallOutcome ObjectManager::Implementation::callAssociators(Provider& provider,
                                                           const ObjectPath& path,
                                                           const AssociationRequest& request,
                                                           const AnyReceiver& receiver) {
    const auto call = [&](auto slot, const char* name, auto... further) {
        return callAssociation(
            provider, slot, name, path, request.principal, receiver,
            [&](auto function, auto* mi, const auto* context, const auto* result, const auto* op) {
                return function(mi, context, result, op, pointer(request.assocClass),
                                pointer(request.resultClass), pointer(request.role),
                                pointer(request.resultRole), further...);
            });
    };
    PropertyNames names(request.propertyList);
    return broker::wantsPaths(receiver)
               ? call(&CMPIAssociationMIFT::associatorNames, "associatorNames")
               : call(&CMPIAssociationMIFT::associators, "associators", names.pointer());
}

CallOutcome ObjectManager::Implementation::callReferences(Provider& provider,
                                                          const ObjectPath& path,
                                                          const std::string& resultClass,
                                                          const AssociationRequest& request,
                                                          const AnyReceiver& receiver) {
    const auto call = [&](auto slot, const char* name, auto... further) {
        return callAssociation(
            provider, slot, name, path, request.principal, receiver,
            [&](auto function, auto* mi, const auto* context, const auto* result, const auto* op) {
                return function(mi, context, result, op, resultClass.c_str(), pointer(request.role),
                                further...);
            });
    };
    PropertyNames names(request.propertyList);
    return broker::wantsPaths(receiver)
               ? call(&CMPIAssociationMIFT::referenceNames, "referenceNames")
               : call(&CMPIAssociationMIFT::references, "references", names.pointer());
}

CallOutcome ObjectManager::Implementation::callForAssociations(
    Provider& provider, const ServedClasses& classes, const ObjectPath& path,
    const std::string& principal, std::optional<std::vector<Instance>>& associations) {
    AssociationRequest all;
    all.principal = principal;
    CollectedObjects<Instance> collection;
    RequestedObjects<Instance> requested(collection, surroundings(path), all.propertyList);
    std::vector<CallOutcome> calls;
    for (const ServedClass* const one : classes) {
        calls.push_back(callReferences(provider, path, one->declaration->name, all, &requested));
    }
    if (std::ranges::all_of(calls, [](const CallOutcome& call) {
            return call.status.code == CMPI_RC_ERR_NOT_SUPPORTED;
        })) {
        return {};
    }
    associations.emplace();
    for (auto& instance : collection.objects) {
        if (instance) {
            associations->push_back(*std::move(instance));
        }
    }
    return {endOf(calls, false).status};
}

/// Every provider is asked once, for all of its associations. It compares classes by name,
/// and may leave the roles to others.
template <typename Object>
RequestEnd ObjectManager::Implementation::associated(ObjectPath path,
                                                     const AssociationRequest& request,
                                                     ResultReceiver<Object>& receiver) {
    return run(path, [&]() -> RequestEnd {
        CountedResult<Object> counted(receiver);
        if (Status status = checkClasses(request, repository_); !status.ok()) {
            return {std::move(status)};
        }
        AssociationRequest passed = request;
        if (passed.assocClass) {
            passed.assocClass = canonicalClass(*passed.assocClass);
        }
        if (passed.resultClass) {
            passed.resultClass = canonicalClass(*passed.resultClass);
            if (repository_.withSubclasses(*passed.resultClass).size() > 1) {
                // Providers compare result classes by name; a parent is filtered afterwards.
                passed.resultClass.reset();
            }
        }
        const Associations associations = associationsOf(path, request.assocClass, request);
        std::vector<CallOutcome> calls;
        for (const auto& [provider, classes] : byProvider(associations.classes)) {
            // Most objects of a result are of one class: what holds for it is kept.
            std::optional<std::string> judged;
            bool fits = false;
            const auto isWanted = [&, &its = classes](const Object& object) {
                const std::string& className = pathOf(object).className;
                if (judged != className) {
                    fits = isOfClass(className, request.resultClass, repository_) &&
                           canBeAssociator(its, path, className, request);
                    judged = className;
                }
                return fits;
            };
            const auto ask = [&, asked = provider](ResultReceiver<Object>& taker) {
                RequestedObjects<Object> requested(taker, surroundings(path), request.propertyList,
                                                   isWanted);
                return noted(*asked, path, callAssociators(*asked, path, passed, &requested));
            };
            if (!request.role && !request.resultRole) {
                calls.push_back(ask(counted));
                continue;
            }
            CollectedObjects<Object> collection;
            CallOutcome& call = calls.emplace_back(ask(collection));
            if (collection.objects.empty() || !call.status.ok()) {
                continue;
            }
            // The roles are known by further requests, which have to wait until the
            // provider has returned: it may hold a lock while it hands objects over. When
            // it cannot tell them, all of the result counts.
            std::optional<std::vector<Instance>> known;
            call.status =
                noted(*provider, path,
                      callForAssociations(*provider, classes, path, request.principal, known))
                    .status;
            if (!call.status.ok()) {
                continue;
            }
            counted.beginCall();
            for (auto& object : collection.objects) {
                if (!object || !known ||
                    connects(*known, path, pathOf(*object), request.role, request.resultRole,
                             repository_)) {
                    counted.take(std::move(object));
                }
            }
        }
        for (const ServedClass* const one : associations.classes) {
            if (one->own != nullptr) {
                calls.push_back(associatedByOwn(*one, path, request, counted));
            }
        }
        return endOfAssociations(calls, associations.exact, counted.empty());
    });
}

template <typename Object>
CallOutcome ObjectManager::Implementation::associatedByOwn(const ServedClass& target,
                                                           const ObjectPath& source,
                                                           const AssociationRequest& request,
                                                           ResultReceiver<Object>& receiver) {
    std::vector<Instance> associations;
    CallOutcome outcome = ownAssociations(target, source, request.role, associations);
    if (!outcome.status.ok()) {
        return outcome;
    }
    RequestedObjects<Object> requested(receiver, surroundings(source), request.propertyList);
    requested.beginCall();
    for (const Instance& association : associations) {
        for (const ObjectPath& other :
             otherEnds(association, source, request.role, request.resultRole, repository_)) {
            if (!isOfClass(other.className, request.resultClass, repository_)) {
                continue;
            }
            if constexpr (std::is_same_v<Object, ObjectPath>) {
                requested.take(other);
            } else {
                // An end that is gone meanwhile is not associated any more.
                InstancesResult found = getInstance(other, {std::nullopt, request.principal});
                if (found.status.ok() && !found.instances.empty()) {
                    requested.take(std::move(found.instances.front()));
                }
            }
        }
    }
    return outcome;
}

/// Providers know their association classes by their exact names.
template <typename Object>
RequestEnd ObjectManager::Implementation::referring(ObjectPath path,
                                                    const AssociationRequest& request,
                                                    ResultReceiver<Object>& receiver) {
    return run(path, [&]() -> RequestEnd {
        CountedResult<Object> counted(receiver);
        if (Status status = checkClasses(request, repository_); !status.ok()) {
            return {std::move(status)};
        }
        const auto isWanted = [&](const Object& object) {
            return isOfClass(pathOf(object).className, request.resultClass, repository_) &&
                   playsRole(asInstance(object), path, request.role, repository_);
        };
        RequestedObjects<Object> requested(counted, surroundings(path), request.propertyList,
                                           isWanted);
        const Associations associations = associationsOf(path, request.resultClass, request);
        std::vector<CallOutcome> calls;
        for (const ServedClass* const one : associations.classes) {
            if (one->own != nullptr) {
                std::vector<Instance> own;
                calls.push_back(ownAssociations(*one, path, request.role, own));
                requested.beginCall();
                for (Instance& association : own) {
                    if constexpr (std::is_same_v<Object, ObjectPath>) {
                        requested.take(std::move(association.path));
                    } else {
                        requested.take(std::move(association));
                    }
                }
                continue;
            }
            calls.push_back(noted(
                *one->provider, path,
                callReferences(*one->provider, path, one->declaration->name, request, &requested)));
        }
        return endOfAssociations(calls, associations.exact, counted.empty());
    });
}

RequestEnd ObjectManager::Implementation::associatorNames(ObjectPath path,
                                                          const AssociationRequest& request,
                                                          ResultReceiver<ObjectPath>& receiver) {
    return associated(std::move(path), request, receiver);
}

RequestEnd ObjectManager::Implementation::associators(ObjectPath path,
                                                      const AssociationRequest& request,
                                                      ResultReceiver<Instance>& receiver) {
    return associated(std::move(path), request, receiver);
}

RequestEnd ObjectManager::Implementation::referenceNames(ObjectPath path,
                                                         const AssociationRequest& request,
                                                         ResultReceiver<ObjectPath>& receiver) {
    return referring(std::move(path), request, receiver);
}

RequestEnd ObjectManager::Implementation::references(ObjectPath path,
                                                     const AssociationRequest& request,
                                                     ResultReceiver<Instance>& receiver) {
    return referring(std::move(path), request, receiver);
}

}  // namespace cimom
