#include "manager/AssociationFilter.h"

#include <algorithm>
#include <string_view>

#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "cimom/Names.h"
#include "cimom/Requests.h"
#include "manager/PathMatch.h"

namespace cimom {

namespace {

struct End {
    std::string_view role;
    const ObjectPath* object;
};

/// The references of an association: keys first, then properties that are not keys.
std::vector<End> endsOf(const Instance& association) {
    std::vector<End> ends;
    const auto add = [&ends](const NamedValue& named) {
        const Scalar* const scalar = named.value.scalar();
        const auto* const reference =
            scalar == nullptr ? nullptr : std::get_if<std::shared_ptr<const ObjectPath>>(scalar);
        const bool known = std::any_of(ends.begin(), ends.end(), [&named](const End& end) {
            return sameName(end.role, named.name);
        });
        if (reference != nullptr && !known) {
            ends.push_back({named.name, reference->get()});
        }
    };
    std::for_each(association.path.keys.begin(), association.path.keys.end(), add);
    std::for_each(association.properties.begin(), association.properties.end(), add);
    return ends;
}

bool isRole(std::string_view name, const std::optional<std::string>& role) noexcept {
    return !role || sameName(name, *role);
}

bool hasRole(const End& end, const std::optional<std::string>& role) noexcept {
    return isRole(end.role, role);
}

bool takes(const PropertyDeclaration& reference, const std::optional<std::string>& className,
           const ClassRepository& repository) {
    return !className || repository.isA(*className, reference.referenceClass) ||
           repository.isA(reference.referenceClass, *className);
}

}  // namespace

Status checkClasses(const AssociationRequest& request, const ClassRepository& repository) {
    for (const auto& className : {request.assocClass, request.resultClass}) {
        if (className && repository.find(*className) == nullptr) {
            return {CMPI_RC_ERR_INVALID_PARAMETER,
                    "no class \"" + *className + "\", by which the associations are to be chosen"};
        }
    }
    return {};
}

bool isOfClass(const std::string& className, const std::optional<std::string>& wanted,
               const ClassRepository& repository) {
    return !wanted || sameName(className, *wanted) || repository.isA(className, *wanted);
}

bool playsRole(const Instance& association, const ObjectPath& object,
               const std::optional<std::string>& role, const ClassRepository& repository) {
    const std::vector<End> ends = endsOf(association);
    return std::any_of(ends.begin(), ends.end(), [&](const End& end) {
        return hasRole(end, role) && sameObject(*end.object, object, repository);
    });
}

std::vector<ObjectPath> otherEnds(const Instance& association, const ObjectPath& source,
                                  const std::optional<std::string>& role,
                                  const std::optional<std::string>& resultRole,
                                  const ClassRepository& repository) {
    const std::vector<End> ends = endsOf(association);
    std::vector<ObjectPath> others;
    for (const End& far : ends) {
        const bool connected = std::any_of(ends.begin(), ends.end(), [&](const End& near) {
            return &near != &far && hasRole(near, role) &&
                   sameObject(*near.object, source, repository);
        });
        if (connected && hasRole(far, resultRole)) {
            others.push_back(*far.object);
        }
    }
    return others;
}

bool connects(const std::vector<Instance>& associations, const ObjectPath& source,
              const ObjectPath& other, const std::optional<std::string>& role,
              const std::optional<std::string>& resultRole, const ClassRepository& repository) {
    return std::any_of(associations.begin(), associations.end(), [&](const Instance& association) {
        const auto others = otherEnds(association, source, role, resultRole, repository);
        return std::any_of(others.begin(), others.end(), [&](const ObjectPath& each) {
            return sameObject(each, other, repository);
        });
    });
}

bool canConnect(const ClassDeclaration& association, const std::optional<std::string>& sourceClass,
                const std::optional<std::string>& otherClass,
                const std::optional<std::string>& role,
                const std::optional<std::string>& resultRole, const ClassRepository& repository) {
    if (!association.isAssociation()) {
        return true;
    }
    const auto& properties = association.properties;
    return std::any_of(properties.begin(), properties.end(), [&](const auto& near) {
        return near.type == Type::reference && isRole(near.name, role) &&
               takes(near, sourceClass, repository) &&
               std::any_of(properties.begin(), properties.end(), [&](const auto& far) {
                   return &far != &near && far.type == Type::reference &&
                          isRole(far.name, resultRole) && takes(far, otherClass, repository);
               });
    });
}

}  // namespace cimom
