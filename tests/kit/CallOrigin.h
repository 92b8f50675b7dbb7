#pragma once

#include <cstdint>
#include <string>

namespace ZR::Testing {

/// Tells calls that the code of one shared library makes, itself or through another
/// library that it calls, from those of the program around it: the innermost of the
/// two on the stack is who calls. A call back from the library into the program is
/// thus one of the program.
class CallOrigin {
  public:
    /// Every call counts, whoever makes it.
    CallOrigin() = default;

    /// Only calls of the loaded library whose file name ends like this count. Throws
    /// std::runtime_error when no such library is loaded.
    explicit CallOrigin(const std::string& library);

    /// Whether a call with that return address counts. Allocates nothing.
    [[nodiscard]] bool includes(const void* returnAddress) const noexcept;

  private:
    struct Range {
        std::uintptr_t begin = 0;
        std::uintptr_t end = 0;
        [[nodiscard]] bool holds(std::uintptr_t address) const noexcept {
            return address >= begin && address < end;
        }
    };
    struct Search;

    Range library_;
    Range program_;
    bool everyone_ = true;
};

}  // namespace ZR::Testing
