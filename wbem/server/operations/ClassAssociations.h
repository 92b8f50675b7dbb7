#pragma once

#include <vector>

#include "cimom/Forward.h"

namespace cimom::wbem {

/// The association classes that can reference instances of the class, with the
/// filters of References (DSP0200, 5.4.2). In the order of the repository.
[[nodiscard]] std::vector<const ClassDeclaration*> associationClasses(
    const ClassDeclaration& source, const AssociationRequest& filter,
    const ClassRepository& repository);

/// The classes at the other ends of such associations, with the filters of
/// Associators; each once.
[[nodiscard]] std::vector<const ClassDeclaration*> associatedClasses(
    const ClassDeclaration& source, const AssociationRequest& filter,
    const ClassRepository& repository);

}  // namespace cimom::wbem
