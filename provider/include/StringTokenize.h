#pragma once

#include <string>
#include <vector>

namespace ZR {

/// Splits a text at every character of `delimiters` and appends the pieces to
/// `tokens`. Runs of delimiters count as one, and none at the ends counts: no
/// piece is ever empty.
void stringTokenize(const std::string& text, std::vector<std::string>& tokens,
                    const std::string& delimiters);

}  // namespace ZR
