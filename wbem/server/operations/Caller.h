#pragma once

#include <functional>
#include <optional>
#include <string>

namespace cimom::wbem {

/// Who sent the request. Without users set up there is no identity, and none is made up.
struct Caller {
    std::optional<std::string> user;
    std::string address;
    bool mayModify = false;
    /// Whether the client has stopped waiting for the response; empty: it waits.
    std::function<bool()> gone = nullptr;
};

}  // namespace cimom::wbem
