#include "operations/ClassAssociations.h"

#include <algorithm>

#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Names.h"
#include "cimom/Requests.h"

namespace cimom::wbem {

namespace {

bool isOfClass(const ClassDeclaration& declaration, const std::optional<std::string>& wanted,
               const ClassRepository& repository) {
    return !wanted || repository.isA(declaration.name, *wanted);
}

bool hasRole(const PropertyDeclaration& reference, const std::optional<std::string>& role) {
    return !role || sameName(reference.name, *role);
}

/// Whether the class can stand in the reference, in that role.
bool takes(const PropertyDeclaration& reference, const ClassDeclaration& source,
           const std::optional<std::string>& role, const ClassRepository& repository) {
    return reference.type == Type::reference && hasRole(reference, role) &&
           repository.isA(source.name, reference.referenceClass);
}

}  // namespace

std::vector<const ClassDeclaration*> associationClasses(const ClassDeclaration& source,
                                                        const AssociationRequest& filter,
                                                        const ClassRepository& repository) {
    std::vector<const ClassDeclaration*> found;
    for (const ClassDeclaration* const association : repository.classes()) {
        const auto& properties = association->properties;
        if (association->isAssociation() &&
            isOfClass(*association, filter.resultClass, repository) &&
            std::any_of(properties.begin(), properties.end(), [&](const auto& reference) {
                return takes(reference, source, filter.role, repository);
            })) {
            found.push_back(association);
        }
    }
    return found;
}

std::vector<const ClassDeclaration*> associatedClasses(const ClassDeclaration& source,
                                                       const AssociationRequest& filter,
                                                       const ClassRepository& repository) {
    AssociationRequest associations;
    associations.resultClass = filter.assocClass;
    associations.role = filter.role;
    std::vector<const ClassDeclaration*> found;
    const auto add = [&](const PropertyDeclaration& reference) {
        const ClassDeclaration* const other = repository.find(reference.referenceClass);
        if (other != nullptr && hasRole(reference, filter.resultRole) &&
            isOfClass(*other, filter.resultClass, repository) &&
            std::find(found.begin(), found.end(), other) == found.end()) {
            found.push_back(other);
        }
    };
    for (const ClassDeclaration* const association :
         associationClasses(source, associations, repository)) {
        for (const PropertyDeclaration& near : association->properties) {
            if (!takes(near, source, filter.role, repository)) {
                continue;
            }
            for (const PropertyDeclaration& far : association->properties) {
                if (&far != &near && far.type == Type::reference) {
                    add(far);
                }
            }
        }
    }
    return found;
}

}  // namespace cimom::wbem
