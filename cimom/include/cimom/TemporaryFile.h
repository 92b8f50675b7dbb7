#pragma once

#include <cstddef>
#include <string>

namespace cimom {

/// Room on disk for what would be too much for the memory of this process: a file
/// without a name in the directory for temporary files (TMPDIR, else /tmp), which
/// ends with the object. Reading from several threads is safe while no thread writes.
class TemporaryFile {
  public:
    /// Throws std::system_error, which names the directory.
    TemporaryFile();
    ~TemporaryFile();
    TemporaryFile(const TemporaryFile&) = delete;
    TemporaryFile& operator=(const TemporaryFile&) = delete;

    /// Throws std::system_error, for a full disk for example.
    void write(std::size_t position, const char* bytes, std::size_t size);
    /// Appends bytes that have been written to `out`. Throws std::system_error.
    void read(std::size_t position, std::size_t size, std::string& out) const;

    /// Maps `size` further bytes, which then belong to the caller; `position` and
    /// `size` are multiples of a page. Null when there is no room for them.
    [[nodiscard]] void* map(std::size_t position, std::size_t size) noexcept;

  private:
    int fd_ = -1;
};

}  // namespace cimom
