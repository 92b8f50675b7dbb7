#pragma once

#include <optional>
#include <string>

#include "http/HttpHead.h"
#include "wbem/Limits.h"
#include "wbem/Pages.h"

namespace cimom::wbem {

/// Looks at the head of a request for a page. Throws HttpFailure for other methods than GET and
/// HEAD, for a request with a body, for one that is ambiguous, and for one that is too long.
/// The value of the header Authorization, if there is one.
std::optional<std::string> checkPageRequest(std::string_view method, std::string_view version,
                                            const PageRequest& request, const Limits& limits);

}  // namespace cimom::wbem
