#pragma once

#include <optional>
#include <string>

#include "arguments/Commands.h"
#include "text/Failure.h"
#include "text/Presentation.h"
#include "text/ProgressBar.h"

namespace cimdhcp {

class Client;

/// The outcome of a command.
struct Outcome {
    std::string text;                ///< for standard output
    std::string diagnostics;         ///< for standard error
    std::optional<Failure> failure;  ///< what ends the program when both are written
};

/// Carries out a command that asks an object manager, and tells the steps of those that have
/// many. Throws Failure.
[[nodiscard]] Outcome carryOut(const Command& command, Client& client,
                               const Presentation& presentation, const TellStep& tell = untold);

}  // namespace cimdhcp
