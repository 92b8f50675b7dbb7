#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace ZR {

/// The configuration file of a network interface: lines KEY=value in a file of the data
/// directory that is named after the interface.
struct InterfaceFile {
    static constexpr std::string_view prefix = "ifcfg-";  ///< of the file's name
    /// The key of the name of the interface's configuration.
    static constexpr const char* configurationName = "CONFIG_NAME";

    /// The path of the file in a directory that ends with its separator. None for a name
    /// that would leave the directory or could not be a file name: the empty one, ".",
    /// "..", and those with a "/" or a control character.
    [[nodiscard]] static std::optional<std::string> path(const std::string& directory,
                                                         const std::string& interfaceName);

    /// What keeps a process from changing a file.
    struct Obstacle {
        std::string text;     ///< with the file's path
        bool denied = false;  ///< the user of the process lacks the right
    };
    /// What keeps this process, with its effective user, from changing the file at a path;
    /// none as far as can be seen.
    [[nodiscard]] static std::optional<Obstacle> obstacle(const std::string& path);
};

}  // namespace ZR
