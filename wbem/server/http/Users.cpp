#include "wbem/Users.h"

#include <crypt.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <fstream>
#include <memory>
#include <sstream>

#include "cimom/Names.h"

namespace cimom::wbem {

namespace {

[[noreturn]] void fail(const std::filesystem::path& file, const std::string& reason) {
    throw UsersError(file.string() + ": " + reason);
}

[[noreturn]] void failErrno(const std::filesystem::path& file) {
    fail(file, std::strerror(errno));
}

/// Reads the users of a text; `file` is for messages.
std::vector<User> parse(const std::string& text, const std::filesystem::path& file) {
    std::vector<User> users;
    std::istringstream lines(text);
    std::string line;
    for (unsigned number = 1; std::getline(lines, line); ++number) {
        if (line.empty() || line.front() == '#') {
            continue;
        }
        const std::string where = "line " + std::to_string(number) + ": ";
        const std::size_t first = line.find(':');
        const std::size_t second = first == std::string::npos ? first : line.find(':', first + 1);
        if (second == std::string::npos) {
            fail(file, where + "not of the form NAME:ROLE:HASH");
        }
        User user{line.substr(0, first), Role::read, line.substr(second + 1)};
        const auto role = roleFromName(line.substr(first + 1, second - first - 1));
        if (!isUserName(user.name) || !role || user.hash.size() < 4 || user.hash[0] != '$') {
            fail(file, where + "not of the form NAME:ROLE:HASH");
        }
        user.role = *role;
        if (std::any_of(users.begin(), users.end(),
                        [&user](const User& other) { return other.name == user.name; })) {
            fail(file, where + "user " + user.name + " is there twice");
        }
        users.push_back(std::move(user));
    }
    return users;
}

std::string contentOf(const std::filesystem::path& file) {
    errno = 0;
    std::ifstream stream(file, std::ios::binary);
    std::ostringstream content;
    content << stream.rdbuf();
    if (!stream.is_open() || stream.bad()) {
        failErrno(file);
    }
    return content.str();
}

struct ::stat statusOf(const std::filesystem::path& file) {
    struct ::stat status {};
    if (::stat(file.c_str(), &status) != 0) {
        failErrno(file);
    }
    return status;
}

/// A new file beside another one, removed unless it takes the other's place.
class Replacement {
  public:
    explicit Replacement(const std::filesystem::path& target)
        : target_(target), name_(target.string() + ".XXXXXX"), fd_(::mkstemp(name_.data())) {
        if (fd_ < 0) {
            failErrno(target_);
        }
    }
    ~Replacement() {
        if (fd_ >= 0) {
            ::close(fd_);
            ::unlink(name_.c_str());
        }
    }
    Replacement(const Replacement&) = delete;
    Replacement& operator=(const Replacement&) = delete;

    [[nodiscard]] int fd() const noexcept { return fd_; }

    void write(std::string_view text) const {
        while (!text.empty()) {
            const ssize_t written = ::write(fd_, text.data(), text.size());
            if (written < 0 && errno != EINTR) {
                failErrno(target_);
            }
            text.remove_prefix(written < 0 ? 0 : static_cast<std::size_t>(written));
        }
    }

    void take() {
        if (::fsync(fd_) != 0 || ::rename(name_.c_str(), target_.c_str()) != 0) {
            failErrno(target_);
        }
        // Everything is on the disk; nothing can be lost by a failing close.
        ::close(fd_);
        fd_ = -1;
    }

  private:
    std::filesystem::path target_;
    std::string name_;
    int fd_;
};

/// The memory that crypt(3) needs is too large for a thread's stack. It holds the
/// password's traces, which are wiped.
struct Wiped {
    void operator()(crypt_data* data) const noexcept {
        ::explicit_bzero(data, sizeof *data);
        std::default_delete<crypt_data>()(data);
    }
};

/// The hash, or nothing when the setting cannot be used.
std::optional<std::string> hashed(const std::string& password, const std::string& setting) {
    const std::unique_ptr<crypt_data, Wiped> data(std::make_unique<crypt_data>().release());
    const char* const hash = ::crypt_r(password.c_str(), setting.c_str(), data.get());
    // A failure is told by a text that is not a hash and begins with an asterisk.
    if (hash == nullptr || hash[0] == '*') {
        return std::nullopt;
    }
    return hash;
}

}  // namespace

bool isUserName(std::string_view name) noexcept {
    constexpr std::size_t longest = 64;
    return !name.empty() && name.size() <= longest &&
           std::all_of(name.begin(), name.end(), [](char letter) {
               return isNamePart(letter) || letter == '.' || letter == '-' || letter == '@';
           });
}

std::optional<Role> roleFromName(std::string_view name) noexcept {
    if (name == "read") {
        return Role::read;
    }
    return name == "modify" ? std::optional(Role::modify) : std::nullopt;
}

std::string_view roleName(Role role) noexcept {
    return role == Role::read ? "read" : "modify";
}

std::vector<User> readUsers(const std::filesystem::path& file) {
    const struct ::stat status = statusOf(file);
    if ((status.st_mode & (S_IWGRP | S_IRWXO)) != 0) {
        fail(file, "may be read or written by others; \"chmod 640\" mends that");
    }
    std::vector<User> users = parse(contentOf(file), file);
    if (users.empty()) {
        fail(file, "names no user; \"cimdhcp user add\" adds one");
    }
    return users;
}

void putUser(const std::filesystem::path& file, const User& user) {
    std::error_code error;
    const bool exists = std::filesystem::exists(file, error);
    std::vector<User> users;
    std::string text = "# NAME:ROLE:HASH, made by \"cimdhcp user add\"\n";
    if (exists) {
        users = parse(contentOf(file), file);
    }
    const auto known = std::find_if(users.begin(), users.end(),
                                    [&user](const User& other) { return other.name == user.name; });
    if (known == users.end()) {
        users.push_back(user);
    } else {
        *known = user;
    }
    for (const User& each : users) {
        text += each.name + ':' + std::string(roleName(each.role)) + ':' + each.hash + '\n';
    }
    Replacement replacement(file);
    replacement.write(text);
    if (exists) {
        const struct ::stat status = statusOf(file);
        const ::mode_t mode = status.st_mode & (S_IRUSR | S_IWUSR | S_IRGRP);
        if (::fchown(replacement.fd(), status.st_uid, status.st_gid) != 0 ||
            ::fchmod(replacement.fd(), mode) != 0) {
            failErrno(file);
        }
    }
    replacement.take();
}

std::string hashPassword(const std::string& password) {
    if (password.empty() || password.size() >= CRYPT_MAX_PASSPHRASE_SIZE ||
        password.find('\0') != std::string::npos) {
        throw std::invalid_argument("a password has 1 to 511 bytes");
    }
    std::array<char, CRYPT_GENSALT_OUTPUT_SIZE> salt{};
    // 0 is the library's own choice of cost; no bytes: the system's random numbers.
    if (::crypt_gensalt_rn("$y$", 0, nullptr, 0, salt.data(), salt.size()) == nullptr) {
        throw std::runtime_error(std::string("yescrypt: ") + std::strerror(errno));
    }
    auto hash = hashed(password, salt.data());
    if (!hash) {
        throw std::runtime_error(std::string("yescrypt: ") + std::strerror(errno));
    }
    return *std::move(hash);
}

bool passwordMatches(const std::string& password, const std::string& hash) {
    if (password.size() >= CRYPT_MAX_PASSPHRASE_SIZE || password.find('\0') != std::string::npos) {
        return false;
    }
    const auto made = hashed(password, hash);
    if (!made || made->size() != hash.size()) {
        return false;
    }
    unsigned char difference = 0;
    for (std::size_t at = 0; at < hash.size(); ++at) {
        difference =
            static_cast<unsigned char>(difference | (static_cast<unsigned char>((*made)[at]) ^
                                                     static_cast<unsigned char>(hash[at])));
    }
    return difference == 0;
}

}  // namespace cimom::wbem
