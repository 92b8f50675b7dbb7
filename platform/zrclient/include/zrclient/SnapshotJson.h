#pragma once

#include <string>
#include <string_view>

#include "zrclient/Snapshot.h"

namespace ZR {

/// A snapshot as a JSON tree, indented by two blanks per level, with a line feed
/// at its end: a file of this text is read back as an equal snapshot, as long as
/// its nodes are at most 64 levels deep and its texts are UTF-8 without
/// "${HOSTNAME}". Bytes that are not UTF-8 become U+FFFD, so that the result is
/// JSON whatever the snapshot holds. An unreadable value becomes null. Where properties
/// came from, if that is known, is written as "origins", which readers pass over.
///
/// A host computer that is called `hostName` is written as "${HOSTNAME}", so that the
/// tree is whole on a machine of another name.
[[nodiscard]] std::string toJson(const Snapshot& snapshot, std::string_view hostName = {});

}  // namespace ZR
