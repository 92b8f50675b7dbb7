#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "cimom/ObjectPath.h"
#include "text/ProgressBar.h"

namespace cimdhcp {

class Client;

/// An instance in a picture of the machine.
struct GraphNode {
    cimom::ObjectPath path;
    bool served = true;  ///< false: an association points at it, and no provider serves it

    bool operator==(const GraphNode&) const = default;
};

/// An association instance: from the instance that others depend on, or that has
/// the setting, the capability or the component, to the other one.
struct GraphEdge {
    std::string association;  ///< its class
    std::size_t from = 0;     ///< index into Graph::nodes
    std::size_t to = 0;

    bool operator==(const GraphEdge&) const = default;
};

struct Graph {
    std::vector<GraphNode> nodes;
    std::vector<GraphEdge> edges;

    bool operator==(const Graph&) const = default;
};

/// Puts instances and associations together. A reference means the first instance
/// of its class that agrees with all keys of the reference (one may name fewer keys
/// than the instance has); where there is none, the reference gets a node of its own.
/// An association without two references is left out.
[[nodiscard]] Graph connect(const std::vector<cimom::ObjectPath>& elements,
                            const std::vector<cimom::ObjectPath>& associations);

/// All that the providers serve; each class is a step. Throws Failure for any response that is
/// not OK.
[[nodiscard]] Graph graphOfMachine(Client& client, const TellStep& tell = untold);

/// The graph in the language of Graphviz, with everything that steers the drawing.
[[nodiscard]] std::string graphvizText(const Graph& graph);

/// Draws a graph as SVG with the program "dot" of Graphviz, which is looked for along
/// PATH. Throws Failure with ExitStatus::notLoaded when the
/// program is not installed, and when it fails; its own words are on standard error.
[[nodiscard]] std::string drawSvg(const std::string& graphviz);

}  // namespace cimdhcp
