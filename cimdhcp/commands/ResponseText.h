#pragma once

#include <cstddef>
#include <optional>
#include <string>

#include "client/ClassLookup.h"
#include "text/Style.h"

namespace cimdhcp {

struct Response;

/// The response for a person: a path per line, or a block per instance with its
/// path and below it "Property = value (meaning)", aligned; properties that are
/// null are left out. With a width, long values go on in further lines. Paths are
/// never broken, so that they can be copied.
[[nodiscard]] std::string asTable(const Response& response, const ClassLookup& classes,
                                  std::optional<std::size_t> width, const Style& style = {});

/// The response as MOF instance declarations, with the meaning of enumerated values
/// in comments. A path becomes a declaration of its keys alone; what the provider
/// delivered as null becomes a comment.
[[nodiscard]] std::string asMof(const Response& response, const ClassLookup& classes);

/// The response as one JSON object with a line feed at its end:
/// {"operation", "status": {"code", "name"}, "returnDone", "paths": [TEXT...],
/// "instances": [see instanceJson()...]}. "returnDone" is null in a response of a
/// server.
[[nodiscard]] std::string asJson(const Response& response);

/// Sorts the paths of a response by their text, or its instances by PATH or one of their
/// properties; instances without the property come last. Throws Failure when no instance
/// has it.
void sortResponse(const std::string& wanted, Response& response);

}  // namespace cimdhcp
