#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "zrclient/Diagnostic.h"

namespace ZR::Live {

/// The content of a file that need not exist; nullopt without it. When it exists and
/// cannot be read, a diagnostic is added.
[[nodiscard]] std::optional<std::string> readOptionalFile(const std::string& path,
                                                          std::vector<Diagnostic>& diagnostics);

/// The names in a directory that need not exist, sorted, without those that begin
/// with a point: such are half-written files waiting to be renamed.
[[nodiscard]] std::vector<std::string> listOptionalDirectory(const std::string& path,
                                                             std::vector<Diagnostic>& diagnostics);

/// DIRECTORY/NAME
[[nodiscard]] std::string pathIn(const std::string& directory, std::string_view name);

/// "cannot read PATH: REASON"
[[nodiscard]] Diagnostic unreadable(std::string_view path, int error);

}  // namespace ZR::Live
