#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "text/Failure.h"

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

/// "1 class", "2 classes".
[[nodiscard]] std::string counted(std::size_t count, const std::string& one,
                                  const std::string& several);

/// The findings as a list with a line of the sum at its end.
[[nodiscard]] std::string findingsText(const std::vector<Finding>& findings);
/// {"findings": [{"verdict": "good" | "notable" | "bad", "what", "detail", "remedy"}]}
[[nodiscard]] std::string findingsJson(const std::vector<Finding>& findings);

/// Whether nothing bad was found.
[[nodiscard]] bool isGood(const std::vector<Finding>& findings) noexcept;
/// How a program ends that has printed findings which are not good.
[[nodiscard]] Failure somethingIsWrong();

}  // namespace cimdhcp
