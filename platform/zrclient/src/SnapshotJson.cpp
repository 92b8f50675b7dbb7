#include "zrclient/SnapshotJson.h"

#include <algorithm>
#include <cstddef>
#include <nlohmann/json.hpp>
#include <utility>
#include <variant>
#include <vector>

namespace ZR {

namespace {

using Json = nlohmann::ordered_json;

Json valueOf(const PropertyValue& value) {
    return std::visit(
        [](const auto& content) {
            if constexpr (std::is_same_v<std::decay_t<decltype(content)>, std::monostate>) {
                return Json(nullptr);
            } else if constexpr (std::is_same_v<std::decay_t<decltype(content)>, NumberList>) {
                return Json(content.numbers);
            } else {
                return Json(content);
            }
        },
        value);
}

/// Whether a property is the name of a host computer, and that name the one given.
bool isName(const Snapshot::Node& node, const SnapshotProperty& property,
            std::string_view hostName) {
    const auto* const text = std::get_if<std::string>(&property.value);
    return property.id == NodeLexicon::Properties::Name && text != nullptr && !hostName.empty() &&
           *text == hostName &&
           NodeLexicon::nodeTypeOf(node.type) == NodeLexicon::NodeType::ComputerSystem &&
           node.description != NodeLexicon::serviceProcessorDescription;
}

/// A node without its children.
Json alone(const Snapshot& snapshot, Snapshot::Index index, std::string_view hostName) {
    const Snapshot::Node& node = snapshot.node(index);
    Json result{{"type", node.type}, {"description", node.description}};
    Json properties = Json::object();
    Json readOnly = Json::array();
    Json origins = Json::object();
    for (const SnapshotProperty& property : snapshot.properties(index)) {
        const std::string name(NodeLexicon::nameOf(property.id));
        if (name.empty()) {
            continue;  // a number outside the lexicon has no name that it could be read back by
        }
        properties[name] =
            isName(node, property, hostName) ? Json("${HOSTNAME}") : valueOf(property.value);
        if (property.readOnly) {
            readOnly.push_back(name);
        }
        if (const auto origin = snapshot.origin(index, property.id); !origin.empty()) {
            origins[name] = std::string(origin);
        }
    }
    if (!properties.empty()) {
        result["properties"] = std::move(properties);
    }
    if (!readOnly.empty()) {
        result["readOnly"] = std::move(readOnly);
    }
    if (!origins.empty()) {
        result["origins"] = std::move(origins);
    }
    return result;
}

/// Nodes that were gathered from the last to the first, as an array.
Json turned(std::vector<Json> nodes) {
    std::reverse(nodes.begin(), nodes.end());
    Json array = std::move(nodes);  // in braces it would become an array within an array
    return array;
}

}  // namespace

std::string toJson(const Snapshot& snapshot, std::string_view hostName) {
    // A child lies behind its parent, so from the end backwards every node is
    // complete when its turn comes. The last list is that of the roots.
    const std::size_t count = snapshot.nodes().size();
    std::vector<std::vector<Json>> children(count + 1);
    for (std::size_t back = count; back > 0; --back) {
        const auto index = static_cast<Snapshot::Index>(back - 1);
        Json node = alone(snapshot, index, hostName);
        if (!children[index].empty()) {
            node["children"] = turned(std::exchange(children[index], {}));
        }
        const Snapshot::Index parent = snapshot.node(index).parent;
        children[parent == Snapshot::none ? count : parent].push_back(std::move(node));
    }
    Json document = Json::object();
    document["nodes"] = turned(std::move(children[count]));
    constexpr int indent = 2;
    return document.dump(indent, ' ', false, Json::error_handler_t::replace) + "\n";
}

}  // namespace ZR
