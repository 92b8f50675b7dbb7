#pragma once

#include "cimom/Query.h"
#include "operations/Request.h"

namespace cimom::wbem {

struct RequestedQuery {
    Query query;
    const ClassDeclaration& declaration;  ///< of the class behind FROM
};

/// Reads a query from two parameters of a request. Throws CimError for a language that is not
/// known, a text that is not a query, and a class that there is not.
[[nodiscard]] RequestedQuery requiredQuery(Request& request, const char* languageParameter,
                                           const char* textParameter);

}  // namespace cimom::wbem
