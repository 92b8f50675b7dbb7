#pragma once

#include "cimom/Forward.h"
#include "cimxml/XmlDocument.h"

namespace cimom::wbem {

/// Reads CLASS. Methods are passed over, as are the default values of embedded
/// instances. Inherited properties and qualifiers are there when the server was asked
/// for them. Throws NotValid for a wrong structure and CimError for a value that is
/// none of its type.
[[nodiscard]] ClassDeclaration readClass(const XmlElement& element);

}  // namespace cimom::wbem
