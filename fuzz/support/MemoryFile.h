#pragma once

#include <string>
#include <string_view>

#include "zrcommon/UniqueFd.h"

namespace fuzz {

/// A regular file without a disk, which others open by its path. Ends the process
/// when the system does not give one.
class MemoryFile {
  public:
    MemoryFile();

    [[nodiscard]] const std::string& path() const noexcept { return path_; }
    /// Replaces the content.
    void put(std::string_view content) const;
    [[nodiscard]] std::string content() const;

  private:
    ZR::UniqueFd fd_;
    std::string path_;
};

}  // namespace fuzz
