#pragma once

#include <string>
#include <vector>

#include "arguments/Commands.h"

namespace CLI {
class App;
class Option;
}  // namespace CLI

namespace cimdhcp {

// Options that stand together in the help. They are read into the records,
// which must live as long as the parser.

/// An option with names that commas separate, added to those that there are.
CLI::Option* addList(CLI::App& app, const char* option, std::vector<std::string>& values,
                     const char* text, const char* type);
/// Which servers are asked, and how.
void addRemoteOptions(CLI::App& app, Options& options);
/// How results are shown.
void addOutputOptions(CLI::App& app, Options& options);
/// How the command that watches learns of changes.
void addWatchOptions(CLI::App& app, WatchCommand& watch);
/// The command that serves WBEM clients: where it listens, who may send requests, and
/// what a client may cost.
void addServeOptions(CLI::App& app, ServeCommand& serve);
/// The command that tells Prometheus of other machines.
void addExporterOptions(CLI::App& app, ExporterCommand& exporter);

/// Whether the command sends requests to an object manager, and so can be about another
/// machine.
[[nodiscard]] bool asksClient(const Command& command) noexcept;

/// Brings what was read into the form that commands expect: a namespace without slashes
/// around it. Throws Failure with ExitStatus::usage when options do not fit together, or
/// not to the command.
void completeCommandLine(CommandLine& line);

}  // namespace cimdhcp
