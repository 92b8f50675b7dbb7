#pragma once

#include "cimom/Forward.h"
#include "text/JsonText.h"

namespace cimdhcp {

/// {"path", "class", "properties": {NAME: {"type", "value"}}}. What is null stays
/// null. References are path texts, embedded instances objects of this form, and reals
/// that are not numbers the texts "NaN", "INF" and "-INF".
[[nodiscard]] Json instanceJson(const cimom::Instance& instance);

}  // namespace cimdhcp
