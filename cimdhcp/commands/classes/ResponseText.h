#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

#include "cimom/Forward.h"
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

/// One of these blocks, indented.
[[nodiscard]] std::string instanceText(const cimom::Instance& instance,
                                       const cimom::ClassDeclaration* declaration,
                                       std::optional<std::size_t> width, const Style& style,
                                       std::size_t indentation = 0);

/// The response as MOF instance declarations, with the meaning of enumerated values
/// in comments. A path becomes a declaration of its keys alone; what the provider
/// delivered as null becomes a comment.
[[nodiscard]] std::string asMof(const Response& response, const ClassLookup& classes);

/// The response as one JSON object with a line feed at its end:
/// {"operation", "status": {"code", "name"}, "paths": [TEXT...], "instances": [see
/// instanceJson()...]}. With internals it has "returnDone" behind the status: how often the
/// provider called that, null in a response of a server.
[[nodiscard]] std::string asJson(const Response& response, bool internals);

// What has columns: PATH and the properties of the instances' classes, whether they have a
// value or not. `columns` names those that are wanted, none: all. Throw Failure when there is
// no such column.

/// The response as a table with a line per path or instance; "-" is what there is not.
[[nodiscard]] std::string asColumns(const Response& response, const ClassLookup& classes,
                                    const std::vector<std::string>& columns,
                                    std::optional<std::size_t> width, const Style& style = {});

/// The same for programs: values with tabs between them and without their meanings, arrays as
/// MOF has them, nothing for what there is not.
[[nodiscard]] std::string asTsv(const Response& response, const ClassLookup& classes,
                                const std::vector<std::string>& columns, bool header);

/// Sorts the paths of a response by their text, or its instances by PATH or one of their
/// properties; instances without the property come last. Throws Failure when no instance
/// has it.
void sortResponse(const std::string& wanted, Response& response);

}  // namespace cimdhcp
