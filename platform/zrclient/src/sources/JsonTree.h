#pragma once

#include <cstddef>
#include <memory>
#include <string>
#include <string_view>
#include <variant>

#include "zrclient/Snapshot.h"

namespace ZR {

/// Why a text is no JSON tree, and where: lines and columns count from 1,
/// columns in bytes.
struct JsonTreeFault {
    std::size_t line = 1;
    std::size_t column = 1;
    std::string reason;

    bool operator==(const JsonTreeFault&) const = default;
};

using JsonTree = std::variant<std::shared_ptr<const Snapshot>, JsonTreeFault>;

/// Reads the text of a JSON tree. Total: any bytes give a snapshot, never null,
/// or the first fault. "${HOSTNAME}" in a text becomes the name given. Nodes, and
/// values that nobody reads, may be nested 64 levels deep. Throws std::bad_alloc only.
[[nodiscard]] JsonTree parseJsonTree(std::string_view text, const std::string& hostName);

}  // namespace ZR
