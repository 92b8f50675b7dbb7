#pragma once

#include <string>

#include "arguments/Commands.h"

namespace cimdhcp {

class Client;

/// What a rename did.
struct RenameReport {
    std::string interfaceName;
    std::string file;  ///< the interface's configuration file; empty: on another machine
    std::string dataDir;
    bool directoryCreated = false;
    bool fileCreated = false;
    bool lineEnded = false;  ///< the file's last line had no end, and got one
    std::string oldName;     ///< empty: it had none
    std::string newName;

    bool operator==(const RenameReport&) const = default;
};

/// Changes the configuration name of an interface through the provider, and reads it back
/// to be sure. The interface may also be given as the InstanceID of its setting
/// ("BMC%eth1"), since two systems may have interfaces of the same name.
///
/// Looks first: what would harm the file, or whoever reads it, is refused unless the
/// command is forced, and a last line without an end gets one. Files of another machine
/// can be neither seen nor made; of these the name alone is looked at. Throws Failure,
/// which tells what the file holds then.
[[nodiscard]] RenameReport rename(const RenameCommand& command, Client& client);

[[nodiscard]] std::string renameText(const RenameReport& report);

/// What could not be looked at first, for standard error; empty: nothing.
[[nodiscard]] std::string renameRemarks(const RenameCommand& command, const RenameReport& report);

/// {"operation": "rename", "interface", "file", "fileCreated", "directoryCreated",
/// "lineEnded", "oldName", "newName"}. "oldName" is null when there was none, "file" for another
/// machine.
[[nodiscard]] std::string renameJson(const RenameReport& report);

}  // namespace cimdhcp
