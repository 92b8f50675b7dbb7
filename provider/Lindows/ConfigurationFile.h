#pragma once

#include <optional>
#include <string>

/// The configuration file of an interface: lines KEY=value, one setting each. What is
/// done to it is traced by the setting data whose name is in it.
namespace ZR::DHCPClientProvider {

/// The path of an interface's file in a directory that ends with its separator.
/// Empty for a name that would leave the directory or could not be a file name:
/// the empty one, ".", "..", and those with a "/" or a control character.
[[nodiscard]] std::string configurationFilePath(const std::string& directory,
                                                const std::string& interfaceName);

/// Rewrites one file so that `key` has `value`: every line in which the key occurs
/// anywhere, be it in a comment or as part of a longer key, becomes "key=value";
/// without one, that line is put at the end. A line of more than 511 bytes counts
/// as several, of 511 bytes each. All other bytes are kept.
///
/// The file is rewritten in place: it keeps its inode, owner and mode. Without a
/// file nothing is done, and nothing is created. A value that cannot be one line
/// (with a line feed, carriage return or zero byte) changes nothing. When there is
/// no room for the new content, the file keeps the old one.
///
/// Returns why the value could not be written, as a diagnostic; nothing when it was,
/// or when there is no file that may be written. Callers that write the same file at
/// once are not kept apart.
[[nodiscard]] std::optional<std::string> rewriteValue(const std::string& path,
                                                      const std::string& key,
                                                      const std::string& value);

}  // namespace ZR::DHCPClientProvider
