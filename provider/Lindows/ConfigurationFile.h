#pragma once

#include <string>

/// The configuration file of an interface: lines KEY=value, one setting each.
namespace ZR::DHCPClientProvider {

extern const std::string loggerConfigurationFile;

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
/// (with a line feed, carriage return or zero byte) changes nothing; that, and a
/// write that fails, is told in a failure line. When there is no room for the new
/// content, the file keeps the old one.
///
/// Callers that write the same file at once are not kept apart.
void modifyValue(std::string path, std::string key, std::string value);

}  // namespace ZR::DHCPClientProvider
