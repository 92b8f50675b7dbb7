#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

#include "wbem/Limits.h"
#include "wbem/Users.h"

namespace cimom::wbem {

struct ServerSettings {
    /// PEM texts of the certificate (with its chain) and its private key.
    struct Tls {
        std::string certificate;
        std::string key;
    };

    std::string address = "127.0.0.1";  ///< a numeric IPv4 or IPv6 address
    /// None: 5988, with TLS 5989. 0: one that is free.
    std::optional<std::uint16_t> port;
    std::optional<Tls> tls;
    /// Who may use the server. None: every client that reaches it, without an identity.
    std::optional<std::vector<User>> users;
    bool readOnly = false;  ///< no user may modify
    Limits limits;
    /// How long the refusal of wrong credentials is held back.
    std::chrono::milliseconds refusalDelay{1000};
};

/// Why a server does not start; what() says it with a remedy.
class ServerError : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

/// Throws ServerError for settings that would open the server to a network
/// without both encryption and users, and for limits out of their range.
void checkSettings(const ServerSettings& settings);

/// What a server tells its administrator.
enum class LogKind {
    notice,        ///< it started, it stopped
    modification,  ///< an attempt to modify
    refusal,       ///< wrong credentials
    request,       ///< a request that HTTP refused, and the like: for tracing
    failure,       ///< something does not work as it should
};
/// Called from many threads; must not throw.
using ServerLog = std::function<void(LogKind, const std::string&)>;

}  // namespace cimom::wbem
