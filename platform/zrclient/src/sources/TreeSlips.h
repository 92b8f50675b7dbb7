#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "zrclient/NodeLexicon.h"
#include "zrclient/Snapshot.h"

namespace ZR {

/// A node of a JSON tree as far as it has been read. Nodes are kept in the order in which
/// their objects begin, which is document order, depth first. Places are offsets in the
/// text.
struct ReadNode {
    Snapshot::Index parent = Snapshot::none;
    std::string type;
    std::size_t typeAt = 0;
    std::string description;
    std::size_t nameAt = 0;  ///< of the value of its Name
    std::vector<SnapshotProperty> properties;
    std::vector<NodeLexicon::Properties> readOnly;
};

/// In a text it stands for the name of the machine that reads the tree.
inline constexpr std::string_view hostNameVariable = "${HOSTNAME}";

/// What a value in a JSON text can be.
enum class JsonKind : std::uint8_t { truth, number, text, list, other };

// What looks like a slip of a tree's author, who meant something that readers of the
// tree will not find. Each returns the reason, or an empty text.

/// Of a value that is not of its property's kind. A null is not told: it is how an
/// unreadable value is written.
[[nodiscard]] std::string slipOfKind(NodeLexicon::Properties id, JsonKind found);
/// Of an entry of a list that is not of the kind that the property's list holds.
[[nodiscard]] std::string slipOfEntry(NodeLexicon::Properties id, JsonKind found);
/// Of a number that the property cannot hold.
[[nodiscard]] std::string slipOfNumber(NodeLexicon::Properties id, std::uint64_t number);
/// Of a text, alone or in a list, that should be an address.
[[nodiscard]] std::string slipOfText(NodeLexicon::Properties id, const std::string& text);
/// Of a property's name that is one of the lexicon's but for its case.
[[nodiscard]] std::string slipOfPropertyName(std::string_view name);
/// Of a type that the lexicon does not have, and that either stands where only
/// interfaces do or is one of the lexicon's but for its case or a plural.
[[nodiscard]] std::string slipOfType(std::string_view type, std::string_view parentType);

/// The slips of one tree with their places.
class TreeSlips {
  public:
    /// Both texts are borrowed. Under the name the tree is told of; without one, nothing
    /// is gathered.
    TreeSlips(std::string_view text, std::string_view name) : text_(text), name_(name) {}

    /// Adds what is wrong at an offset of the text. Nothing for an empty reason.
    void add(std::size_t offset, std::string reason);

    /// Adds what only shows when all nodes have been read, on a machine of that name:
    /// types, interfaces of one name, and the name of another machine.
    void addFrom(const std::vector<ReadNode>& nodes, const std::string& hostName);

    /// "NAME:LINE:COLUMN: REASON" each, in the order of the text; of many the first few,
    /// and how many more there are.
    [[nodiscard]] std::vector<std::string> told();

  private:
    std::string_view text_;
    std::string_view name_;
    std::vector<std::pair<std::size_t, std::string>> slips_;
};

}  // namespace ZR
