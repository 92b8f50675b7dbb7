#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "arguments/Commands.h"

namespace CLI {
class App;
}

namespace cimdhcp {

/// The command of shells that complete: what stands behind it is not read as options.
inline constexpr const char* completeCommand = "complete";

/// One of the words that are possible, and what it means in a few words.
struct PossibleWord {
    std::string word;
    std::string meaning;

    bool operator==(const PossibleWord&) const = default;
};

/// What belongs where a command line ends that a person has not finished.
struct UnfinishedLine {
    enum class Wanted : std::uint8_t {
        nothing,
        words,  ///< one of `words`
        file,
        treeFile,
        directory,
        host,
        nameSpace,
        className,
        associationClass,
        path,
        interface,
        assignment,  ///< PROPERTY=VALUE
        column,
        property,
        role,
    };

    Wanted wanted = Wanted::nothing;
    std::vector<PossibleWord> words;
    std::string fixed;  ///< the beginning of the last word that stays: "--format=", "A,B,"
    std::string begun;  ///< the rest of the last word
    std::string command;
    std::vector<std::string> operands;  ///< of the command, before the last word
    /// The options of the program that were given, and what they mean; none: they cannot be
    /// understood.
    std::vector<std::string> optionWords;
    std::optional<Options> options;
};

/// Finds out what belongs at the end of the words, all but the options' meaning.
[[nodiscard]] UnfinishedLine whatIsUnfinished(const CLI::App& app,
                                              const std::vector<std::string>& words);

}  // namespace cimdhcp
