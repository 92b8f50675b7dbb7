#pragma once

#include <filesystem>
#include <stdexcept>
#include <string>
#include <vector>

namespace cimom {

/// Which provider serves a class.
struct Registration {
    std::string className;
    std::string provider;  ///< the name in its factories' symbols
    std::string location;  ///< library without "lib" and ".so"
    bool instance = false;
    bool association = false;
    std::vector<std::string> nameSpaces;
    bool indication = false;

    bool operator==(const Registration&) const = default;
};

/// A file or library that the object manager cannot use; what() tells which and why.
class LoadError : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

/// Reads a registration file: a section "[CLASS]" per class with the lines
/// "provider:", "location:", "type:" and "namespace:" (the last two with one or
/// several words), or a line "CLASS NAMESPACE PROVIDER LOCATION TYPE..." per class,
/// before any section; "#" comments. The lines "group:", "unload:", "parameters:" and
/// "user:" of a section mean nothing here. Throws LoadError with file and line.
[[nodiscard]] std::vector<Registration> readRegistrations(const std::filesystem::path& file);

}  // namespace cimom
