#include "client/ClassList.h"

#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"

namespace cimdhcp {

std::vector<ClassEntry> servedClasses(const std::vector<cimom::Registration>& registrations,
                                      const cimom::ClassRepository& repository) {
    std::vector<ClassEntry> classes;
    for (const cimom::Registration& registration : registrations) {
        if (!registration.instance && !registration.association) {
            continue;  // of indications, which have no instances to be asked for
        }
        const cimom::ClassDeclaration* const declaration = repository.find(registration.className);
        if (declaration == nullptr) {
            continue;  // the object manager has refused such a registration before
        }
        classes.push_back({declaration->name, declaration->superclass, declaration->isAssociation(),
                           registration.provider, registration.nameSpaces});
    }
    return classes;
}

}  // namespace cimdhcp
