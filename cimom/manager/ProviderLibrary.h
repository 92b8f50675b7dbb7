#pragma once

#include <filesystem>
#include <memory>
#include <string>
#include <vector>

namespace cimom {

/// A loaded shared library; unloaded when the object ends.
class ProviderLibrary {
  public:
    /// Loads the first lib<location>.so of the directories, with all its symbols
    /// bound and visible to itself only. Throws LoadError, which names the file
    /// and the reason, or the directories that do not have it.
    ProviderLibrary(const std::string& location,
                    const std::vector<std::filesystem::path>& directories);

    [[nodiscard]] const std::filesystem::path& file() const noexcept { return file_; }

    /// The address of a function that the library exports, or null.
    template <typename Function>
    [[nodiscard]] Function function(const std::string& name) const noexcept {
        return reinterpret_cast<Function>(symbol(name));
    }

  private:
    struct Closed {
        void operator()(void* handle) const noexcept;
    };
    [[nodiscard]] void* symbol(const std::string& name) const noexcept;

    std::filesystem::path file_;
    std::unique_ptr<void, Closed> handle_;
};

}  // namespace cimom
