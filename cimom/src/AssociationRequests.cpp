// Requests about associations: which providers are asked, and what they leave
// to be filtered.
#include <algorithm>

#include "AssociationFilter.h"
#include "ObjectManagerImplementation.h"

namespace cimom {

namespace {

const char* pointer(const std::optional<std::string>& text) noexcept {
    return text ? text->c_str() : nullptr;
}

CallOutcome failed(Status status) {
    return {std::move(status), {}};
}

CallOutcome withoutSlot(const Provider& provider, const char* slot) {
    return failed(
        {CMPI_RC_ERR_NOT_SUPPORTED, "provider " + provider.name() + " does not offer " + slot});
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

/// Removes what `keep` refuses. Absent entries stay: they are no objects that a
/// filter could judge.
template <typename Item, typename Keep>
void filter(std::vector<std::optional<Item>>& items, Keep&& keep) {
    std::erase_if(items, [&keep](const auto& item) { return item && !keep(*item); });
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

CallOutcome ObjectManager::Implementation::callAssociators(Provider& provider, Kind kind,
                                                           const ObjectPath& path,
                                                           const AssociationRequest& request) {
    Status status;
    CMPIAssociationMI* const mi = provider.association(path.nameSpace, status);
    if (mi == nullptr) {
        return failed(std::move(status));
    }
    const CMPIAssociationMIFT& table = *mi->ft;
    const char* const slot = kind == Kind::paths ? "associatorNames" : "associators";
    const std::string who = "provider " + provider.name() + ": " + slot;
    PropertyNames names(request.propertyList);
    if (kind == Kind::paths ? table.associatorNames == nullptr : table.associators == nullptr) {
        return withoutSlot(provider, slot);
    }
    return callProvider(
        settings(request.principal, 0), kind, who, path,
        [&](const auto* context, const auto* result, const auto* op) {
            return kind == Kind::paths
                       ? table.associatorNames(mi, context, result, op, pointer(request.assocClass),
                                               pointer(request.resultClass), pointer(request.role),
                                               pointer(request.resultRole))
                       : table.associators(mi, context, result, op, pointer(request.assocClass),
                                           pointer(request.resultClass), pointer(request.role),
                                           pointer(request.resultRole), names.pointer());
        });
}

CallOutcome ObjectManager::Implementation::callReferences(Provider& provider, Kind kind,
                                                          const ObjectPath& path,
                                                          const std::string& resultClass,
                                                          const AssociationRequest& request) {
    Status status;
    CMPIAssociationMI* const mi = provider.association(path.nameSpace, status);
    if (mi == nullptr) {
        return failed(std::move(status));
    }
    const CMPIAssociationMIFT& table = *mi->ft;
    const char* const slot = kind == Kind::paths ? "referenceNames" : "references";
    const std::string who = "provider " + provider.name() + ": " + slot;
    PropertyNames names(request.propertyList);
    if (kind == Kind::paths ? table.referenceNames == nullptr : table.references == nullptr) {
        return withoutSlot(provider, slot);
    }
    return callProvider(
        settings(request.principal, 0), kind, who, path,
        [&](const auto* context, const auto* result, const auto* op) {
            return kind == Kind::paths
                       ? table.referenceNames(mi, context, result, op, resultClass.c_str(),
                                              pointer(request.role))
                       : table.references(mi, context, result, op, resultClass.c_str(),
                                          pointer(request.role), names.pointer());
        });
}

/// Every association provider is asked once, for all of its associations.
ObjectManager::Implementation::Outcomes ObjectManager::Implementation::askAssociators(
    Kind kind, const ObjectPath& path, const AssociationRequest& request) {
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
        outcomes.calls.push_back(callAssociators(*provider, kind, path, passed));
    }
    // Of several providers, those that answered count; what all of them refuse is refused.
    const auto answered = [](const CallOutcome& call) {
        return call.status.code != CMPI_RC_ERR_INVALID_CLASS &&
               call.status.code != CMPI_RC_ERR_NOT_SUPPORTED &&
               call.status.code != CMPI_RC_ERR_NOT_FOUND;
    };
    if (!outcomes.calls.empty() &&
        std::none_of(outcomes.calls.begin(), outcomes.calls.end(), answered)) {
        outcomes.calls.resize(1);
        outcomes.exact = true;
    }
    return outcomes;
}

/// Providers know their association classes by their exact names.
ObjectManager::Implementation::Outcomes ObjectManager::Implementation::askReferences(
    Kind kind, const ObjectPath& path, const AssociationRequest& request) {
    Outcomes outcomes;
    if (request.resultClass && repository_.find(*request.resultClass) == nullptr) {
        // Unknown here; the providers say what that means.
        for (Provider* const provider : associationProviders(path.nameSpace)) {
            outcomes.calls.push_back(
                callReferences(*provider, kind, path, *request.resultClass, request));
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
            callReferences(*target->provider, kind, path, target->declaration->name, request));
    }
    return outcomes;
}

std::optional<std::vector<Instance>> ObjectManager::Implementation::associationsOf(
    const ObjectPath& path, const AssociationRequest& request) {
    AssociationRequest wanted;
    wanted.resultClass = request.assocClass;
    wanted.principal = request.principal;
    Outcomes outcomes = askReferences(Kind::instances, path, wanted);
    const auto unsupported = [](const CallOutcome& call) {
        return call.status.code == CMPI_RC_ERR_NOT_SUPPORTED;
    };
    if (!outcomes.calls.empty() &&
        std::all_of(outcomes.calls.begin(), outcomes.calls.end(), unsupported)) {
        return std::nullopt;
    }
    std::vector<Instance> associations;
    for (auto& instance : instancesFrom(std::move(outcomes), path.nameSpace).instances) {
        if (instance) {
            associations.push_back(std::move(*instance));
        }
    }
    return associations;
}

namespace {

/// What a provider may have left unfiltered of an associator request.
/// `associations` is asked for only when there is something to filter by role.
template <typename Item, typename Associations>
void filterAssociators(std::vector<std::optional<Item>>& items, const ObjectPath& source,
                       const AssociationRequest& request, const ClassRepository& repository,
                       Associations&& associations) {
    filter(items, [&](const Item& item) {
        return isOfClass(pathOf(item).className, request.resultClass, repository);
    });
    if (items.empty() || (!request.role && !request.resultRole)) {
        return;
    }
    // Without anyone who could tell the roles, the provider's own answer counts.
    if (const auto known = associations()) {
        filter(items, [&](const Item& item) {
            return connects(*known, source, pathOf(item), request.role, request.resultRole,
                            repository);
        });
    }
}

template <typename Item>
void filterReferences(std::vector<std::optional<Item>>& items, const ObjectPath& source,
                      const AssociationRequest& request, const ClassRepository& repository) {
    filter(items, [&](const Item& item) {
        return isOfClass(pathOf(item).className, request.resultClass, repository) &&
               playsRole(asInstance(item), source, request.role, repository);
    });
}

Status refusal(const broker::ConversionError& error) {
    return {CMPI_RC_ERR_INVALID_PARAMETER, error.what()};
}

}  // namespace

PathsResult ObjectManager::Implementation::associatorNames(ObjectPath path,
                                                           const AssociationRequest& request) {
    try {
        if (Status status = canonical(path); !status.ok()) {
            return {std::move(status), {}, 0};
        }
        PathsResult result = pathsFrom(askAssociators(Kind::paths, path, request), path.nameSpace);
        filterAssociators(result.paths, path, request, repository_,
                          [&] { return associationsOf(path, request); });
        return result;
    } catch (const broker::ConversionError& error) {
        return {refusal(error), {}, 0};
    }
}

InstancesResult ObjectManager::Implementation::associators(ObjectPath path,
                                                           const AssociationRequest& request) {
    try {
        if (Status status = canonical(path); !status.ok()) {
            return {std::move(status), {}, 0};
        }
        InstancesResult result =
            instancesFrom(askAssociators(Kind::instances, path, request), path.nameSpace);
        filterAssociators(result.instances, path, request, repository_,
                          [&] { return associationsOf(path, request); });
        applyPropertyList(result, request.propertyList);
        return result;
    } catch (const broker::ConversionError& error) {
        return {refusal(error), {}, 0};
    }
}

PathsResult ObjectManager::Implementation::referenceNames(ObjectPath path,
                                                          const AssociationRequest& request) {
    try {
        if (Status status = canonical(path); !status.ok()) {
            return {std::move(status), {}, 0};
        }
        PathsResult result = pathsFrom(askReferences(Kind::paths, path, request), path.nameSpace);
        filterReferences(result.paths, path, request, repository_);
        return result;
    } catch (const broker::ConversionError& error) {
        return {refusal(error), {}, 0};
    }
}

InstancesResult ObjectManager::Implementation::references(ObjectPath path,
                                                          const AssociationRequest& request) {
    try {
        if (Status status = canonical(path); !status.ok()) {
            return {std::move(status), {}, 0};
        }
        InstancesResult result =
            instancesFrom(askReferences(Kind::instances, path, request), path.nameSpace);
        filterReferences(result.instances, path, request, repository_);
        applyPropertyList(result, request.propertyList);
        return result;
    } catch (const broker::ConversionError& error) {
        return {refusal(error), {}, 0};
    }
}

}  // namespace cimom
