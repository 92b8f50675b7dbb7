#pragma once

#include <CLI/CLI.hpp>

#include "arguments/CommandLine.h"

namespace cimdhcp {

/// The options of the command that answers WBEM clients: where it listens, who may ask,
/// and what a client may cost. They are read into `serve`, which must live as long as
/// the parser.
void addServeOptions(CLI::App& app, ServeCommand& serve);

}  // namespace cimdhcp
