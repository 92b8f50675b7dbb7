#pragma once

#include <atomic>
#include <cstddef>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "client/Credentials.h"
#include "client/Deadline.h"
#include "client/ServerUrl.h"

namespace cimdhcp {

/// How to talk to a server over HTTP.
struct HttpSettings {
    std::optional<std::string> caCertificates;  ///< a PEM file; none: the system's
    bool insecure = false;                      ///< any server is trusted
    std::optional<Credential> credential;
    std::size_t longestResponse = 16U << 20U;  ///< bytes of the body
    /// Requests end soon after it has become true. Borrowed; null: nothing does that.
    const std::atomic<bool>* interrupted = nullptr;
};

struct HttpResponse {
    unsigned status = 0;
    std::vector<std::pair<std::string, std::string>> headers;
    std::string body;

    /// Null when there is no such header. Names compare without regard to case.
    [[nodiscard]] const std::string* header(std::string_view name) const noexcept;
};

/// A server that cannot be reached, or whose response is not HTTP; what() is one line
/// without the server's name, with a remedy where there is one.
class ConnectionError : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

/// A connection to a WBEM server, made when it is first needed and kept for further
/// requests. No proxy is used, no redirection followed, and only TLS 1.2 and later
/// spoken. To be used by one thread at a time.
class HttpConnection {
  public:
    /// All requests together have the time until the deadline. Throws ConnectionError.
    HttpConnection(const ServerUrl& url, HttpSettings settings, const Deadline& deadline);
    ~HttpConnection();
    HttpConnection(const HttpConnection&) = delete;
    HttpConnection& operator=(const HttpConnection&) = delete;

    /// Headers as "NAME: VALUE", without line ends in them. Throws ConnectionError.
    HttpResponse post(const std::vector<std::string>& headers, const std::string& body);

    [[nodiscard]] const HttpSettings& settings() const noexcept;

  private:
    class Transfer;
    std::unique_ptr<Transfer> transfer_;
};

}  // namespace cimdhcp
