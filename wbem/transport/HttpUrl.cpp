#include "transport/HttpUrl.h"

#include <arpa/inet.h>

#include <algorithm>
#include <charconv>
#include <string_view>
#include <system_error>

#include "cimom/Names.h"

namespace cimom::wbem {

namespace {

constexpr std::uint16_t plainPort = 5988;
constexpr std::uint16_t encryptedPort = 5989;

bool isHostCharacter(char c) noexcept {
    return (c >= '0' && c <= '9') || (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || c == '.' ||
           c == '-' || c == '_' || static_cast<unsigned char>(c) >= 0x80;
}

/// The scheme, which is taken off the text with its colon and slashes.
bool takeScheme(std::string_view& rest) {
    const std::size_t end = rest.find("://");
    if (end == std::string_view::npos) {
        throw UrlError("there is no http:// or https:// in it");
    }
    const std::string_view scheme = rest.substr(0, end);
    rest.remove_prefix(end + 3);
    if (sameName(scheme, "https")) {
        return true;
    }
    if (!sameName(scheme, "http")) {
        throw UrlError("only http:// and https:// are spoken");
    }
    return false;
}

/// An IPv6 address, maybe with the zone of an interface behind a "%".
bool isAddress6(const std::string& text) {
    const std::size_t sign = text.find('%');
    in6_addr address{};
    if (::inet_pton(AF_INET6, text.substr(0, sign).c_str(), &address) != 1) {
        return false;
    }
    if (sign == std::string::npos) {
        return true;
    }
    const std::string_view zone = std::string_view(text).substr(sign + 1);
    return !zone.empty() && std::all_of(zone.begin(), zone.end(), isHostCharacter);
}

/// An IPv6 address with brackets around it.
std::string takeBracketed(std::string_view& rest) {
    const std::size_t end = rest.find(']');
    std::string address(rest.substr(1, end == std::string_view::npos ? end : end - 1));
    // A zone's sign is encoded in a URL (RFC 6874), and people write it as it is.
    constexpr std::string_view encoded = "%25";
    const std::size_t zone = address.find('%');
    if (zone != std::string::npos && zone + encoded.size() < address.size() &&
        address.compare(zone, encoded.size(), encoded) == 0) {
        address.erase(zone + 1, encoded.size() - 1);
    }
    if (end == std::string_view::npos || !isAddress6(address)) {
        throw UrlError("there is no IPv6 address in the brackets");
    }
    rest.remove_prefix(end + 1);
    return address;
}

std::string takeName(std::string_view& rest) {
    const auto* const end = std::find_if_not(rest.begin(), rest.end(), isHostCharacter);
    const auto length = static_cast<std::size_t>(end - rest.begin());
    if (length == 0 || rest.front() == '-') {
        throw UrlError("there is no host in it; the form is https://HOST[:PORT]");
    }
    std::string name(rest.substr(0, length));
    rest.remove_prefix(length);
    return name;
}

std::uint16_t takePort(std::string_view& rest) {
    rest.remove_prefix(1);
    std::uint16_t port = 0;
    const auto [stop, error] = std::from_chars(rest.data(), rest.data() + rest.size(), port);
    if (error != std::errc() || port == 0) {
        throw UrlError("a port is a number from 1 to 65535");
    }
    rest.remove_prefix(static_cast<std::size_t>(stop - rest.data()));
    return port;
}

}  // namespace

std::string HttpUrl::text() const {
    const bool brackets = host.find(':') != std::string::npos;
    // A zone's sign is encoded in a URL (RFC 6874).
    std::string name = host;
    if (const std::size_t zone = name.find('%'); zone != std::string::npos) {
        name.replace(zone, 1, "%25");
    }
    return std::string(encrypted ? "https://" : "http://") + (brackets ? '[' + name + ']' : name) +
           ':' + std::to_string(port) + path;
}

bool HttpUrl::isHere() const {
    return sameName(host, "localhost") || host == "::1" ||
           (host.starts_with("127.") && std::all_of(host.begin(), host.end(), [](char c) {
                return c == '.' || (c >= '0' && c <= '9');
            }));
}

HttpUrl readHttpUrl(const std::string& text) {
    std::string_view rest = text;
    HttpUrl url;
    url.encrypted = takeScheme(rest);
    if (rest.substr(0, rest.find('/')).find('@') != std::string_view::npos) {
        throw UrlError("a URL cannot hold a user and a password");
    }
    url.host = rest.starts_with('[') ? takeBracketed(rest) : takeName(rest);
    url.port = url.encrypted ? encryptedPort : plainPort;
    if (rest.starts_with(':')) {
        url.port = takePort(rest);
    }
    const bool good = rest.empty() || rest.front() == '/';
    const bool path = std::all_of(rest.begin(), rest.end(), [](char c) {
        return c > ' ' && c < 0x7F && c != '?' && c != '#' && c != '"' && c != '<' && c != '>';
    });
    if (!good || !path) {
        throw UrlError("the form is https://HOST[:PORT][/PATH]");
    }
    url.path = rest;
    return url;
}

}  // namespace cimom::wbem
