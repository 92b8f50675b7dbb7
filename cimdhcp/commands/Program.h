#pragma once

#include <string>
#include <vector>

#include "text/Presentation.h"

namespace cimdhcp {

/// Runs the program with the arguments behind its name, and returns its exit status.
/// Throws nothing: whatever fails is one line on `err`. It sets environment
/// variables and reads the platform's settings, which are read once per process.
int run(const std::vector<std::string>& arguments, const Outputs& outputs) noexcept;

}  // namespace cimdhcp
