#pragma once

#include <filesystem>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace cimom::wbem {

enum class Role { read, modify };

/// A person or program that may use the server.
struct User {
    std::string name;
    Role role = Role::read;
    std::string hash;  ///< of the password, as crypt(3) writes it

    bool operator==(const User&) const = default;
};

/// A users file that cannot be used; what() tells file, line and reason.
class UsersError : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

/// 1 to 64 letters, digits, dots, hyphens, underscores and at signs.
[[nodiscard]] bool isUserName(std::string_view name) noexcept;
[[nodiscard]] std::optional<Role> roleFromName(std::string_view name) noexcept;
[[nodiscard]] std::string_view roleName(Role role) noexcept;

/// Reads lines NAME:ROLE:HASH, "#" comments. Throws UsersError, also for a file
/// that others than its owner and group can read or that others than its owner can
/// write, for one without users, and for hashes that are guessed quickly.
[[nodiscard]] std::vector<User> readUsers(const std::filesystem::path& file);

/// Adds a user to the file, which is made if need be, or changes role and
/// password. The file is replaced at once, so that it is never seen half written;
/// owner, group and mode stay, and a symbolic link to it does. Several writers at once wait
/// for each other. Throws UsersError.
void putUser(const std::filesystem::path& file, const User& user);

/// The yescrypt hash of a password, with a new salt. Takes some 10 milliseconds,
/// on purpose. Throws std::runtime_error when the system has no yescrypt, and
/// std::invalid_argument for a password that crypt(3) cannot take: empty, longer
/// than 511 bytes, or with a null byte.
[[nodiscard]] std::string hashPassword(const std::string& password);

/// Compares in a time that does not depend on where the two differ.
[[nodiscard]] bool passwordMatches(const std::string& password, const std::string& hash);

}  // namespace cimom::wbem
