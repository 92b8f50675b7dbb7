#pragma once

#include <condition_variable>
#include <cstddef>
#include <functional>
#include <mutex>
#include <optional>
#include <ostream>
#include <string>
#include <thread>

namespace cimdhcp {

/// A progress line on a terminal. Without a width it shows nothing.
class ProgressBar {
  public:
    ProgressBar(std::ostream& terminal, std::optional<std::size_t> width, std::size_t total);
    /// Takes the line away.
    ~ProgressBar();
    ProgressBar(const ProgressBar&) = delete;
    ProgressBar& operator=(const ProgressBar&) = delete;

    void show(std::size_t done, std::size_t failed);
    /// Takes the line away until it is shown again: before anything else is written.
    void hide();

  private:
    std::ostream& terminal_;
    std::optional<std::size_t> width_;
    std::size_t total_;
    bool shown_ = false;
};

/// Takes what is being done now, and which step of how many it is; of 0, steps are not counted.
using TellStep =
    std::function<void(const std::string& doing, std::size_t number, std::size_t total)>;

/// Takes a step that is not shown anywhere.
inline void untold(const std::string& /*doing*/, std::size_t /*number*/,
                   std::size_t /*total*/) noexcept {}

/// A line on a terminal that says what is being done and how long it takes already, once it
/// has taken a second. Without a width it shows nothing. While it exists, nothing else may be
/// written to the stream.
class WaitingLine {
  public:
    /// `doing` says what takes so long.
    WaitingLine(std::ostream& terminal, std::optional<std::size_t> width, std::string doing);
    /// Takes the line away.
    ~WaitingLine();
    WaitingLine(const WaitingLine&) = delete;
    WaitingLine& operator=(const WaitingLine&) = delete;

    /// Shows the steps that it is told, from any thread. Borrows the line.
    [[nodiscard]] TellStep steps();

  private:
    void run();
    void showLocked();

    std::ostream& terminal_;
    std::size_t room_;
    std::mutex mutex_;
    std::condition_variable changed_;
    std::string doing_;
    unsigned seconds_ = 0;
    bool ended_ = false;
    std::thread thread_;
};

/// "[=====>    ] 12 of 24, 1 failed", not wider than `width`; the numbers alone where
/// there is no room for more.
[[nodiscard]] std::string progressText(std::size_t done, std::size_t total, std::size_t failed,
                                       std::size_t width);

}  // namespace cimdhcp
