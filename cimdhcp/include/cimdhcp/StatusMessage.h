#pragma once

#include <string>

#include "cimdhcp/Answer.h"
#include "cimom/Cim.h"

namespace cimdhcp {

/// What is told of an answer that is not OK, on one line: the name of its status,
/// and the provider's or object manager's own words or else what the status means
/// for the path that was asked for.
[[nodiscard]] std::string statusMessage(const Answer& answer, const cimom::ObjectPath& asked);

}  // namespace cimdhcp
