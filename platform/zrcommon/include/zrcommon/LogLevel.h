#pragma once

/// The levels of the platform's log and trace lines.
namespace ZR::LogLevel {

inline constexpr int parameters = 3000;  ///< a function was entered or left, with what
inline constexpr int flow = 4000;        ///< any other step of a run
inline constexpr int failure = 6000;     ///< something went wrong

}  // namespace ZR::LogLevel
