#pragma once

#include <string>
#include <vector>

#include "kit/Host.h"

namespace test {

/// All that can be seen of a request from outside.
struct Outcome {
    Host::Response response;
    std::vector<std::string> failures;  ///< texts of the failure lines of the log
    std::string file;                   ///< content of the interface's configuration file
};

/// In one line, what a failing call made of a request: which objects, keys and
/// properties are missing or different from the outcome without it, and what was
/// told. "nothing", when there is no difference.
std::string effectOf(const Outcome& without, const Outcome& with);

}  // namespace test
