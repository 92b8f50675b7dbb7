#pragma once

#include <cstdint>
#include <ostream>
#include <string>
#include <vector>

namespace test {

enum class Operation : std::uint8_t {
    enumerateNames,
    enumerate,
    get,
    modify,
    create,
    remove,
    query,
    associatorNames,
    associators,
    referenceNames,
    references,
};

/// One request of the script.
struct ScriptRequest {
    std::string name;  ///< an identifier
    Operation operation;
    std::string path;         ///< in the namespace of the provider, "@" for this host's name
    std::string association;  ///< of association requests; empty: any
    /// Straight to the provider's table, which the object manager would not ask.
    bool direct = false;
};

inline std::ostream& operator<<(std::ostream& out, const ScriptRequest& request) {
    return out << request.name;
}

/// Thirty requests: each served class, each operation, and paths that lead nowhere, for
/// a machine whose interface eth0 has a server at an IPv4 address.
[[nodiscard]] const std::vector<ScriptRequest>& script();

/// Whether the provider says nothing of exceptions in such a request.
[[nodiscard]] bool isSilent(const ScriptRequest& request);

}  // namespace test
