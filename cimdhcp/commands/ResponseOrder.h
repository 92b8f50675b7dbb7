#pragma once

#include <string>

#include "client/Response.h"

namespace cimdhcp {

/// Sorts what was answered by PATH or, instances, by one of their properties; what
/// lacks it comes last. Throws Failure when nothing has it.
void sortAnswer(const std::string& wanted, Answer& answer);

}  // namespace cimdhcp
