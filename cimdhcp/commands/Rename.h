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
    std::string oldName;  ///< empty: it had none
    std::string newName;

    bool operator==(const RenameReport&) const = default;
};

/// Changes the configuration name of an interface through the provider, and reads it back
/// to be sure. The interface may also be given as the InstanceID of its setting
/// ("BMC%eth1"), since two systems may have interfaces of the same name. Files of another
/// machine can be neither seen nor made. Throws Failure.
[[nodiscard]] RenameReport rename(const RenameCommand& command, Client& client);

[[nodiscard]] std::string renameText(const RenameReport& report);

/// {"operation": "rename", "interface", "file", "fileCreated", "directoryCreated",
/// "oldName", "newName"}. "oldName" is null when there was none, "file" for another
/// machine.
[[nodiscard]] std::string renameJson(const RenameReport& report);

}  // namespace cimdhcp
