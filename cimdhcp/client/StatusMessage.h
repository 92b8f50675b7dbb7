#pragma once

#include <string>
#include <string_view>

#include "client/Answer.h"

namespace cimdhcp {

/// The name of a status, with those that only servers give (DSP0200, 5.2.7).
[[nodiscard]] std::string_view statusNameOf(const cimom::Status& status) noexcept;

/// What is told of an answer that is not OK, on one line: the name of its status,
/// and the provider's or object manager's own words or else what the status means
/// for the path that was asked for.
[[nodiscard]] std::string statusMessage(const Answer& answer, const cimom::ObjectPath& asked);

}  // namespace cimdhcp
