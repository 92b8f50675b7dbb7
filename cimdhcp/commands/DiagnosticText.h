#pragma once

#include <cstddef>
#include <span>
#include <string>
#include <vector>

#include "client/MachineInterfaces.h"
#include "zrclient/Diagnostic.h"

namespace cimdhcp {

/// How many like things are told one by one; of more, a line names these many.
inline constexpr std::size_t mostTold = 4;

/// "a, b, c"; of more than mostTold the first of them, and how many more there are.
[[nodiscard]] std::string shortList(std::span<const std::string> texts,
                                    const std::string& separator = ", ");

/// "a", "a and b", "a, b and c".
[[nodiscard]] std::string enumeration(std::span<const std::string> texts);

/// One thing that is said of several.
struct Said {
    std::string what;
    std::vector<std::string> subjects;
};

/// Says something of one more subject, of none if that is empty.
void say(const std::string& what, std::string subject, std::vector<Said>& all);

/// How people know an interface: by its name, with its system unless that is the host.
[[nodiscard]] std::string nameOf(const InterfaceOverview& interface);

/// The diagnostics of one kind as few lines for people, printable: those that say the same
/// of several of the interfaces ("eth0: ...") in one, and all in one when they are many.
[[nodiscard]] std::vector<std::string> linesOf(ZR::Diagnostic::Kind kind,
                                               std::span<const ZR::Diagnostic> diagnostics,
                                               std::span<const InterfaceOverview> interfaces);

/// All diagnostics for standard error: one line about what could not be read, and notes.
/// Empty when there are none.
[[nodiscard]] std::string diagnosticText(std::span<const ZR::Diagnostic> diagnostics,
                                         std::span<const InterfaceOverview> interfaces);

}  // namespace cimdhcp
