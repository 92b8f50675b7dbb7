#include "wbem/Users.h"

#include <crypt.h>
#include <fcntl.h>
#include <sys/file.h>
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

/// Whether a hash is of a kind that takes long to guess: yescrypt and its kin, scrypt, bcrypt,
/// and the SHA-2 hashes of many rounds; not MD5, SHA-1, NT and DES.
bool isStrong(std::string_view hash) noexcept {
    constexpr std::array<std::string_view, 8> kinds{"$y$",  "$gy$", "$7$", "$2a$",
                                                    "$2b$", "$2y$", "$6$", "$5$"};
    return std::any_of(kinds.begin(), kinds.end(),
                       [hash](std::string_view kind) { return hash.starts_with(kind); });
}

enum class Hashes { strong, any };

/// Reads the users of a text; `file` is for messages.
std::vector<User> parse(const std::string& text, const std::filesystem::path& file, Hashes hashes) {
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
        if (!isUserName(user.name) || !role || user.hash.empty()) {
            fail(file, where + "not of the form NAME:ROLE:HASH");
        }
        if (hashes == Hashes::strong && !isStrong(user.hash)) {
            fail(file, where + "the hash of user " + user.name +
                           " is of a kind that is guessed quickly, or is none; \"cimdhcp user "
                           "add\" makes a good one");
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

/// An open users file that is locked for writers. The lock is on the file itself, which
/// strangers cannot open.
class LockedFile {
  public:
    explicit LockedFile(const std::filesystem::path& file)
        : fd_(::open(file.c_str(), O_RDONLY | O_CREAT | O_CLOEXEC | O_NOCTTY, S_IRUSR | S_IWUSR)) {
        bool locked = false;
        while (fd_ >= 0 && !locked) {
            locked = ::flock(fd_, LOCK_EX) == 0;
            if (!locked && errno != EINTR) {
                break;
            }
        }
        if (!locked) {
            const int error = errno;
            close();
            fail(file, std::strerror(error));
        }
    }
    ~LockedFile() { close(); }
    LockedFile(const LockedFile&) = delete;
    LockedFile& operator=(const LockedFile&) = delete;

    /// Whether the name stands for this file, and not for one that has replaced it.
    [[nodiscard]] bool isStill(const std::filesystem::path& file) const noexcept {
        struct ::stat own {};
        struct ::stat named {};
        return ::fstat(fd_, &own) == 0 && ::stat(file.c_str(), &named) == 0 &&
               own.st_dev == named.st_dev && own.st_ino == named.st_ino;
    }

  private:
    void close() const noexcept {
        if (fd_ >= 0) {
            ::close(fd_);
        }
    }

    int fd_;
};

/// Keeps other writers from a users file, which is made if need be, for as long as the result
/// lives.
std::unique_ptr<const LockedFile> lockUsers(const std::filesystem::path& file) {
    auto lock = std::make_unique<const LockedFile>(file);
    while (!lock->isStill(file)) {
        // The writer before has put another file into its place.
        lock = std::make_unique<const LockedFile>(file);
    }
    return lock;
}

/// The file that a name stands for: through symbolic links, so that the file is replaced and
/// not the link. A link to nothing is refused.
std::filesystem::path targetOf(const std::filesystem::path& file) {
    std::error_code error;
    if (!std::filesystem::is_symlink(std::filesystem::symlink_status(file, error))) {
        return file;
    }
    std::filesystem::path target = std::filesystem::canonical(file, error);
    if (error) {
        fail(file, "a symbolic link that leads nowhere: " + error.message());
    }
    return target;
}

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
    std::vector<User> users = parse(contentOf(file), file, Hashes::strong);
    if (users.empty()) {
        fail(file, "names no user; \"cimdhcp user add\" adds one");
    }
    return users;
}

void putUser(const std::filesystem::path& file, const User& user) {
    const std::filesystem::path target = targetOf(file);
    const auto lock = lockUsers(target);
    std::string text = "# NAME:ROLE:HASH, made by \"cimdhcp user add\"\n";
    // Hashes of any kind: with this call a weak one gets replaced.
    std::vector<User> users = parse(contentOf(target), target, Hashes::any);
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
    Replacement replacement(target);
    replacement.write(text);
    const struct ::stat status = statusOf(target);
    const ::mode_t mode = status.st_mode & (S_IRUSR | S_IWUSR | S_IRGRP);
    if (::fchown(replacement.fd(), status.st_uid, status.st_gid) != 0 ||
        ::fchmod(replacement.fd(), mode) != 0) {
        failErrno(target);
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
