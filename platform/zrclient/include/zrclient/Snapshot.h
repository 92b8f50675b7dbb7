#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

#include "zrclient/Diagnostic.h"
#include "zrclient/NodeLexicon.h"

namespace ZR {

/// A list of numbers as a value. A type of its own: libstdc++ 12 takes a variant of texts
/// and lists alone for one that is never without a value, and destroys one whose copying
/// failed for lack of memory as if it had one.
struct NumberList {
    std::vector<std::uint64_t> numbers;

    bool operator==(const NumberList&) const = default;
};

/// The value of one property. std::monostate is a value that no reader can
/// take: the property is present (isPropertyReadOnly finds it) but unreadable.
using PropertyValue = std::variant<std::monostate, bool, std::uint64_t, std::string,
                                   std::vector<std::string>, NumberList>;

struct SnapshotProperty {
    NodeLexicon::Properties id{};
    bool readOnly = false;
    PropertyValue value;

    bool operator==(const SnapshotProperty&) const = default;
};

/// One state of the instrumentation tree. Immutable once built, so that any
/// number of cursors on any number of threads may stand on it at once; it is
/// shared by std::shared_ptr and ends with its last cursor.
///
/// Nodes lie in one flat array in document order, depth first. Index `none`
/// stands for no node.
class Snapshot {
  public:
    using Index = std::uint32_t;
    static constexpr Index none = UINT32_MAX;

    struct Node {
        std::string type;         ///< a lexicon name, or any other text
        std::string description;  ///< node description
        std::string key;          ///< this node's segment of a path, unique among its siblings;
                                  ///< a "/" or "%" in it is written %2F or %25
        Index parent = none;
        Index nextOfType = none;  ///< next node of the same lexicon type in document order
        std::uint32_t firstProperty = 0;
        std::uint32_t propertyCount = 0;

        bool operator==(const Node&) const = default;
    };

    [[nodiscard]] std::span<const Node> nodes() const noexcept { return nodes_; }
    [[nodiscard]] std::size_t propertyCount() const noexcept { return properties_.size(); }
    [[nodiscard]] const Node& node(Index index) const { return nodes_[index]; }
    [[nodiscard]] std::span<const SnapshotProperty> properties(Index index) const;

    /// The property of a node, or null. O(properties of the node).
    [[nodiscard]] const SnapshotProperty* find(Index index, NodeLexicon::Properties id) const;

    /// Where a property of a node came from, for people; empty when the source was not
    /// asked to tell, or there is no such property.
    [[nodiscard]] std::string_view origin(Index index, NodeLexicon::Properties id) const;

    /// What could not be read, or is not as it looks.
    [[nodiscard]] std::span<const Diagnostic> diagnostics() const noexcept { return diagnostics_; }

    /// First node of a lexicon type in document order, or none. O(1).
    [[nodiscard]] Index first(NodeLexicon::NodeType type) const noexcept;

    /// The path of a node: the keys from the root down, each after a "/". O(depth).
    [[nodiscard]] std::string path(Index index) const;

    /// The node that a path names, or none. O(nodes up to that one).
    [[nodiscard]] Index resolve(std::string_view path) const noexcept;

    /// Equal nodes with equal properties in equal order, equal origins and diagnostics.
    bool operator==(const Snapshot&) const = default;

  private:
    friend class SnapshotBuilder;
    Snapshot() { firstOfType_.fill(none); }

    [[nodiscard]] bool isPathOf(std::string_view path, Index index) const noexcept;

    std::vector<Node> nodes_;
    std::vector<SnapshotProperty> properties_;
    std::vector<std::string> origins_;  // of the properties in their order; may be fewer
    std::vector<Diagnostic> diagnostics_;
    std::array<Index, NodeLexicon::nodeTypes.size()> firstOfType_{};  // in the lexicon's order
};

/// Builds a snapshot in document order: add a node after its parent and before
/// its later siblings' subtrees; its properties follow before the next node.
class SnapshotBuilder {
  public:
    /// Adds a node below `parent` (Snapshot::none: a root). The key of its path
    /// segment is its Name property when that is a text, else its description;
    /// from the second sibling of one key on, "#2", "#3"... is put behind it.
    Snapshot::Index add(Snapshot::Index parent, std::string type, std::string description);

    /// Adds a property to the node added last. One that is there already is
    /// replaced in its place. Without a node there is nothing to add to.
    void property(NodeLexicon::Properties id, PropertyValue value, bool readOnly = false);

    /// Adds a node as another snapshot has it, with its properties, without what is below it,
    /// its origins and its key.
    void copy(const Snapshot& from, Snapshot::Index index, Snapshot::Index parent);

    /// Makes room for so many in all.
    void reserve(std::size_t nodes, std::size_t properties);

    /// Says where the properties that are added from now on come from. Costs nothing as
    /// long as it is not called.
    void origin(std::string text) { origin_ = std::move(text); }

    /// Adds what could not be read, or is not as it looks.
    void diagnostic(Diagnostic what) { diagnostics_.push_back(std::move(what)); }

    /// The finished snapshot; the builder is empty afterwards.
    [[nodiscard]] std::shared_ptr<const Snapshot> build();

  private:
    std::vector<Snapshot::Node> nodes_;
    std::vector<SnapshotProperty> properties_;
    std::string origin_;
    std::vector<std::string> origins_;
    std::vector<Diagnostic> diagnostics_;
};

}  // namespace ZR
