#pragma once

#include <sys/types.h>

#include <string>
#include <vector>

#include "kit/Files.h"
#include "zrcommon/UniqueFd.h"

namespace test {

/// The program as a server, from the time at which it can be asked until the
/// object ends. Throws when it ends before that, with what it wrote.
class ServedProgram {
  public:
    /// `arguments` as for the program; "serve" is among them. Unless the environment names a
    /// STATE_DIRECTORY, the server gets one of its own.
    ServedProgram(const std::string& program, const std::vector<std::string>& arguments,
                  const std::vector<std::string>& environment);
    ~ServedProgram();
    ServedProgram(const ServedProgram&) = delete;
    ServedProgram& operator=(const ServedProgram&) = delete;

    /// "http://127.0.0.1:40123"
    [[nodiscard]] const std::string& url() const noexcept { return url_; }
    /// "127.0.0.1:40123"
    [[nodiscard]] std::string host() const { return url_.substr(url_.rfind('/') + 1); }

    /// The next line that it writes behind the first one. Throws when it ends before that.
    [[nodiscard]] std::string line();

    [[nodiscard]] pid_t process() const noexcept { return child_; }

    /// Ends it by SIGTERM; its exit status, below 0 for another signal.
    int end();

  private:
    ZR::Testing::TemporaryDirectory state_;
    pid_t child_ = -1;
    ZR::UniqueFd output_;
    std::string written_;  ///< and not yet taken
    std::string url_;
};

}  // namespace test
