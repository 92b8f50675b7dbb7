#pragma once

#include <vector>

#include "commands/Findings.h"

namespace cimdhcp {

class Client;

/// Asks an object manager for each class of this project, as its clients do, and tells which
/// of the responses are wrong, and what that comes from: a library that is not found, a class
/// without a provider, missing neighbours, the exact provider without its gateway. Of each
/// class, the first and the last instance are asked for and followed. Throws Failure
/// when the first request has no response.
[[nodiscard]] std::vector<Finding> serverFindings(Client& client);

}  // namespace cimdhcp
