#pragma once

#include <sys/stat.h>
#include <sys/types.h>

#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "zrclient/Diagnostic.h"

namespace ZR::Live {

/// What a path names, and who could have written it.
struct FoundFile {
    std::string path;  ///< without symbolic links
    struct stat status {};
    /// "user 1000 may change /tmp/x": who else than root, this process's own user and the
    /// writers given could have written it. Empty when no one else could.
    std::string doubt;
};

/// Goes the way to a file as the kernel does, and looks at each directory and symbolic link
/// on it: whoever may change one of them can put another file in place of this one. A
/// directory that others may write is all right when it is sticky and what it has on the way
/// belongs to one who may write. What lies in a directory that only its owner may enter is
/// in nobody else's reach. The bits of the group count as those of others do: they are also
/// the mask of an access control list (acl(5)).
///
/// `path` is absolute. `root` is the directory for which "/" stands, where that is another
/// than this process's own. nullopt when there is no such file; when that cannot be known,
/// with a diagnostic.
[[nodiscard]] std::optional<FoundFile> findFile(const std::string& path,
                                                std::span<const uid_t> writers,
                                                std::vector<Diagnostic>& diagnostics,
                                                std::string_view root = {});

/// Whether what a file says can only come from root, from this process's own effective user
/// or from one of the writers: the users of the running programs whose file it is. Otherwise
/// a diagnostic is added. False, and without a diagnostic, for a file that does not exist.
[[nodiscard]] bool isTrusted(const std::string& path, std::span<const uid_t> writers,
                             std::vector<Diagnostic>& diagnostics);

/// The content of a file that need not exist, if it is to be trusted; nullopt otherwise. When
/// it exists and cannot be read, or is not to be trusted, a diagnostic is added.
[[nodiscard]] std::optional<std::string> readTrustedFile(const std::string& path,
                                                         std::span<const uid_t> writers,
                                                         std::vector<Diagnostic>& diagnostics);

/// "PATH is not trusted: REASON"
[[nodiscard]] Diagnostic untrusted(std::string_view path, std::string_view reason);

}  // namespace ZR::Live
