#pragma once

#include <chrono>
#include <string>

namespace cimdhcp {

/// "0.123 s"
[[nodiscard]] std::string durationText(std::chrono::duration<double> duration);

}  // namespace cimdhcp
