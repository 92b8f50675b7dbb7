#pragma once

#include <string>

namespace ZR {

/// The system's text for an error number. Safe on any thread.
[[nodiscard]] std::string reasonOf(int error);

/// Whether an error number says that no file has the name.
[[nodiscard]] bool isAbsent(int error) noexcept;

}  // namespace ZR
