#include "clients/DhclientLease.h"

#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <chrono>
#include <cstddef>
#include <utility>

#include "facts/Lease.h"
#include "formats/Numbers.h"

namespace ZR::Live {
namespace {

/// Splits "a/b/c" or "a:b:c" into its numbers.
std::optional<std::array<int, 3>> threeNumbers(std::string_view text, char separator) {
    std::array<int, 3> numbers{};
    for (std::size_t i = 0; i < numbers.size(); ++i) {
        const bool last = i + 1 == numbers.size();
        const std::size_t end = last ? text.size() : text.find(separator);
        if (end == std::string_view::npos) {
            return std::nullopt;
        }
        const auto value = parseNumber<int>(text.substr(0, end));
        if (!value) {
            return std::nullopt;
        }
        numbers.at(i) = *value;
        text.remove_prefix(last ? end : end + 1);
    }
    return numbers;
}

/// The time of "WEEKDAY Y/M/D h:m:s" in UTC, "epoch SECONDS" or "never".
std::optional<std::int64_t> parseTime(const std::vector<std::string>& words) {
    if (!words.empty() && words[0] == "never") {
        return Lease::never;
    }
    if (words.size() >= 2 && words[0] == "epoch") {
        return parseNumber<std::int64_t>(words[1]);
    }
    if (words.size() < 3) {
        return std::nullopt;
    }
    const auto date = threeNumbers(words[1], '/');
    const auto time = threeNumbers(words[2], ':');
    if (!date || !time) {
        return std::nullopt;
    }
    const auto [year, month, day] = *date;
    const auto [hour, minute, second] = *time;
    const bool inRange = year >= 1970 && year <= 9999 && month >= 1 && month <= 12 && day >= 1 &&
                         day <= 31 && hour >= 0 && hour <= 23 && minute >= 0 && minute <= 59 &&
                         second >= 0 && second <= 60;
    if (!inRange) {
        return std::nullopt;
    }
    const std::chrono::year_month_day calendar{std::chrono::year{year},
                                               std::chrono::month{static_cast<unsigned>(month)},
                                               std::chrono::day{static_cast<unsigned>(day)}};
    if (!calendar.ok()) {
        return std::nullopt;
    }
    const std::int64_t days = std::chrono::sys_days{calendar}.time_since_epoch().count();
    return ((days * 24 + hour) * 60 + minute) * 60 + second;
}

enum class Mark : std::uint8_t { Word, Semicolon, Open, Close, End, Torn };

struct Token {
    Mark mark = Mark::End;
    std::string text;
};

/// The words of the file. Quoted texts are words: nothing in them ends anything.
class Tokens {
  public:
    explicit Tokens(std::string_view text) : rest_(text) {}

    Token next() {
        skipBlanksAndComments();
        if (rest_.empty()) {
            return {};
        }
        switch (rest_.front()) {
            case ';':
                return single(Mark::Semicolon);
            case '{':
                return single(Mark::Open);
            case '}':
                return single(Mark::Close);
            case '"':
                return quoted();
            default:
                return word();
        }
    }

  private:
    static constexpr std::string_view blanks = " \t\r\n\v\f";
    static constexpr std::string_view wordEnds = " \t\r\n\v\f;{}\"#";

    void skipBlanksAndComments() {
        for (;;) {
            rest_.remove_prefix(std::min(rest_.find_first_not_of(blanks), rest_.size()));
            if (!rest_.starts_with('#')) {
                return;
            }
            rest_.remove_prefix(std::min(rest_.find('\n'), rest_.size()));
        }
    }

    Token single(Mark mark) {
        rest_.remove_prefix(1);
        return {.mark = mark, .text = {}};
    }

    Token word() {
        const std::size_t length = std::min(rest_.find_first_of(wordEnds), rest_.size());
        Token token{.mark = Mark::Word, .text = std::string{rest_.substr(0, length)}};
        rest_.remove_prefix(length);
        return token;
    }

    Token quoted() {
        Token token{.mark = Mark::Word, .text = {}};
        rest_.remove_prefix(1);
        while (!rest_.empty()) {
            const char byte = rest_.front();
            rest_.remove_prefix(1);
            if (byte == '"') {
                return token;
            }
            if (byte != '\\') {
                token.text += byte;
            } else if (!rest_.empty()) {
                token.text += escaped();
            }
        }
        return {.mark = Mark::Torn, .text = {}};
    }

    char escaped() {
        const std::size_t digits =
            std::min({rest_.find_first_not_of("01234567"), rest_.size(), std::size_t{3}});
        if (digits != 0) {
            unsigned value = 0;
            std::from_chars(rest_.data(), rest_.data() + digits, value, 8);
            rest_.remove_prefix(digits);
            return static_cast<char>(static_cast<unsigned char>(value & 0xffU));
        }
        const char byte = rest_.front();
        rest_.remove_prefix(1);
        switch (byte) {
            case 'n':
                return '\n';
            case 't':
                return '\t';
            case 'r':
                return '\r';
            case 'b':
                return '\b';
            default:
                return byte;
        }
    }

    std::string_view rest_;
};

/// The words up to what ends a statement. A "{" begins the statement's block, a
/// "}" ends the block around it.
struct Statement {
    std::vector<std::string> words;
    Mark end = Mark::End;

    [[nodiscard]] std::string_view keyword() const {
        return words.empty() ? std::string_view{} : std::string_view{words.front()};
    }
    /// A word behind the keyword; empty when there are fewer.
    [[nodiscard]] std::string_view word(std::size_t position) const {
        return position < words.size() ? std::string_view{words[position]} : std::string_view{};
    }
    [[nodiscard]] bool broken() const { return end == Mark::End || end == Mark::Torn; }
};

class LeaseFile {
  public:
    explicit LeaseFile(std::string_view text) : tokens_(text) {}

    std::vector<DhclientLease> parse() {
        for (;;) {
            const Statement statement = next();
            if (statement.broken()) {
                return std::move(leases_);
            }
            if (statement.end != Mark::Open) {
                continue;
            }
            const bool ipv6 = statement.keyword() == "lease6";
            if (statement.words.size() == 1 && (ipv6 || statement.keyword() == "lease")) {
                parseBlock(ipv6);
            } else if (!skipBlock()) {
                return std::move(leases_);
            }
        }
    }

  private:
    Statement next() {
        Statement statement;
        for (;;) {
            Token token = tokens_.next();
            if (token.mark != Mark::Word) {
                statement.end = token.mark;
                return statement;
            }
            statement.words.push_back(std::move(token.text));
        }
    }

    /// Skips the rest of a block whose "{" was taken; false when the file ends in it.
    bool skipBlock() {
        for (std::size_t depth = 1; depth != 0;) {
            switch (tokens_.next().mark) {
                case Mark::Open:
                    ++depth;
                    break;
                case Mark::Close:
                    --depth;
                    break;
                case Mark::End:
                case Mark::Torn:
                    return false;
                default:
                    break;
            }
        }
        return true;
    }

    void parseBlock(bool ipv6) {
        std::optional<InterfaceName> interfaceName;
        std::vector<DhclientAddress> addresses;
        std::optional<IpAddress> server;
        bool bootp = false;
        bool released = false;
        std::optional<std::int64_t> expires;
        const bool whole = forEachStatement([&](const Statement& statement) {
            const std::string_view keyword = statement.keyword();
            if (statement.end == Mark::Open) {
                const bool holdsAddresses = keyword == "ia-na" || keyword == "ia-ta";
                return ipv6 && holdsAddresses ? parseAssociation(addresses) : skipBlock();
            }
            if (keyword == "interface") {
                interfaceName = InterfaceName::from(statement.word(1));
            } else if (keyword == "fixed-address" && !ipv6) {
                if (const auto address = IpAddress::fromText(AF_INET, statement.word(1))) {
                    addresses = {{.address = *address, .expires = {}}};
                }
            } else if (keyword == "option" && statement.word(1) == "dhcp-server-identifier") {
                server = IpAddress::fromText(AF_INET, statement.word(2));
            } else if (keyword == "expire") {
                expires = parseTime({statement.words.begin() + 1, statement.words.end()});
            } else if (keyword == "bootp") {
                bootp = true;
            } else if (keyword == "released") {
                released = true;
            }
            return true;
        });
        if (!whole || !interfaceName) {
            return;
        }
        if (!ipv6) {
            // A BOOTP reply has no lease time: the address is for ever (RFC 951).
            if (bootp && !expires) {
                expires = Lease::never;
            }
            for (DhclientAddress& address : addresses) {
                address.expires = expires;
            }
        }
        keep({.ipv6 = ipv6,
              .interfaceName = *interfaceName,
              .addresses = std::move(addresses),
              .server = server,
              .bootp = bootp,
              .released = released});
    }

    /// Runs over the statements of a block whose "{" was taken. False when the file
    /// ends in it, or when the action says so.
    template <typename Action>
    bool forEachStatement(Action action) {
        for (;;) {
            const Statement statement = next();
            if (statement.broken() || !action(statement)) {
                return false;
            }
            if (statement.end == Mark::Close) {
                return true;
            }
        }
    }

    bool parseAssociation(std::vector<DhclientAddress>& addresses) {
        std::optional<std::int64_t> starts;
        return forEachStatement([&](const Statement& statement) {
            if (statement.end == Mark::Open) {
                return statement.keyword() == "iaaddr"
                           ? parseLeasedAddress(statement.word(1), starts, addresses)
                           : skipBlock();
            }
            if (statement.keyword() == "starts") {
                starts = parseNumber<std::int64_t>(statement.word(1));
            }
            return true;
        });
    }

    bool parseLeasedAddress(std::string_view text, std::optional<std::int64_t> starts,
                            std::vector<DhclientAddress>& addresses) {
        std::optional<std::uint32_t> lifetime;
        const bool whole = forEachStatement([&](const Statement& statement) {
            if (statement.end == Mark::Open) {
                return skipBlock();
            }
            if (statement.keyword() == "starts") {
                starts = parseNumber<std::int64_t>(statement.word(1));
            } else if (statement.keyword() == "max-life") {
                lifetime = parseNumber<std::uint32_t>(statement.word(1));
            }
            return true;
        });
        if (const auto address = IpAddress::fromText(AF_INET6, text)) {
            addresses.push_back({.address = *address, .expires = end(starts, lifetime)});
        }
        return whole;
    }

    static std::optional<std::int64_t> end(std::optional<std::int64_t> starts,
                                           std::optional<std::uint32_t> lifetime) {
        if (lifetime == UINT32_MAX) {  // for ever (RFC 8415, section 7.7)
            return Lease::never;
        }
        if (!starts || !lifetime || *starts < 0 || *starts > Lease::never - UINT32_MAX) {
            return std::nullopt;
        }
        return *starts + *lifetime;
    }

    void keep(DhclientLease&& lease) {
        const auto older =
            std::find_if(leases_.begin(), leases_.end(), [&](const DhclientLease& kept) {
                return kept.ipv6 == lease.ipv6 && kept.interfaceName == lease.interfaceName;
            });
        if (older != leases_.end()) {
            *older = std::move(lease);
        } else {
            leases_.push_back(std::move(lease));
        }
    }

    Tokens tokens_;
    std::vector<DhclientLease> leases_;
};

}  // namespace

std::vector<DhclientLease> parseDhclientLeases(std::string_view text) {
    return LeaseFile{text}.parse();
}

}  // namespace ZR::Live
