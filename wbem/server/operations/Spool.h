#pragma once

#include <cstddef>
#include <memory>
#include <string>
#include <string_view>

namespace cimom {
class TemporaryFile;
}

namespace cimom::wbem {

/// A long text that grows at its end, of which memory holds a small part: the rest
/// is in a temporary file. Two of all at a time have memory for some megabytes, which stays with
/// the process: getting pages for a file, and giving them back, takes longer than filling them.
/// First written, by one thread at a time; then read, by any number of threads.
class Spool {
  public:
    /// Of more than that, append() throws CimError with serverLimitsExceeded.
    explicit Spool(std::size_t largest);
    ~Spool();
    Spool(const Spool&) = delete;
    Spool& operator=(const Spool&) = delete;

    /// Throws CimError, also when the disk is full.
    void append(std::string_view text);
    /// Forgets what is behind the first `size` bytes.
    void cut(std::size_t size) noexcept;
    [[nodiscard]] std::size_t size() const noexcept { return written_ + rest_.size(); }

    /// Appends `size` bytes from `position` on to `out`; they must be there. Throws
    /// std::system_error.
    void read(std::size_t position, std::size_t size, std::string& out) const;

  private:
    class Spares;

    const std::size_t largest_;
    std::shared_ptr<Spares> spares_;  ///< to which rest_ goes back; null: nowhere
    bool hadRoom_ = false;            ///< whether there has been a chance for a spare text
    std::unique_ptr<TemporaryFile> file_;
    std::size_t written_ = 0;  ///< bytes of the file
    std::string rest_;         ///< what follows them
};

}  // namespace cimom::wbem
