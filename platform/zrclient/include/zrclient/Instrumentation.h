#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "zrclient/NodeLexicon.h"
#include "zrclient/Snapshot.h"

namespace ZR {

/// A forward cursor over the nodes of the instrumentation tree.
///
/// A cursor stands on one node of one immutable snapshot, or on nothing; its
/// snapshot stays alive as long as the cursor. Every operation is legal on a
/// cursor that stands on nothing: it then returns false, or the empty text.
/// One cursor is used by one thread at a time; different cursors by any.
/// No operation throws, apart from std::bad_alloc.
class Instrumentation {
  public:
    Instrumentation() noexcept = default;

    // Copied, never moved: a cursor moved from would stand on a node of no snapshot.
    Instrumentation(const Instrumentation&) = default;
    Instrumentation& operator=(const Instrumentation&) = default;
    ~Instrumentation() = default;

    /// Takes the newest snapshot and stands on its first node of the type.
    /// Asks, without blocking, whether the machine changed; inside OneMoment only the
    /// first time. False if there is none.
    bool selectNode(NodeLexicon::NodeType type);

    /// Stands on the node that the path names in the latest snapshot; on nothing,
    /// when it has no such node (any more). Does not look at the machine.
    bool selectNode(const std::string& path);

    /// Stands on the parent of the other cursor's node, as selectNode of the path that
    /// getPathToParentNode gives would, but makes no path of it as long as the latest
    /// snapshot is that of the other cursor.
    bool selectParentOf(const Instrumentation& other);

    /// True while the cursor stands on a node.
    explicit operator bool() const noexcept { return node_ != Snapshot::none; }

    /// Moves to the next node of the type that was selected; after the last one,
    /// or when a path was selected, to nothing.
    Instrumentation& operator++() noexcept;

    /// Reads a property of the kind asked for. False, with the output left as it
    /// was, when the node lacks it or its value is of another kind.
    bool getProperty(NodeLexicon::Properties id, std::string& value) const;
    bool getProperty(NodeLexicon::Properties id, unsigned int& value) const;
    bool getProperty(NodeLexicon::Properties id, bool& value) const;
    bool getProperty(NodeLexicon::Properties id, std::vector<std::string>& value) const;

    /// Whether a property may not be written. False when the node lacks it.
    bool isPropertyReadOnly(NodeLexicon::Properties id, bool& readOnly) const;

    /// The description of the node; false, with the output left as it was, on nothing.
    bool getNodeDescription(std::string& description) const;

    /// The path of the parent node; empty for a root or on nothing.
    [[nodiscard]] std::string getPathToParentNode() const;

    /// How many nodes cursors of this thread have been placed on so far: the unit
    /// in which walks are measured.
    [[nodiscard]] static std::uint64_t nodeVisits() noexcept;

  private:
    template <typename Kind>
    const Kind* read(NodeLexicon::Properties id) const;
    void stand(Snapshot::Index node) noexcept;

    std::shared_ptr<const Snapshot> snapshot_;
    Snapshot::Index node_ = Snapshot::none;
    bool walksType_ = false;
};

}  // namespace ZR
