#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <utility>
#include <variant>
#include <vector>

#include "cimom/Forward.h"

namespace cimdhcp {

struct Json;

using JsonList = std::vector<Json>;
using JsonMembers = std::vector<std::pair<std::string, Json>>;  ///< of an object, in this order
/// The text of a whole document, which becomes a part of another one.
struct JsonDocument {
    std::string text;
};

/// A JSON value that is to be written. The library that writes it is slow to compile,
/// and so known to one source file alone.
struct Json : std::variant<std::nullptr_t, bool, std::int64_t, std::uint64_t, double, std::string,
                           JsonList, JsonMembers, JsonDocument> {
    using variant::variant;
};

/// The text, or null for an empty one.
[[nodiscard]] Json textOrNull(const std::string& text);

/// The value, indented by two blanks, with a line feed at its end; bytes that are not
/// UTF-8 become U+FFFD.
[[nodiscard]] std::string jsonText(const Json& value);
/// The same on one line.
[[nodiscard]] std::string jsonLine(const Json& value);

/// {"path", "class", "properties": {NAME: {"type", "value"}}}. What is null stays
/// null. References are path texts, embedded instances objects of this form, and reals
/// that are not numbers the texts "NaN", "INF" and "-INF".
[[nodiscard]] Json instanceJson(const cimom::Instance& instance);

}  // namespace cimdhcp
