#include "commands/Graph.h"

#include <algorithm>
#include <array>
#include <memory>
#include <optional>
#include <string_view>
#include <unordered_map>
#include <utility>

#include "cimom/Instance.h"
#include "cimom/Names.h"
#include "client/Client.h"
#include "client/Response.h"
#include "text/DisplayText.h"
#include "text/ValueMeaning.h"

namespace cimdhcp {

namespace {

/// The beginning of every served class name, which a picture leaves out.
constexpr std::string_view schemaPrefix = "QVXZR_";

/// The references from which an arrow goes out.
constexpr std::array<std::string_view, 3> tails{"Antecedent", "ManagedElement", "GroupComponent"};

/// One color for each kind of thing, light enough for black letters.
struct Fill {
    std::string_view classPart;  ///< stands in the class name
    std::string_view color;
};
constexpr std::array<Fill, 7> fills{{{"DHCPLease", "#fff59d"},
                                     {"ComputerSystem", "#cfd8dc"},
                                     {"DHCPProtocolEndpoint", "#a5d6a7"},
                                     {"IPProtocolEndpoint", "#c5e1a5"},
                                     {"ServiceAccessPoint", "#ffcc80"},
                                     {"Capabilities", "#b39ddb"},
                                     {"SettingData", "#90caf9"}}};

/// What is at no end of an association, and what leads to another namespace.
constexpr std::array<std::string_view, 4> leftOut{"QVXZR_DHCPInterface", "QVXZR_DHCPDiagnostic",
                                                  "QVXZR_RegisteredDHCPClientProfile",
                                                  "QVXZR_DHCPClientConformsToProfile"};

bool isLeftOut(const std::string& className) {
    return std::any_of(leftOut.begin(), leftOut.end(), [&className](std::string_view each) {
        return cimom::sameName(className, each);
    });
}

bool agrees(const cimom::ObjectPath& element, const cimom::ObjectPath& reference) {
    return cimom::sameName(element.className, reference.className) &&
           std::all_of(reference.keys.begin(), reference.keys.end(),
                       [&element](const cimom::NamedValue& key) {
                           const cimom::Value* const value = element.key(key.name);
                           return value != nullptr && *value == key.value;
                       });
}

/// The keys by which one instance differs from the others of its class.
constexpr std::array<std::string_view, 2> identifying{"InstanceID", "Name"};

/// Nodes under construction, found by what references say of them. A walk over all of them for
/// each reference would take half a minute on a machine of ten thousand interfaces.
class Nodes {
  public:
    void add(const cimom::ObjectPath& path, bool served) {
        for (const std::string_view name : identifying) {
            if (std::string text = heldText(path.key(name)); !text.empty()) {
                byText_[std::move(text)].push_back(nodes_.size());
            }
        }
        nodes_.push_back({path, served});
    }

    /// The first one that agrees; a new one, where there is none.
    std::size_t find(const cimom::ObjectPath& reference) {
        const auto means = [&](std::size_t node) { return agrees(nodes_[node].path, reference); };
        for (const std::string_view name : identifying) {
            if (const std::string text = heldText(reference.key(name)); !text.empty()) {
                const std::vector<std::size_t>& alike = byText_[text];
                const auto found = std::find_if(alike.begin(), alike.end(), means);
                return found == alike.end() ? addMissing(reference) : *found;
            }
        }
        std::size_t node = 0;
        while (node < nodes_.size() && !means(node)) {
            ++node;
        }
        return node == nodes_.size() ? addMissing(reference) : node;
    }

    std::vector<GraphNode> take() { return std::move(nodes_); }

  private:
    std::size_t addMissing(const cimom::ObjectPath& reference) {
        add(reference, false);
        return nodes_.size() - 1;
    }

    std::vector<GraphNode> nodes_;
    /// In their order, those of which an identifying key has a text.
    std::unordered_map<std::string, std::vector<std::size_t>> byText_;
};

bool isTail(const cimom::NamedValue& key) {
    return std::any_of(tails.begin(), tails.end(),
                       [&key](std::string_view name) { return cimom::sameName(key.name, name); });
}

const cimom::ObjectPath* referenceIn(const cimom::NamedValue& key) {
    const cimom::Scalar* const scalar = key.value.scalar();
    const auto* const path =
        scalar == nullptr ? nullptr : std::get_if<std::shared_ptr<const cimom::ObjectPath>>(scalar);
    return path == nullptr ? nullptr : path->get();
}

std::string_view shortName(std::string_view className) {
    return className.starts_with(schemaPrefix) ? className.substr(schemaPrefix.size()) : className;
}

/// A text as it stands between double quotes in Graphviz' language, whose labels have
/// escapes of their own: a backslash in a name must not begin one.
std::string escaped(std::string_view text) {
    std::string result;
    for (const char letter : printable(text)) {
        if (letter == '"' || letter == '\\') {
            result += '\\';
        }
        result += letter;
    }
    return result;
}

/// The key that distinguishes the instance from the others of its class.
std::string identity(const cimom::ObjectPath& path) {
    for (const std::string_view name : identifying) {
        if (std::string text = heldText(path.key(name)); !text.empty()) {
            return text;
        }
    }
    return {};
}

std::string label(const cimom::ObjectPath& path) {
    // "\\n" is an escape of Graphviz, and so is added after the escaping.
    return '"' + escaped(identity(path)) + "\\n" + escaped(shortName(path.className)) + '"';
}

std::string_view fillOf(const std::string& className) {
    const auto* const fill =
        std::find_if(fills.begin(), fills.end(), [&className](const Fill& each) {
            return className.find(each.classPart) != std::string::npos;
        });
    return fill == fills.end() ? "#ffffff" : fill->color;
}

}  // namespace

Graph connect(const std::vector<cimom::ObjectPath>& elements,
              const std::vector<cimom::ObjectPath>& associations) {
    Graph graph;
    Nodes nodes;
    for (const cimom::ObjectPath& element : elements) {
        nodes.add(element, true);
    }
    for (const cimom::ObjectPath& association : associations) {
        const cimom::ObjectPath* from = nullptr;
        const cimom::ObjectPath* to = nullptr;
        for (const cimom::NamedValue& key : association.keys) {
            (isTail(key) ? from : to) = referenceIn(key);
        }
        if (from != nullptr && to != nullptr) {
            const std::size_t tail = nodes.find(*from);
            graph.edges.push_back({association.className, tail, nodes.find(*to)});
        }
    }
    graph.nodes = nodes.take();
    return graph;
}

Graph graphOfMachine(Client& client, const TellStep& tell) {
    std::vector<cimom::ObjectPath> elements;
    std::vector<cimom::ObjectPath> associations;
    std::vector<ClassEntry> classes = client.servedClasses();
    std::erase_if(classes, [](const ClassEntry& entry) { return isLeftOut(entry.name); });
    std::size_t number = 0;
    for (const ClassEntry& entry : classes) {
        tell("asking for " + entry.name, ++number, classes.size());
        std::vector<cimom::ObjectPath>& paths = entry.association ? associations : elements;
        for (cimom::ObjectPath& path : client.pathsIn(entry.name)) {
            paths.push_back(std::move(path));
        }
    }
    return connect(elements, associations);
}

std::string graphvizText(const Graph& graph) {
    std::string text =
        "digraph machine {\n"
        "  rankdir=LR;\n"
        "  ranksep=1.2;\n"
        "  nodesep=0.15;\n"
        "  node [shape=box, style=\"rounded,filled\", fontname=\"Helvetica\", fontsize=11];\n"
        "  edge [color=\"#607d8b\", fontname=\"Helvetica\", fontsize=8, fontcolor=\"#455a64\"];\n";
    for (std::size_t index = 0; index < graph.nodes.size(); ++index) {
        const GraphNode& node = graph.nodes[index];
        text += "  n" + std::to_string(index) + " [label=" + label(node.path) + ", fillcolor=\"" +
                std::string(fillOf(node.path.className)) + '"' +
                (node.served ? "" : ", style=\"rounded,filled,dashed\"") + "];\n";
    }
    for (const GraphEdge& edge : graph.edges) {
        text += "  n" + std::to_string(edge.from) + " -> n" + std::to_string(edge.to) +
                " [label=\"" + escaped(shortName(edge.association)) + "\"];\n";
    }
    return text + "}\n";
}

}  // namespace cimdhcp
