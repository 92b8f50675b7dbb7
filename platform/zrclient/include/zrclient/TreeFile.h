#pragma once

#include <memory>
#include <string>

#include "zrclient/SnapshotSource.h"

namespace ZR {

/// A JSON tree in a file as a source, for a program that shows its user another name than
/// the file's own: snapshots tell of the tree under `name`. A file that cannot be used
/// gives a snapshot without nodes that tells why.
[[nodiscard]] std::unique_ptr<SnapshotSource> openTreeFile(const std::string& path,
                                                           std::string name);

}  // namespace ZR
