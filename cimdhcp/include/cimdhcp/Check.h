#pragma once

#include <ostream>
#include <string>
#include <vector>

#include "cimdhcp/CommandLine.h"
#include "cimdhcp/Directories.h"

namespace cimdhcp {

/// One thing that was looked at, for an administrator.
struct Finding {
    enum class Verdict { good, notable, bad };

    Verdict verdict = Verdict::good;
    std::string what;    ///< a few words
    std::string detail;  ///< what was found
    std::string remedy;  ///< what to do about it; empty when nothing has to be done

    bool operator==(const Finding&) const = default;
};

/// Looks at everything that an answer needs, from the settings file to one
/// enumeration of each served class, and tells why something is empty. Later
/// parts are looked at as far as the failure of earlier ones allows. Hands the
/// options to the platform (see setUpPlatform).
[[nodiscard]] std::vector<Finding> check(const Options& options,
                                         const std::vector<Directories>& installations);

/// The findings as a list with a line of the sum at its end.
[[nodiscard]] std::string checkText(const std::vector<Finding>& findings);
/// {"findings": [{"verdict": "good" | "notable" | "bad", "what", "detail", "remedy"}]}
[[nodiscard]] std::string checkJson(const std::vector<Finding>& findings);

/// Whether nothing bad was found.
[[nodiscard]] bool isGood(const std::vector<Finding>& findings) noexcept;

}  // namespace cimdhcp
