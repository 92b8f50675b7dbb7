#pragma once

#include "arguments/CommandLine.h"
#include "client/Answer.h"
#include "client/Client.h"

namespace cimdhcp {

/// One CIM request: what was asked, and the answer, whatever its status.
struct Request {
    cimom::ObjectPath asked;
    Answer answer;
};

// The commands that are one CIM operation each. They throw Failure when their
// arguments cannot be understood.
[[nodiscard]] Request carryOut(const NamesCommand& command, Client& client);
[[nodiscard]] Request carryOut(const InstancesCommand& command, Client& client);
[[nodiscard]] Request carryOut(const GetCommand& command, Client& client);
[[nodiscard]] Request carryOut(const ModifyCommand& command, Client& client);
[[nodiscard]] Request carryOut(const AssociatorsCommand& command, Client& client);
[[nodiscard]] Request carryOut(const ReferencesCommand& command, Client& client);

}  // namespace cimdhcp
