#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <utility>

namespace ZR {

/// What the platform asks of files.
class File {
  public:
    /// The name of a file, as the system's bytes.
    class Path {
      public:
        explicit Path(std::string bytes) : bytes_(std::move(bytes)) {}

        [[nodiscard]] const std::string& bytes() const noexcept { return bytes_; }

      private:
        std::string bytes_;
    };

    /// Whether something of that name exists, of whatever kind. False for a name
    /// that cannot be looked up (no permission on a directory, for example).
    [[nodiscard]] static bool exists(const std::wstring& path);

    /// The whole content of a regular file; nullopt when it cannot be opened or
    /// read, is not a regular file, or is larger than `limit` bytes (errno tells why;
    /// EFBIG for the last).
    [[nodiscard]] static std::optional<std::string> read(const std::string& path,
                                                         std::size_t limit = 64U << 20U);
};

/// The system's text for an error number. Safe on any thread.
[[nodiscard]] std::string reasonOf(int error);

/// Whether an error number says that no file has the name.
[[nodiscard]] bool isAbsent(int error) noexcept;

}  // namespace ZR
