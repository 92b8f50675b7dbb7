#pragma once

#include <cstdint>
#include <stdexcept>
#include <string>

namespace cimom::wbem {

/// Where a WBEM server or a listener is.
struct HttpUrl {
    bool encrypted = true;
    std::string host;  ///< a name or an address, an IPv6 address without brackets
    std::uint16_t port = 0;
    std::string path;  ///< with the leading slash; empty when there is none

    /// "https://host:5989/cimom"
    [[nodiscard]] std::string text() const;
    /// Whether it is on this machine, where no one can listen on the way.
    [[nodiscard]] bool isHere() const;

    bool operator==(const HttpUrl&) const = default;
};

/// A text that is not such a URL; what() says why, without the text, which may hold a
/// password.
class UrlError : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

/// Reads http://HOST[:PORT][/PATH] or https://HOST[:PORT][/PATH]. Without a port it is
/// 5988 for http, 5989 for https (DSP0200). Throws UrlError for anything else, among it
/// other schemes, a user, a query and a fragment.
[[nodiscard]] HttpUrl readHttpUrl(const std::string& text);

}  // namespace cimom::wbem
