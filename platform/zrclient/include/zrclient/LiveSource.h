#pragma once

#include <memory>

#include "zrclient/SnapshotSource.h"

namespace ZR {

/// The live Linux machine as a source: its computer, networks and interfaces
/// with what the kernel and the DHCP clients tell of them. Never null, never
/// throws apart from std::bad_alloc; what cannot be opened is logged and left
/// out of the readings.
[[nodiscard]] std::unique_ptr<SnapshotSource> openLiveSource();

}  // namespace ZR
