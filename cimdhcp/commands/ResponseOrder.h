#pragma once

#include <string>

namespace cimdhcp {

struct Response;

/// Sorts the paths of a response by their text, or its instances by PATH or one of their
/// properties; instances without the property come last. Throws Failure when no instance
/// has it.
void sortResponse(const std::string& wanted, Response& response);

}  // namespace cimdhcp
