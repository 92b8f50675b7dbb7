#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

namespace ZR::Live {

/// What /proc/PID/status tells of a process (proc(5)).
struct ProcessStatus {
    char state = '\0';               ///< 'Z' and 'X': it has ended
    std::int32_t parent = 0;         ///< process number
    std::uint32_t realUser{};        ///< who started it
    std::uint32_t user{};            ///< effective
    std::uint64_t capabilities = 0;  ///< effective ones, in its own user namespace

    [[nodiscard]] bool hasEnded() const noexcept { return state == 'Z' || state == 'X'; }

    bool operator==(const ProcessStatus&) const = default;
};

/// nullopt where the state or the users are missing.
[[nodiscard]] std::optional<ProcessStatus> parseProcessStatus(std::string_view text);

}  // namespace ZR::Live
