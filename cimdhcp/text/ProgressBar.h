#pragma once

#include <condition_variable>
#include <cstddef>
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

/// A line on a terminal that says how long something takes already, once it has taken a
/// second. Without a width it shows nothing. While it exists, nothing else may be written to
/// the stream.
class WaitingLine {
  public:
    /// `doing` says what takes so long.
    WaitingLine(std::ostream& terminal, std::optional<std::size_t> width, std::string doing);
    /// Takes the line away.
    ~WaitingLine();
    WaitingLine(const WaitingLine&) = delete;
    WaitingLine& operator=(const WaitingLine&) = delete;

  private:
    void run();

    std::ostream& terminal_;
    std::size_t room_;
    std::string doing_;
    std::mutex mutex_;
    std::condition_variable changed_;
    bool ended_ = false;
    std::thread thread_;
};

/// "[=====>    ] 12 of 24, 1 failed", not wider than `width`; the numbers alone where
/// there is no room for more.
[[nodiscard]] std::string progressText(std::size_t done, std::size_t total, std::size_t failed,
                                       std::size_t width);

}  // namespace cimdhcp
