#pragma once

#include <memory>

#include "zrclient/SnapshotSource.h"

namespace ZR {

/// Whether each property of a tree is to bear where it came from. It costs a text for
/// each, so that only who prints it asks for it.
enum class Explain : bool { No, Yes };

/// Whether a source is to learn of changes. Without, it is read once, and again only when a
/// service processor has responded. A process that lives for one request is better off so: the
/// kernel lets it wait some 10 ms until its watches of files have ended.
enum class Watch : bool { No, Yes };

/// The live Linux machine as a source: its computer, networks and interfaces
/// with what the kernel and the DHCP clients tell of them. Never null, never
/// throws apart from std::bad_alloc; what cannot be opened is logged and left
/// out of the readings.
[[nodiscard]] std::unique_ptr<SnapshotSource> openLiveSource(Explain explain = Explain::No,
                                                             Watch watch = Watch::Yes);

/// Makes the live machine what the service of this process reads when its settings name
/// no tree; they also tell whether it is watched. From any thread, and as often as one likes.
void serveLiveMachine() noexcept;

}  // namespace ZR
