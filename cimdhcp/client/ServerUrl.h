#pragma once

#include <istream>
#include <string>
#include <vector>

#include "transport/HttpUrl.h"

namespace cimdhcp {

/// Where a WBEM server is, as a person says it.
struct ServerUrl : cimom::wbem::HttpUrl {
    std::string given;  ///< as the person wrote it

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
