#pragma once

#include <cstddef>
#include <optional>
#include <string>

#include "client/ClassLookup.h"
#include "client/Response.h"
#include "text/Style.h"

namespace cimdhcp {

/// The answer for a person: a path per line, or a block per instance with its
/// path and below it "Property = value (meaning)", aligned; properties that are
/// null are left out. With a width, long values go on in further lines. Paths are
/// never broken, so that they can be copied.
[[nodiscard]] std::string asTable(const Answer& answer, const ClassLookup& classes,
                                  std::optional<std::size_t> width, const Style& style = {});

}  // namespace cimdhcp
