#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace cimdhcp {

/// A user of a server.
struct Credential {
    std::string host;                   ///< as in the URL, an IPv6 address without brackets
    std::optional<std::uint16_t> port;  ///< none: any
    std::string user;
    std::string password;

    bool operator==(const Credential&) const = default;
};

/// Reads "machine HOST[:PORT] login USER password SECRET", the words apart by blanks
/// or line ends as in .netrc; lines that begin with "#" are comments, and what holds
/// blanks stands in double quotes, with \" and \\ for the two signs. `name` is for
/// messages, which never hold a password. Throws Failure.
[[nodiscard]] std::vector<Credential> parseCredentials(std::string_view text,
                                                       const std::string& name);

/// The same of a file. Throws Failure, too, for one that others than its owner can
/// read or write, or whose owner is neither the caller nor root.
[[nodiscard]] std::vector<Credential> readCredentials(const std::string& file);

/// The first one for the host and the port; one that names the port counts before one
/// for any port. Null: there is none.
[[nodiscard]] const Credential* credentialFor(const std::vector<Credential>& credentials,
                                              std::string_view host, std::uint16_t port) noexcept;

}  // namespace cimdhcp
