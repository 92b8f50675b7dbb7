#pragma once

#include <cstddef>
#include <memory>
#include <string>
#include <string_view>
#include <variant>

#include "zrclient/Snapshot.h"

namespace ZR {

/// Why a text is not a JSON tree, and where: lines and columns count from 1,
/// columns in bytes.
struct JsonTreeFault {
    std::size_t line = 1;
    std::size_t column = 1;
    std::string reason;

    bool operator==(const JsonTreeFault&) const = default;
};

using JsonTree = std::variant<std::shared_ptr<const Snapshot>, JsonTreeFault>;

/// Reads the text of a JSON tree. Total: any bytes give a snapshot, never null,
/// or the first fault. "${HOSTNAME}" in a text becomes the name given. Without a
/// name (an empty one), a property with it is unreadable, and types and descriptions,
/// which cannot be so, have nothing in its place. Nodes, and
/// values that are not read, may be nested 64 levels deep. Throws std::bad_alloc only.
///
/// What can be read and is likely not what its author meant is told by the snapshot, as
/// "NAME:LINE:COLUMN: ..." under the name given; without one it is not looked for.
[[nodiscard]] JsonTree parseJsonTree(std::string_view text, const std::string& hostName,
                                     std::string_view name = {});

}  // namespace ZR
