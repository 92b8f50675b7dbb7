#pragma once

#include <string>
#include <string_view>

#include "cimom/Forward.h"

namespace cimdhcp {

struct Response;

/// The name of a status, also of those that only servers give (DSP0200, 5.2.7).
[[nodiscard]] std::string_view statusNameOf(const cimom::Status& status) noexcept;

/// The message for a response that is not OK, on one line: the name of its status, and
/// the words of the provider or object manager or else what the status means for the
/// path of the request.
[[nodiscard]] std::string statusMessage(const Response& response, const cimom::ObjectPath& asked);

}  // namespace cimdhcp
