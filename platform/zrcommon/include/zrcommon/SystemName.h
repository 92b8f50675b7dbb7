#pragma once

#include <string>

namespace ZR {

/// Length of a host name buffer: longer than any name that Linux allows (64 bytes).
inline constexpr unsigned hostNameBufferSize = 256;

/// The system's name as the platform knows it: the host name. Empty when the
/// kernel does not tell it. Safe on any thread.
[[nodiscard]] std::string getSystemName();

}  // namespace ZR
