#pragma once

#include <ostream>

#include "arguments/Commands.h"

namespace cimdhcp {

/// Adds a user to the server's users file, or changes role and password. On a
/// terminal the password is asked for twice on `prompts`, without an echo; otherwise
/// it is the first line of standard input. Throws Failure.
void addUser(const UserAddCommand& command, std::ostream& out, std::ostream& prompts);

}  // namespace cimdhcp
