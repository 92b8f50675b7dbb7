#include "zrclient/Snapshot.h"

#include <algorithm>
#include <bit>
#include <cstddef>
#include <functional>
#include <map>
#include <utility>

namespace ZR {

namespace {

/// A name as a segment of a path, in which a "/" cannot be taken for a separator.
std::string escaped(std::string_view name) {
    if (name.find_first_of("/%") == std::string_view::npos) {
        return std::string{name};
    }
    std::string key;
    key.reserve(name.size());
    for (const char character : name) {
        switch (character) {
            case '/':
                key += "%2F";
                break;
            case '%':
                key += "%25";
                break;
            default:
                key += character;
        }
    }
    return key;
}

std::string_view nameOf(const Snapshot::Node& node, std::span<const SnapshotProperty> properties) {
    for (const SnapshotProperty& property : properties) {
        if (property.id == NodeLexicon::Properties::Name) {
            if (const auto* name = std::get_if<std::string>(&property.value)) {
                return *name;
            }
        }
    }
    return node.description;
}

/// Gives back the room that is not needed, where it is worth moving all that is there.
template <typename Element>
void release(std::vector<Element>& elements) {
    if (elements.capacity() - elements.size() > elements.size() / 8) {
        elements.shrink_to_fit();
    }
}

/// Gives nodes, in document order, keys that their siblings do not have: the first of
/// several siblings with one name keeps it bare.
class Keys {
  public:
    explicit Keys(std::span<Snapshot::Node> nodes)
        : nodes_(nodes), table_(std::bit_ceil(2 * nodes.size() + 1), Snapshot::none) {}

    void give(Snapshot::Index index, std::string_view name) {
        Snapshot::Node& node = nodes_[index];
        node.key = escaped(name);
        if (take(index)) {
            return;
        }
        // The count goes on from where the last namesake left it, else many
        // namesakes would take quadratic time.
        const std::string bare = node.key;
        std::uint32_t& number = numbers_.try_emplace({node.parent, bare}, 1U).first->second;
        do {
            node.key = bare + "#" + std::to_string(++number);
        } while (!take(index));
    }

  private:
    /// Enters a node by its key; false when a sibling has it.
    bool take(Snapshot::Index index) {
        const Snapshot::Node& node = nodes_[index];
        const std::size_t mask = table_.size() - 1;
        for (std::size_t at = std::hash<std::string_view>{}(node.key) + node.parent;; ++at) {
            Snapshot::Index& entered = table_[at & mask];
            if (entered == Snapshot::none) {
                entered = index;
                return true;
            }
            if (nodes_[entered].parent == node.parent && nodes_[entered].key == node.key) {
                return false;
            }
        }
    }

    std::span<Snapshot::Node> nodes_;
    /// The nodes that have a key by now, by its hash, each in the first place from there that
    /// was free. A map would take longer for ten thousand than all else that building does.
    std::vector<Snapshot::Index> table_;
    /// The number that the last namesake of a key has, where it has any.
    std::map<std::pair<Snapshot::Index, std::string>, std::uint32_t> numbers_;
};

}  // namespace

std::span<const SnapshotProperty> Snapshot::properties(Index index) const {
    const Node& owner = nodes_[index];
    return std::span(properties_).subspan(owner.firstProperty, owner.propertyCount);
}

const SnapshotProperty* Snapshot::find(Index index, NodeLexicon::Properties id) const {
    const auto all = properties(index);
    const auto found = std::find_if(all.begin(), all.end(),
                                    [id](const SnapshotProperty& each) { return each.id == id; });
    return found == all.end() ? nullptr : &*found;
}

std::string_view Snapshot::origin(Index index, NodeLexicon::Properties id) const {
    const SnapshotProperty* const property = find(index, id);
    if (property == nullptr) {
        return {};
    }
    const auto position = static_cast<std::size_t>(property - properties_.data());
    return position < origins_.size() ? std::string_view{origins_[position]} : std::string_view{};
}

Snapshot::Index Snapshot::first(NodeLexicon::NodeType type) const noexcept {
    const auto place = NodeLexicon::placeOf(type);
    return place ? firstOfType_.at(*place) : none;
}

std::string Snapshot::path(Index index) const {
    std::size_t size = 0;
    for (Index each = index; each != none; each = nodes_[each].parent) {
        size += 1 + nodes_[each].key.size();
    }
    std::string path(size, '/');
    for (Index each = index; each != none; each = nodes_[each].parent) {
        const std::string& key = nodes_[each].key;
        size -= key.size();
        path.replace(size, key.size(), key);
        --size;
    }
    return path;
}

bool Snapshot::isPathOf(std::string_view path, Index index) const noexcept {
    for (; index != none; index = nodes_[index].parent) {
        const std::string& key = nodes_[index].key;
        if (path.size() <= key.size() || !path.ends_with(key) ||
            path[path.size() - key.size() - 1] != '/') {
            return false;
        }
        path.remove_suffix(key.size() + 1);
    }
    return path.empty();
}

Snapshot::Index Snapshot::resolve(std::string_view path) const noexcept {
    // From the front, as it is parents that are asked for, and these come first.
    for (Index index = 0; index < nodes_.size(); ++index) {
        if (isPathOf(path, index)) {
            return index;
        }
    }
    return none;
}

Snapshot::Index SnapshotBuilder::add(Snapshot::Index parent, std::string type,
                                     std::string description) {
    Snapshot::Node& node = nodes_.emplace_back();
    node.type = std::move(type);
    node.description = std::move(description);
    node.parent = parent;
    node.firstProperty = static_cast<std::uint32_t>(properties_.size());
    return static_cast<Snapshot::Index>(nodes_.size() - 1);
}

void SnapshotBuilder::property(NodeLexicon::Properties id, PropertyValue value, bool readOnly) {
    if (nodes_.empty()) {
        return;
    }
    SnapshotProperty property{id, readOnly, std::move(value)};
    Snapshot::Node& node = nodes_.back();
    const auto own = properties_.begin() + static_cast<std::ptrdiff_t>(node.firstProperty);
    auto place = std::find_if(own, properties_.end(),
                              [id](const SnapshotProperty& each) { return each.id == id; });
    const auto position = static_cast<std::size_t>(place - properties_.begin());
    if (place != properties_.end()) {
        *place = std::move(property);
    } else {
        properties_.push_back(std::move(property));
        ++node.propertyCount;
    }
    if (!origin_.empty() || position < origins_.size()) {
        origins_.resize(std::max(origins_.size(), position + 1));
        origins_[position] = origin_;
    }
}

void SnapshotBuilder::copy(const Snapshot& from, Snapshot::Index index, Snapshot::Index parent) {
    const Snapshot::Node& original = from.node(index);
    const auto properties = from.properties(index);
    Snapshot::Node& node = nodes_[add(parent, original.type, original.description)];
    node.propertyCount = original.propertyCount;
    properties_.insert(properties_.end(), properties.begin(), properties.end());
}

void SnapshotBuilder::reserve(std::size_t nodes, std::size_t properties) {
    nodes_.reserve(nodes);
    properties_.reserve(properties);
}

std::shared_ptr<const Snapshot> SnapshotBuilder::build() {
    Snapshot snapshot;
    snapshot.nodes_ = std::exchange(nodes_, {});
    snapshot.properties_ = std::exchange(properties_, {});
    snapshot.origins_ = std::exchange(origins_, {});
    origin_.clear();
    snapshot.diagnostics_ = std::exchange(diagnostics_, {});
    // A snapshot is kept much longer than it takes to build it.
    release(snapshot.nodes_);
    release(snapshot.properties_);

    Keys keys{snapshot.nodes_};
    std::array<Snapshot::Index*, NodeLexicon::nodeTypes.size()> nextOfType{};
    for (std::size_t place = 0; place < nextOfType.size(); ++place) {
        nextOfType.at(place) = &snapshot.firstOfType_.at(place);
    }
    for (Snapshot::Index index = 0; index < snapshot.nodes_.size(); ++index) {
        Snapshot::Node& node = snapshot.nodes_[index];
        keys.give(index, nameOf(node, snapshot.properties(index)));
        const auto type = NodeLexicon::nodeTypeOf(node.type);
        if (const auto place = type ? NodeLexicon::placeOf(*type) : std::nullopt) {
            *nextOfType.at(*place) = index;
            nextOfType.at(*place) = &node.nextOfType;
        }
    }
    return std::make_shared<const Snapshot>(std::move(snapshot));
}

}  // namespace ZR
