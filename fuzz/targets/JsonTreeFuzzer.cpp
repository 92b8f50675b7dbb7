// A JSON tree, as a person or "cimdhcp tree" wrote it.
#include "sources/JsonTree.h"

#include <algorithm>

#include "Input.h"
#include "zrclient/SnapshotJson.h"

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view text = fuzz::text(data, size);
    const ZR::JsonTree tree = ZR::parseJsonTree(text, "host");
    if (const auto* const fault = std::get_if<ZR::JsonTreeFault>(&tree)) {
        const auto lines = 1 + static_cast<std::size_t>(std::count(text.begin(), text.end(), '\n'));
        fuzz::require(fault->line >= 1 && fault->line <= lines && fault->column >= 1 &&
                          fault->column <= text.size() + 1 && !fault->reason.empty(),
                      "a fault is in the text");
        return 0;
    }
    const auto& snapshot = *std::get<0>(tree);
    for (ZR::Snapshot::Index i = 0; i < snapshot.nodes().size(); ++i) {
        fuzz::require(snapshot.resolve(snapshot.path(i)) == i, "a path leads to its node");
        fuzz::require(snapshot.node(i).parent == ZR::Snapshot::none || snapshot.node(i).parent < i,
                      "parents come first");
    }
    const std::string json = ZR::toJson(snapshot);
    const ZR::JsonTree again = ZR::parseJsonTree(json, "host");
    fuzz::require(std::holds_alternative<std::shared_ptr<const ZR::Snapshot>>(again) &&
                      ZR::toJson(*std::get<0>(again)) == json,
                  "a tree survives being written");
    fuzz::require(*std::get<0>(again) == snapshot, "the tree that comes back is the same");
    const ZR::JsonTree named = ZR::parseJsonTree(text, "host", "name");
    const auto told = std::get<0>(named)->diagnostics();
    fuzz::require(ZR::toJson(*std::get<0>(named)) == json, "slips change nothing in a tree");
    fuzz::require(
        std::all_of(told.begin(), told.end(),
                    [](const ZR::Diagnostic& each) { return each.text.starts_with("name:"); }),
        "slips are told under the name of the tree");
    return 0;
}
