#pragma once

#include <span>
#include <string>
#include <vector>

#include "zrclient/Diagnostic.h"

namespace ZR::Testing {

/// The sentences of diagnostics, in their order.
[[nodiscard]] inline std::vector<std::string> textsOf(std::span<const Diagnostic> diagnostics) {
    std::vector<std::string> texts;
    texts.reserve(diagnostics.size());
    for (const Diagnostic& each : diagnostics) {
        texts.push_back(each.text);
    }
    return texts;
}

}  // namespace ZR::Testing
