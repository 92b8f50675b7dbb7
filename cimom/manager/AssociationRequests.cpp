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

}  // namespace

std::vector<Provider*> ObjectManager::Implementation::associationProviders(
    const std::string& nameSpace) const {
    std::vector<Provider*> found;
    for (const ServedClass& one : served_) {
        if (one.association && one.isIn(nameSpace) &&
            std::find(found.begin(), found.end(), one.provider) == found.end()) {
            found.push_back(one.provider);
        }
    }
    return found;
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

/// Every association provider is asked once, for all of its associations.
ObjectManager::Implementation::Outcomes ObjectManager::Implementation::askAssociators(
    const ObjectPath& path, const AssociationRequest& request, const AnyReceiver& receiver) {
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
    Outcomes outcomes;
    const std::vector<Provider*> providers = associationProviders(path.nameSpace);
    for (Provider* const provider : providers) {
        outcomes.calls.push_back(callAssociators(*provider, path, passed, receiver));
    }
    // Of several providers, those that have a result count; what all of them refuse is refused.
    const auto hasResult = [](const CallOutcome& call) {
        return call.status.code != CMPI_RC_ERR_INVALID_CLASS &&
               call.status.code != CMPI_RC_ERR_NOT_SUPPORTED &&
               call.status.code != CMPI_RC_ERR_NOT_FOUND;
    };
    if (!outcomes.calls.empty() &&
        std::none_of(outcomes.calls.begin(), outcomes.calls.end(), hasResult)) {
        outcomes.calls.resize(1);
        outcomes.exact = true;
    }
    return outcomes;
}

/// Providers know their association classes by their exact names.
ObjectManager::Implementation::Outcomes ObjectManager::Implementation::askReferences(
    const ObjectPath& path, const AssociationRequest& request, const AnyReceiver& receiver) {
    Outcomes outcomes;
    if (request.resultClass && repository_.find(*request.resultClass) == nullptr) {
        // Unknown here; the providers say what that means.
        for (Provider* const provider : associationProviders(path.nameSpace)) {
            outcomes.calls.push_back(
                callReferences(*provider, path, *request.resultClass, request, receiver));
        }
        outcomes.exact = outcomes.calls.size() == 1;
        return outcomes;
    }
    ServedClasses targets;
    if (request.resultClass) {
        targets = servedAssociations(*request.resultClass, path.nameSpace);
    } else {
        for (const ClassDeclaration* const declaration : repository_.classes()) {
            const auto entry = servedByName_.find(declaration->name);
            if (entry == servedByName_.end()) {
                continue;
            }
            for (const std::size_t index : entry->second) {
                if (served_[index].association && served_[index].isIn(path.nameSpace)) {
                    targets.push_back(&served_[index]);
                }
            }
        }
    }
    outcomes.exact = request.resultClass && targets.size() == 1 &&
                     sameName(targets.front()->declaration->name, *request.resultClass);
    for (const ServedClass* const target : targets) {
        outcomes.calls.push_back(
            callReferences(*target->provider, path, target->declaration->name, request, receiver));
    }
    return outcomes;
}

std::optional<std::vector<Instance>> ObjectManager::Implementation::associationsOf(
    const ObjectPath& path, const AssociationRequest& request) {
    AssociationRequest wanted;
    wanted.resultClass = request.assocClass;
    wanted.principal = request.principal;
    CollectedObjects<Instance> collection;
    RequestedObjects<Instance> requested(collection, surroundings(path), wanted.propertyList);
    const Outcomes outcomes = askReferences(path, wanted, &requested);
    const auto unsupported = [](const CallOutcome& call) {
        return call.status.code == CMPI_RC_ERR_NOT_SUPPORTED;
    };
    if (!outcomes.calls.empty() &&
        std::all_of(outcomes.calls.begin(), outcomes.calls.end(), unsupported)) {
        return std::nullopt;
    }
    std::vector<Instance> associations;
    if (endOf(outcomes.calls, outcomes.exact).status.ok()) {
        for (auto& instance : collection.objects) {
            if (instance) {
                associations.push_back(*std::move(instance));
            }
        }
    }
    return associations;
}

/// The provider compares classes by name, and may leave roles to others.
template <typename Object>
RequestEnd ObjectManager::Implementation::associated(ObjectPath path,
                                                     const AssociationRequest& request,
                                                     ResultReceiver<Object>& receiver) {
    const auto isWanted = [&](const Object& object) {
        return isOfClass(pathOf(object).className, request.resultClass, repository_);
    };
    if (!request.role && !request.resultRole) {
        return run(path, [&] {
            RequestedObjects<Object> requested(receiver, surroundings(path), request.propertyList,
                                               isWanted);
            return askAssociators(path, request, &requested);
        });
    }
    return run(path, [&] {
        CollectedObjects<Object> collection;
        RequestedObjects<Object> requested(collection, surroundings(path), request.propertyList,
                                           isWanted);
        Outcomes outcomes = askAssociators(path, request, &requested);
        if (collection.objects.empty() || !endOf(outcomes.calls, outcomes.exact).status.ok()) {
            return outcomes;
        }
        // The roles are known by further requests, which have to wait until the
        // provider has returned: it may hold a lock while it hands objects over. When no
        // provider can tell them, all of the result counts.
        const auto known = associationsOf(path, request);
        for (auto& object : collection.objects) {
            if (!object || !known ||
                connects(*known, path, pathOf(*object), request.role, request.resultRole,
                         repository_)) {
                receiver.take(std::move(object));
            }
        }
        return outcomes;
    });
}

template <typename Object>
RequestEnd ObjectManager::Implementation::referring(ObjectPath path,
                                                    const AssociationRequest& request,
                                                    ResultReceiver<Object>& receiver) {
    return run(path, [&] {
        const auto isWanted = [&](const Object& object) {
            return isOfClass(pathOf(object).className, request.resultClass, repository_) &&
                   playsRole(asInstance(object), path, request.role, repository_);
        };
        RequestedObjects<Object> requested(receiver, surroundings(path), request.propertyList,
                                           isWanted);
        return askReferences(path, request, &requested);
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
