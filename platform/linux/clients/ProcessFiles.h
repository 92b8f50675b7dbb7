#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "facts/RunningPrograms.h"
#include "formats/Files.h"
#include "zrclient/Diagnostic.h"

namespace ZR::Live {

/// A file that another process names.
struct ProcessFile {
    std::string path;  ///< absolute
    std::string root;  ///< for which "/" stands in it; empty when that is this process's own
};

/// What a running client means by a path: it may have a root directory or mounts of its own,
/// and a relative path begins in its working directory. Where that may not be read, an
/// absolute path is taken as this process would; of a relative one nothing is known, which is
/// a diagnostic.
[[nodiscard]] std::optional<ProcessFile> fileOfProcess(const Roots& roots,
                                                       const ClientProcess& process,
                                                       std::string_view path,
                                                       std::vector<Diagnostic>& diagnostics);

}  // namespace ZR::Live
