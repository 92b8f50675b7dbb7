#pragma once

#include <nlohmann/json_fwd.hpp>
#include <string>

#include "client/Response.h"

namespace cimdhcp {

/// The answer as one JSON object with a line feed at its end:
/// {"operation", "status": {"code", "name"}, "returnDone", "paths": [TEXT...],
/// "instances": [{"path", "class", "properties": {NAME: {"type", "value"}}}]}.
/// What is null stays null; "returnDone" is null in a server's answer. References are path texts,
/// embedded instances objects as in "instances", reals that are no number texts ("NaN", "INF",
/// "-INF").
[[nodiscard]] std::string asJson(const Answer& answer);

/// Writes any document in the same way: indented by two blanks, with a line feed
/// at its end; bytes that are no UTF-8 become U+FFFD.
[[nodiscard]] std::string jsonText(const nlohmann::ordered_json& document);

}  // namespace cimdhcp
