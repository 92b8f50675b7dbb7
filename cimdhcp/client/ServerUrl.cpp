#include "client/ServerUrl.h"

#include <arpa/inet.h>

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <cstring>
#include <iostream>
#include <sstream>
#include <string_view>
#include <system_error>

#include "cimom/Names.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "zrcommon/File.h"

namespace cimdhcp {

namespace {

constexpr std::uint16_t plainPort = 5988;
constexpr std::uint16_t encryptedPort = 5989;

[[noreturn]] void refuse(const std::string& text, const std::string& reason) {
    throw Failure(ExitStatus::usage, "\"" + printable(text) + "\": " + reason);
}

bool isHostCharacter(char c) noexcept {
    return (c >= '0' && c <= '9') || (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || c == '.' ||
           c == '-' || c == '_' || static_cast<unsigned char>(c) >= 0x80;
}

/// The scheme, which is taken off the text with its colon and slashes.
bool takeScheme(std::string_view& rest, const std::string& text) {
    const std::size_t end = rest.find("://");
    if (end == std::string_view::npos) {
        return true;
    }
    const std::string_view scheme = rest.substr(0, end);
    rest.remove_prefix(end + 3);
    if (cimom::sameName(scheme, "https")) {
        return true;
    }
    if (!cimom::sameName(scheme, "http")) {
        refuse(text, "only http:// and https:// are spoken");
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
std::string takeBracketed(std::string_view& rest, const std::string& text) {
    const std::size_t end = rest.find(']');
    std::string address(rest.substr(1, end == std::string_view::npos ? end : end - 1));
    // A zone's sign is encoded in a URL (RFC 6874), and people write it as it is.
    constexpr std::string_view encoded = "%25";
    const std::size_t zone = address.find('%');
    if (zone != std::string::npos && zone + encoded.size() < address.size() &&
        address.compare(zone, encoded.size(), encoded) == 0) {
        address.replace(zone, encoded.size(), "%");
    }
    if (end == std::string_view::npos || !isAddress6(address)) {
        refuse(text, "there is no IPv6 address in the brackets");
    }
    rest.remove_prefix(end + 1);
    return address;
}

std::string takeName(std::string_view& rest, const std::string& text) {
    const auto* const end = std::find_if_not(rest.begin(), rest.end(), isHostCharacter);
    const auto length = static_cast<std::size_t>(end - rest.begin());
    if (length == 0 || rest.front() == '-') {
        refuse(text, "there is no host in it; the form is https://HOST[:PORT]");
    }
    std::string name(rest.substr(0, length));
    rest.remove_prefix(length);
    return name;
}

std::uint16_t takePort(std::string_view& rest, const std::string& text) {
    rest.remove_prefix(1);
    std::uint16_t port = 0;
    const auto [stop, error] = std::from_chars(rest.data(), rest.data() + rest.size(), port);
    if (error != std::errc() || port == 0) {
        refuse(text, "a port is a number from 1 to 65535");
    }
    rest.remove_prefix(static_cast<std::size_t>(stop - rest.data()));
    return port;
}

}  // namespace

std::string ServerUrl::text() const {
    const bool brackets = host.find(':') != std::string::npos;
    // A zone's sign is encoded in a URL (RFC 6874).
    std::string name = host;
    if (const std::size_t zone = name.find('%'); zone != std::string::npos) {
        name.replace(zone, 1, "%25");
    }
    return std::string(encrypted ? "https://" : "http://") + (brackets ? '[' + name + ']' : name) +
           ':' + std::to_string(port) + path;
}

bool ServerUrl::isHere() const {
    return cimom::sameName(host, "localhost") || host == "::1" ||
           (host.starts_with("127.") && std::all_of(host.begin(), host.end(), [](char c) {
                return c == '.' || (c >= '0' && c <= '9');
            }));
}

ServerUrl readServerUrl(const std::string& text) {
    std::string_view rest = text;
    ServerUrl url;
    url.given = text;
    const std::size_t scheme = rest.find("://");
    const std::size_t authority = scheme == std::string_view::npos ? 0 : scheme + 3;
    if (rest.substr(0, rest.find('/', authority)).find('@') != std::string_view::npos) {
        // What is refused is not repeated: it holds a password.
        throw Failure(ExitStatus::usage,
                      "a URL cannot hold a user and a password: any user of this machine could "
                      "read them in the list of processes; put them into a file for --credentials");
    }
    url.encrypted = takeScheme(rest, text);
    url.host = rest.starts_with('[') ? takeBracketed(rest, text) : takeName(rest, text);
    url.port = url.encrypted ? encryptedPort : plainPort;
    if (rest.starts_with(':')) {
        url.port = takePort(rest, text);
    }
    const bool good = rest.empty() || rest.front() == '/';
    const bool path = std::all_of(rest.begin(), rest.end(), [](char c) {
        return c > ' ' && c < 0x7F && c != '?' && c != '#' && c != '"' && c != '<' && c != '>';
    });
    if (!good || !path) {
        refuse(text, "the form is https://HOST[:PORT][/PATH]");
    }
    url.path = rest.size() > 1 ? std::string(rest) : "/cimom";
    return url;
}

std::vector<ServerUrl> readServers(std::istream& lines, const std::string& name) {
    std::vector<ServerUrl> servers;
    std::string line;
    for (unsigned number = 1; std::getline(lines, line); ++number) {
        line.erase(std::min(line.find('#'), line.size()));
        constexpr const char* blanks = " \t\r";
        line.erase(0, line.find_first_not_of(blanks));
        line.erase(line.find_last_not_of(blanks) + 1);
        if (line.empty()) {
            continue;
        }
        try {
            servers.push_back(readServerUrl(line));
        } catch (const Failure& failure) {
            throw Failure(ExitStatus::usage,
                          name + ": line " + std::to_string(number) + ": " + failure.what());
        }
    }
    if (servers.empty()) {
        throw Failure(ExitStatus::usage, name + ": no server is named in it");
    }
    return servers;
}

std::vector<ServerUrl> readServersFile(const std::string& file) {
    if (file == "-") {
        return readServers(std::cin, "standard input");
    }
    constexpr std::size_t longest = 16U << 20U;
    const auto content = ZR::File::read(file, longest);
    if (!content) {
        throw Failure(ExitStatus::notLoaded, printable(file) + ": " + std::strerror(errno));
    }
    std::istringstream lines(*content);
    return readServers(lines, printable(file));
}

}  // namespace cimdhcp
