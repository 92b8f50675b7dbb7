#pragma once

#include <string>

namespace ZR {

/// Length of a host name buffer: longer than any name that Linux allows (64 bytes).
inline constexpr unsigned hostNameBufferSize = 256;

/// What the machine tells of its name.
struct SystemName {
    std::string name;        ///< empty when it tells none
    std::string diagnostic;  ///< why it tells none, for the log; empty with a name

    bool operator==(const SystemName&) const = default;
};

/// The host name, or why there is none. Safe on any thread.
[[nodiscard]] SystemName readSystemName();

/// The system's name as the platform knows it: the host name. Empty when the
/// machine does not tell one. Safe on any thread.
[[nodiscard]] std::string getSystemName();

}  // namespace ZR
