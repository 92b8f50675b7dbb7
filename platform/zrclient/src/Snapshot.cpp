#include "zrclient/Snapshot.h"

#include <algorithm>
#include <bit>
#include <cstddef>
#include <optional>
#include <unordered_map>
#include <utility>

namespace ZR {

namespace {

thread_local std::uint64_t comparisons = 0;

// 64-bit FNV-1a, which goes on from the hash of a parent's path to that of a
// child's, so that a path looked up is hashed as it stands.
constexpr std::uint64_t hashOfNothing = 0xcbf29ce484222325U;

std::uint64_t extend(std::uint64_t hash, std::string_view text) noexcept {
    constexpr std::uint64_t prime = 0x100000001b3U;
    for (const char character : text) {
        hash = (hash ^ static_cast<unsigned char>(character)) * prime;
    }
    return hash;
}

/// The slot at which the search for a hash begins. The upper bits are mixed in,
/// as the lower ones alone know little of the first characters.
std::size_t firstSlot(std::uint64_t hash, std::size_t slots) noexcept {
    hash ^= hash >> 33U;
    hash *= 0xff51afd7ed558ccdU;
    hash ^= hash >> 33U;
    return static_cast<std::size_t>(hash) & (slots - 1);
}

/// A name as a segment of a path, in which a "/" cannot be taken for a separator.
std::string escaped(std::string_view name) {
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

std::optional<NodeLexicon::NodeType> typeOf(std::string_view name) {
    for (const auto& entry : NodeLexicon::nodeTypes) {
        if (entry.name == name) {
            return entry.number;
        }
    }
    return std::nullopt;
}

/// Gives the nodes their keys and enters them into the index of paths, in
/// document order: the first of several siblings with one name keeps it bare.
class PathIndex {
  public:
    explicit PathIndex(std::vector<Snapshot::Node>& nodes)
        // At most half full, so that a search ends after two slots on average.
        : nodes_(nodes), slots_(std::bit_ceil(2 * nodes.size() + 2), Snapshot::none) {
        hashes_.reserve(nodes.size());
    }

    void enter(std::string_view name) {
        const auto index = static_cast<Snapshot::Index>(hashes_.size());
        Snapshot::Node& node = nodes_[index];
        node.key = escaped(name);
        std::size_t slot = find(node);
        if (slots_[slot] != Snapshot::none) {
            // The count goes on from where the last namesake left it, else many
            // namesakes would take quadratic time.
            const std::string bare = node.key;
            std::uint32_t& number = namesakes_.try_emplace(slots_[slot], 1U).first->second;
            do {
                node.key = bare + "#" + std::to_string(++number);
                slot = find(node);
            } while (slots_[slot] != Snapshot::none);
        }
        slots_[slot] = index;
        hashes_.push_back(hashOf(node));
    }

    [[nodiscard]] std::vector<Snapshot::Index> take() { return std::move(slots_); }

  private:
    [[nodiscard]] std::uint64_t hashOf(const Snapshot::Node& node) const {
        const std::uint64_t parent =
            node.parent == Snapshot::none ? hashOfNothing : hashes_[node.parent];
        return extend(extend(parent, "/"), node.key);
    }

    /// The slot of the sibling that has this node's key, or the free one for it.
    [[nodiscard]] std::size_t find(const Snapshot::Node& node) const {
        std::size_t slot = firstSlot(hashOf(node), slots_.size());
        while (slots_[slot] != Snapshot::none) {
            const Snapshot::Node& present = nodes_[slots_[slot]];
            if (present.parent == node.parent && present.key == node.key) {
                break;
            }
            slot = (slot + 1) & (slots_.size() - 1);
        }
        return slot;
    }

    std::vector<Snapshot::Node>& nodes_;
    std::vector<Snapshot::Index> slots_;
    std::vector<std::uint64_t> hashes_;
    std::unordered_map<Snapshot::Index, std::uint32_t> namesakes_;
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
    switch (type) {
        case NodeLexicon::NodeType::NetworkInterface:
            return firstNetworkInterface_;
        case NodeLexicon::NodeType::ComputerSystem:
            return firstComputerSystem_;
    }
    return none;  // a number that is none of the lexicon's
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
        ++comparisons;
        if (path.size() <= key.size() || !path.ends_with(key) ||
            path[path.size() - key.size() - 1] != '/') {
            return false;
        }
        path.remove_suffix(key.size() + 1);
    }
    return path.empty();
}

Snapshot::Index Snapshot::resolve(std::string_view path) const noexcept {
    if (pathIndex_.empty()) {
        return none;
    }
    const std::size_t slots = pathIndex_.size();
    std::size_t slot = firstSlot(extend(hashOfNothing, path), slots);
    while (pathIndex_[slot] != none && !isPathOf(path, pathIndex_[slot])) {
        slot = (slot + 1) & (slots - 1);
    }
    return pathIndex_[slot];
}

std::uint64_t Snapshot::keyComparisons() noexcept {
    return comparisons;
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

std::shared_ptr<const Snapshot> SnapshotBuilder::build() {
    Snapshot snapshot;
    snapshot.nodes_ = std::exchange(nodes_, {});
    snapshot.properties_ = std::exchange(properties_, {});
    snapshot.origins_ = std::exchange(origins_, {});
    origin_.clear();
    snapshot.remarks_ = std::exchange(remarks_, {});
    // A snapshot is kept much longer than it takes to build it.
    snapshot.nodes_.shrink_to_fit();
    snapshot.properties_.shrink_to_fit();

    PathIndex paths(snapshot.nodes_);
    Snapshot::Index* nextInterface = &snapshot.firstNetworkInterface_;
    Snapshot::Index* nextSystem = &snapshot.firstComputerSystem_;
    for (Snapshot::Index index = 0; index < snapshot.nodes_.size(); ++index) {
        Snapshot::Node& node = snapshot.nodes_[index];
        paths.enter(nameOf(node, snapshot.properties(index)));
        const auto type = typeOf(node.type);
        if (type == NodeLexicon::NodeType::NetworkInterface) {
            nextInterface = &(*nextInterface = index, node.nextOfType);
        } else if (type == NodeLexicon::NodeType::ComputerSystem) {
            nextSystem = &(*nextSystem = index, node.nextOfType);
        }
    }
    snapshot.pathIndex_ = paths.take();
    return std::make_shared<const Snapshot>(std::move(snapshot));
}

}  // namespace ZR
