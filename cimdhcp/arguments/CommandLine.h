#pragma once

#include <memory>
#include <string>
#include <variant>
#include <vector>

#include "arguments/Commands.h"
#include "arguments/UnfinishedLine.h"

namespace cimdhcp {

/// A text that was asked for: the help or the version.
struct Information {
    std::string text;

    bool operator==(const Information&) const = default;
};

/// Reads command lines, one after the other, each as if it were the first. To be used
/// by one thread at a time.
class CommandLineReader {
  public:
    CommandLineReader();
    ~CommandLineReader();
    CommandLineReader(const CommandLineReader&) = delete;
    CommandLineReader& operator=(const CommandLineReader&) = delete;

    /// Reads the arguments behind the program's name. The environment is looked at
    /// for CIMDHCP_SCHEMA_DIR, CIMDHCP_REGISTRATION_DIR and CIMDHCP_PROVIDER_DIR.
    /// Throws Failure with ExitStatus::usage.
    [[nodiscard]] std::variant<CommandLine, Information> read(
        const std::vector<std::string>& arguments);

    /// Reads what stands before the end of a line that is still typed. Throws nothing: what
    /// cannot be understood is not completed.
    [[nodiscard]] UnfinishedLine readUnfinished(const std::vector<std::string>& words);

  private:
    class Parser;
    std::unique_ptr<Parser> parser_;
};

/// The same with a reader of its own.
[[nodiscard]] std::variant<CommandLine, Information> readCommandLine(
    const std::vector<std::string>& arguments);

}  // namespace cimdhcp
