#pragma once

#include <cstddef>
#include <span>
#include <string_view>

namespace ZR::Live {

/// One argument as getopt_long(3) sees it. Borrows the command line.
struct CommandOption {
    char letter = '\0';         ///< of a short option; 0 for a long one or an operand
    std::string_view longName;  ///< of a long option
    std::string_view value;     ///< of the option, or the operand itself

    [[nodiscard]] bool isOperand() const noexcept { return letter == '\0' && longName.empty(); }
};

/// Walks a command line the way getopt_long(3) does: letters may stand together, and
/// a value behind its letter or in the next argument. Total: a value that is missing
/// is empty.
class OptionWalk {
  public:
    /// `withValue`: the letters that take a value. `longWithValue`: the long names that
    /// take one, also without a "=". The program's name must be left out.
    OptionWalk(std::span<const std::string_view> arguments, std::string_view withValue,
               std::span<const std::string_view> longWithValue) noexcept
        : arguments_(arguments), withValue_(withValue), longWithValue_(longWithValue) {}

    /// Takes the next option or operand; false behind the last one.
    bool next(CommandOption& option) noexcept;

  private:
    std::string_view nextArgument() noexcept;

    std::span<const std::string_view> arguments_;
    std::string_view withValue_;
    std::span<const std::string_view> longWithValue_;
    std::string_view letters_;  // the rest of an argument of several letters
    bool operandsOnly_ = false;
};

}  // namespace ZR::Live
