#pragma once

#include <cstdint>
#include <functional>
#include <string>

#include "arguments/UnfinishedLine.h"

namespace cimdhcp {

class Client;

/// Calls a function with a client of the machine that a line is about; not at all, or with a
/// Failure, when there is none.
using WithClient = std::function<void(const std::function<void(Client&)>&)>;

/// What may stand at the end of the line, for the completion of a shell: a word per line, with
/// a tab and what it means behind it where that is known. A line that begins with ":" says
/// what the shell finds by itself (":file", ":tree", ":directory", ":host"), or that the words
/// go on (":nospace"). Empty for what cannot be known, also when a client fails. `now` in
/// seconds since the epoch.
[[nodiscard]] std::string completionText(const UnfinishedLine& line, const WithClient& withClient,
                                         std::int64_t now);

}  // namespace cimdhcp
