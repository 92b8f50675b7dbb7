#include "http/Authenticator.h"

#include <gnutls/crypto.h>
#include <gnutls/gnutls.h>

#include <algorithm>
#include <new>
#include <stdexcept>
#include <utility>

#include "cimom/Names.h"

namespace cimom::wbem {

namespace {

constexpr std::chrono::seconds memoryTime{60};
constexpr std::size_t mostMemories = 1024;

std::optional<unsigned> base64Digit(char letter) noexcept {
    constexpr std::string_view digits =
        "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
    const std::size_t at = digits.find(letter);
    return at == std::string_view::npos ? std::nullopt : std::optional(static_cast<unsigned>(at));
}

std::optional<std::string> base64Decoded(std::string_view text) {
    while (text.ends_with('=')) {
        text.remove_suffix(1);
    }
    std::string bytes;
    unsigned bits = 0;
    unsigned count = 0;
    for (const char letter : text) {
        const auto digit = base64Digit(letter);
        if (!digit) {
            return std::nullopt;
        }
        bits = (bits << 6U | *digit) & 0xFFFFFFU;
        count += 6;
        if (count >= 8) {
            count -= 8;
            bytes += static_cast<char>((bits >> count) & 0xFFU);
        }
    }
    return bytes;
}

struct Credentials {
    std::string user;
    std::string password;
};

std::optional<Credentials> readBasic(std::string_view authorization) {
    constexpr std::string_view scheme = "Basic ";
    if (!sameName(authorization.substr(0, scheme.size()), scheme)) {
        return std::nullopt;
    }
    authorization.remove_prefix(scheme.size());
    while (authorization.starts_with(' ')) {
        authorization.remove_prefix(1);
    }
    const auto text = base64Decoded(authorization);
    const std::size_t colon = text ? text->find(':') : std::string::npos;
    if (colon == std::string::npos) {
        return std::nullopt;
    }
    return Credentials{text->substr(0, colon), text->substr(colon + 1)};
}

}  // namespace

Authenticator::Authenticator(std::vector<User> users, std::function<Clock::time_point()> now)
    : now_(std::move(now)), dummyHash_(hashPassword("nobody's")), users_(std::move(users)) {
    if (gnutls_rnd(GNUTLS_RND_KEY, key_.data(), key_.size()) != GNUTLS_E_SUCCESS) {
        throw std::runtime_error("there are no random numbers");
    }
}

Authenticator::Digest Authenticator::digest(std::string_view authorization) const {
    Digest made{};
    if (gnutls_hmac_fast(GNUTLS_MAC_SHA256, key_.data(), key_.size(), authorization.data(),
                         authorization.size(), made.data()) != GNUTLS_E_SUCCESS) {
        throw std::bad_alloc();
    }
    return made;
}

std::optional<User> Authenticator::find(std::string_view name) const {
    const std::lock_guard lock(mutex_);
    const auto found = std::find_if(users_.begin(), users_.end(),
                                    [name](const User& user) { return user.name == name; });
    return found == users_.end() ? std::nullopt : std::optional(*found);
}

void Authenticator::renew(std::vector<User> users) {
    const std::lock_guard lock(mutex_);
    users_ = std::move(users);
    memory_.clear();
}

std::optional<Identity> Authenticator::remembered(std::string_view authorization) {
    const Digest key = digest(authorization);
    const auto now = now_();
    const std::lock_guard lock(mutex_);
    const auto found = memory_.find(key);
    if (found == memory_.end() || found->second.end <= now) {
        return std::nullopt;
    }
    return found->second.identity;
}

std::optional<Identity> Authenticator::check(std::string_view authorization) {
    const auto credentials = readBasic(authorization);
    if (!credentials) {
        return std::nullopt;
    }
    const std::optional<User> user = find(credentials->user);
    const bool right = passwordMatches(credentials->password, user ? user->hash : dummyHash_);
    if (!user || !right) {
        return std::nullopt;
    }
    Identity identity{user->name, user->role};
    const Digest key = digest(authorization);
    const auto now = now_();
    const std::lock_guard lock(mutex_);
    std::erase_if(memory_, [now](const auto& entry) { return entry.second.end <= now; });
    // The users may have been renewed meanwhile: what was right before is not remembered.
    const bool known = std::find(users_.begin(), users_.end(), *user) != users_.end();
    if (known && memory_.size() < mostMemories) {
        memory_.insert_or_assign(key, Memory{identity, now + memoryTime});
    }
    return identity;
}

std::string Authenticator::claimedUser(std::string_view authorization) const {
    const auto credentials = readBasic(authorization);
    const std::optional<User> user = credentials ? find(credentials->user) : std::nullopt;
    return user ? "user " + user->name : "an unknown user";
}

}  // namespace cimom::wbem
