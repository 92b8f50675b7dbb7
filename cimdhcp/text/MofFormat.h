#pragma once

#include <string>

#include "client/ClassLookup.h"
#include "client/Response.h"

namespace cimdhcp {

/// The answer as MOF instance declarations, with the meaning of enumerated values
/// in comments. A path becomes a declaration of its keys alone; what the provider
/// delivered as null a comment.
[[nodiscard]] std::string asMof(const Answer& answer, const ClassLookup& classes);

/// One instance without comments, on one line.
[[nodiscard]] std::string mofDeclaration(const cimom::Instance& instance);

}  // namespace cimdhcp
