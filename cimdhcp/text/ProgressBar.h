#pragma once

#include <cstddef>
#include <optional>
#include <ostream>
#include <string>

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

/// "[=====>    ] 12 of 24, 1 failed", not wider than `width`; the numbers alone where
/// there is no room for more.
[[nodiscard]] std::string progressText(std::size_t done, std::size_t total, std::size_t failed,
                                       std::size_t width);

}  // namespace cimdhcp
