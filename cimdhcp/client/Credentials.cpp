#include "client/Credentials.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <charconv>
#include <cstdlib>
#include <cstring>
#include <system_error>

#include "cimom/Names.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "zrcommon/UniqueFd.h"

namespace cimdhcp {

namespace {

/// The words of the text, with the lines that they stand in.
class Words {
  public:
    Words(std::string_view text, const std::string& name) : rest_(text), name_(name) {}

    /// None at the end.
    std::optional<std::string> next() {
        skip();
        if (rest_.empty()) {
            return std::nullopt;
        }
        return rest_.front() == '"' ? quoted() : plain();
    }

    std::string required(const char* what) {
        auto word = next();
        if (!word || word->empty()) {
            refuse(std::string(what) + " is missing");
        }
        return *std::move(word);
    }

    [[noreturn]] void refuse(const std::string& reason) const {
        throw Failure(ExitStatus::notLoaded,
                      name_ + ": line " + std::to_string(line_) + ": " + reason);
    }

  private:
    static bool isBlank(char c) noexcept { return c == ' ' || c == '\t' || c == '\r'; }

    void skip() {
        while (!rest_.empty() && (isBlank(rest_.front()) || rest_.front() == '\n' || comment())) {
            if (rest_.front() == '\n') {
                ++line_;
                lineStart_ = true;
                rest_.remove_prefix(1);
            } else if (comment()) {
                rest_.remove_prefix(std::min(rest_.find('\n'), rest_.size()));
            } else {
                rest_.remove_prefix(1);
            }
        }
        lineStart_ = false;
    }

    /// Only at the beginning of a line: a password may hold the sign.
    [[nodiscard]] bool comment() const noexcept { return lineStart_ && rest_.front() == '#'; }

    std::string plain() {
        const auto* const end = std::find_if(rest_.begin(), rest_.end(),
                                             [](char c) { return isBlank(c) || c == '\n'; });
        std::string word(rest_.begin(), end);
        rest_.remove_prefix(word.size());
        return word;
    }

    std::string quoted() {
        std::string word;
        rest_.remove_prefix(1);
        while (!rest_.empty() && rest_.front() != '"' && rest_.front() != '\n') {
            if (rest_.front() == '\\' && rest_.size() > 1) {
                rest_.remove_prefix(1);
            }
            word += rest_.front();
            rest_.remove_prefix(1);
        }
        if (rest_.empty() || rest_.front() != '"') {
            refuse("a quotation mark is not closed");
        }
        rest_.remove_prefix(1);
        return word;
    }

    std::string_view rest_;
    const std::string& name_;
    unsigned line_ = 1;
    bool lineStart_ = true;
};

void readMachine(Credential& credential, const Words& words) {
    std::string& host = credential.host;
    const std::size_t bracket = host.starts_with('[') ? host.find(']') : std::string::npos;
    std::size_t colon = host.find(':');
    if (bracket != std::string::npos) {
        colon = host.find(':', bracket);
    } else if (colon != host.rfind(':')) {
        return;  // several colons: an IPv6 address without a port
    }
    if (colon != std::string::npos) {
        std::uint16_t port = 0;
        const char* const end = host.data() + host.size();
        const auto [stop, error] = std::from_chars(host.data() + colon + 1, end, port);
        if (error != std::errc() || stop != end || port == 0) {
            words.refuse("a port is a number from 1 to 65535");
        }
        credential.port = port;
        host.erase(colon);
    }
    if (bracket != std::string::npos) {
        host = host.substr(1, bracket - 1);
    }
}

bool hasControls(std::string_view text) {
    return std::any_of(text.begin(), text.end(),
                       [](char c) { return static_cast<unsigned char>(c) < ' ' || c == 0x7F; });
}

void checkStatus(int fd, const std::string& name, const std::string& file) {
    struct ::stat status {};
    if (::fstat(fd, &status) != 0) {
        throw Failure(ExitStatus::notLoaded, name + ": " + std::strerror(errno));
    }
    if (!S_ISREG(status.st_mode)) {
        throw Failure(ExitStatus::notLoaded, name + ": is not a regular file");
    }
    if (status.st_uid != ::geteuid() && status.st_uid != 0) {
        throw Failure(
            ExitStatus::notLoaded,
            name + ": belongs to another user, who can change it; use a file of your own");
    }
    // Of a file that systemd hands over to a service, an access list gives the service's user the
    // right to read, which shows as one of the group; only that user gets into the directory.
    const char* const handedOver = std::getenv("CREDENTIALS_DIRECTORY");
    const bool isHandedOver = handedOver != nullptr && *handedOver != '\0' &&
                              file.starts_with(std::string(handedOver) + '/') &&
                              file.find("/../") == std::string::npos && status.st_uid == 0;
    const ::mode_t others = isHandedOver ? S_IWGRP | S_IXGRP | S_IRWXO : S_IRWXG | S_IRWXO;
    if ((status.st_mode & others) != 0) {
        throw Failure(ExitStatus::notLoaded,
                      name +
                          ": others than its owner may use it, and it holds passwords; "
                          "chmod 600 " +
                          printable(file));
    }
}

std::string readAll(int fd, const std::string& name) {
    constexpr std::size_t longest = 4U << 20U;
    std::string text;
    std::array<char, 4096> piece{};
    while (text.size() <= longest) {
        const ssize_t got = ::read(fd, piece.data(), piece.size());
        if (got == 0) {
            return text;
        }
        if (got > 0) {
            text.append(piece.data(), static_cast<std::size_t>(got));
        } else if (errno != EINTR) {
            throw Failure(ExitStatus::notLoaded, name + ": " + std::strerror(errno));
        }
    }
    throw Failure(ExitStatus::notLoaded, name + ": is too large");
}

}  // namespace

std::vector<Credential> parseCredentials(std::string_view text, const std::string& name) {
    std::vector<Credential> credentials;
    Words words(text, name);
    while (const auto word = words.next()) {
        if (*word != "machine") {
            words.refuse("not of the form \"machine HOST login USER password SECRET\"");
        }
        Credential credential;
        credential.host = words.required("the host");
        readMachine(credential, words);
        if (words.next() != "login") {
            words.refuse("\"login USER\" belongs behind the host");
        }
        credential.user = words.required("the user");
        if (words.next() != "password") {
            words.refuse("\"password SECRET\" belongs behind the user");
        }
        credential.password = words.required("the password");
        // RFC 7617, 2: the colon ends the user, and neither holds controls.
        if (credential.user.find(':') != std::string::npos || hasControls(credential.user) ||
            hasControls(credential.password)) {
            words.refuse(
                "a user has no colon, and neither it nor the password a control "
                "character");
        }
        credentials.push_back(std::move(credential));
    }
    return credentials;
}

std::vector<Credential> readCredentials(const std::string& file) {
    const std::string name = printable(file);
    // O_NONBLOCK: opening a pipe would wait for its writer.
    const ZR::UniqueFd fd(::open(file.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
    if (!fd) {
        throw Failure(ExitStatus::notLoaded, name + ": " + std::strerror(errno));
    }
    checkStatus(fd.get(), name, file);
    return parseCredentials(readAll(fd.get(), name), name);
}

const Credential* credentialFor(const std::vector<Credential>& credentials, std::string_view host,
                                std::uint16_t port) noexcept {
    const Credential* any = nullptr;
    for (const Credential& credential : credentials) {
        if (!cimom::sameName(credential.host, host)) {
            continue;
        }
        if (credential.port == port) {
            return &credential;
        }
        if (!credential.port && any == nullptr) {
            any = &credential;
        }
    }
    return any;
}

}  // namespace cimdhcp
