#pragma once

#include <string>
#include <vector>

#include "cimom/ClassDeclaration.h"
#include "mof/MofSyntax.h"
#include "mof/QualifierTypes.h"

namespace cimom {

/// A reference that a class declares. The class that it names may come later.
struct ReferenceUse {
    std::string file;
    MofPosition position;  ///< of the class name
    std::string className;
    std::string formerClass;  ///< what an override narrows; empty when it is none
};

struct ResolvedClass {
    ClassDeclaration declaration;
    std::vector<ReferenceUse> references;
};

/// Resolves a class against its superclass (null for a root) by the rules of
/// DSP0004, 5.1 and 5.6: what overrides may change, which qualifiers pass on,
/// where keys and references may stand. Throws MofError at the first breach.
[[nodiscard]] ResolvedClass resolveClass(const MofClass& written,
                                         const ClassDeclaration* superclass,
                                         const QualifierTypes& types, const std::string& file);

}  // namespace cimom
