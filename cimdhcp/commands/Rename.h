#pragma once

#include <string>

#include "arguments/CommandLine.h"
#include "client/Client.h"

namespace cimdhcp {

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

/// Changes the configuration name of an interface through the provider, and reads
/// it back: what it answers has happened. The interface may be given as the setting's
/// InstanceID ("BMC%eth1"), too, which tells interfaces of one name apart. The files
/// of another machine can be neither seen nor made. Throws Failure.
[[nodiscard]] RenameReport rename(const RenameCommand& command, Client& client);

[[nodiscard]] std::string renameText(const RenameReport& report);

/// {"operation": "rename", "interface", "file", "fileCreated", "directoryCreated",
/// "oldName", "newName"}; an old name that there was not is null, as is the file of another
/// machine.
[[nodiscard]] std::string renameJson(const RenameReport& report);

}  // namespace cimdhcp
