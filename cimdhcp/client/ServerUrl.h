#pragma once

#include <cstdint>
#include <istream>
#include <string>
#include <vector>

namespace cimdhcp {

/// Where a WBEM server is.
struct ServerUrl {
    std::string given;  ///< as the person wrote it
    bool encrypted = true;
    std::string host;  ///< a name or an address, an IPv6 address without brackets
    std::uint16_t port = 0;
    std::string path;  ///< with the leading slash

    /// "https://host:5989/cimom"
    [[nodiscard]] std::string text() const;
    /// Whether it is on this machine, where no one can listen on the way.
    [[nodiscard]] bool isHere() const;

    bool operator==(const ServerUrl&) const = default;
};

/// Reads http://HOST[:PORT][/PATH], https://HOST[:PORT][/PATH] or HOST[:PORT], which
/// means https. Without a port it is 5988 for http, 5989 for https (DSP0200), without
/// a path /cimom. Throws Failure, also for a user and a password in the URL.
[[nodiscard]] ServerUrl readServerUrl(const std::string& text);

/// Reads a URL or host per line; what follows "#" and empty lines are passed over.
/// `name` is for messages. Throws Failure.
[[nodiscard]] std::vector<ServerUrl> readServers(std::istream& lines, const std::string& name);

/// The same of a file, or of standard input for "-".
[[nodiscard]] std::vector<ServerUrl> readServersFile(const std::string& file);

}  // namespace cimdhcp
