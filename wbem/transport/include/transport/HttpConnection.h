#pragma once

#include <atomic>
#include <chrono>
#include <cstddef>
#include <functional>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "transport/Deadline.h"
#include "transport/HttpUrl.h"

namespace cimom::wbem {

struct UserAndPassword {
    std::string user;
    std::string password;

    bool operator==(const UserAndPassword&) const = default;
};

/// How to talk to a server over HTTP.
struct HttpSettings {
    std::optional<std::string> caCertificates;  ///< a PEM file; none: the system's
    bool insecure = false;                      ///< any server is trusted
    std::optional<UserAndPassword> credential;
    /// For the connection to stand, with TLS: a machine that is off does not cost the time that
    /// one which is busy may take.
    std::chrono::milliseconds connectPatience{5000};
    std::size_t longestResponse = 16U << 20U;  ///< bytes of the body
    /// Asked before a body grows by so many bytes, in the thread of the request; false ends the
    /// request. May wait. None: it always grows.
    std::function<bool(std::size_t more)> mayGrow{};
    /// Requests end soon after it has become true. Borrowed; null: nothing does that.
    const std::atomic<bool>* interrupted = nullptr;
};

/// What a server has sent, whatever it was asked for.
struct ReceivedResponse {
    unsigned status = 0;
    std::vector<std::pair<std::string, std::string>> headers;
    std::string body;

    /// Null when there is no such header. Names compare without regard to case.
    [[nodiscard]] const std::string* header(std::string_view name) const noexcept;
};

/// A server that cannot be reached, or whose response is not HTTP; what() tells it in
/// one line, without the server's name. It may hold text of the server.
class ConnectionError : public std::runtime_error {
  public:
    /// Those for which users of the connection may have a remedy.
    enum class Kind { other, tooLate, notTrusted, badCertificates };

    explicit ConnectionError(const std::string& message, Kind kindOfError = Kind::other)
        : std::runtime_error(message), kind(kindOfError) {}

    const Kind kind;
};

/// A connection to a WBEM server or listener, made when it is first needed and kept for further
/// requests. No proxy is used, no redirection followed, and only TLS 1.2 and later
/// spoken. To be used by one thread at a time.
class HttpConnection {
  public:
    /// All requests together have the time until the deadline. Throws ConnectionError.
    HttpConnection(const HttpUrl& url, HttpSettings settings, const Deadline& deadline);
    ~HttpConnection();
    HttpConnection(const HttpConnection&) = delete;
    HttpConnection& operator=(const HttpConnection&) = delete;

    /// Gives what follows the time until another deadline.
    void extend(const Deadline& deadline);

    /// Headers as "NAME: VALUE", without line ends in them. Throws ConnectionError.
    ReceivedResponse post(const std::vector<std::string>& headers, const std::string& body);

    [[nodiscard]] const HttpSettings& settings() const noexcept;

  private:
    class Transfer;
    std::unique_ptr<Transfer> transfer_;
};

}  // namespace cimom::wbem
