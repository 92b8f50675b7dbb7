#pragma once

#include <string>

namespace cimdhcp {

/// Draws a graph as SVG with the program "dot" of Graphviz, which is looked for along
/// PATH. Throws Failure with ExitStatus::notLoaded when the
/// program is not installed, and when it fails; its own words are on standard error.
[[nodiscard]] std::string drawSvg(const std::string& graphviz);

}  // namespace cimdhcp
