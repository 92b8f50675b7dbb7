#include "clients/DhclientLease.h"

#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <chrono>
#include <cstddef>
#include <utility>

#include "facts/Lease.h"
#include "formats/ValueFormats.h"

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

/// Seconds that count from a start; UINT32_MAX stands for ever (RFC 8415, section 7.7).
std::optional<std::int64_t> timeAfter(std::optional<std::int64_t> start,
                                      std::optional<std::uint32_t> seconds) {
    if (seconds == UINT32_MAX) {
        return Lease::never;
    }
    if (!start || !seconds || *start < 0 || *start > Lease::never - UINT32_MAX) {
        return std::nullopt;
    }
    return *start + *seconds;
}

/// The bytes of an identifier as dhclient writes those that are not a text.
std::string identifierText(std::string_view bytes) {
    const auto isText = [](char byte) { return byte > ' ' && byte <= '~'; };
    if (std::all_of(bytes.begin(), bytes.end(), isText)) {
        return std::string{bytes};
    }
    std::string text;
    for (const char byte : bytes) {
        std::array<char, 2> digits{};
        const auto end = std::to_chars(digits.data(), digits.data() + digits.size(),
                                       static_cast<unsigned char>(byte), 16);
        text.append(text.empty() ? "" : ":").append(digits.data(), end.ptr);
    }
    return text;
}

/// The words of the file. Quoted texts are words: nothing in them ends anything.
class Tokens {
  public:
    explicit Tokens(std::string_view text) : whole_(text), rest_(text) {}

    /// Goes to the next token and tells its place.
    std::size_t place() {
        skipBlanksAndComments();
        return whole_.size() - rest_.size();
    }

    [[nodiscard]] std::size_t lineOf(std::size_t place) const {
        const std::string_view before = whole_.substr(0, place);
        return 1 + static_cast<std::size_t>(std::count(before.begin(), before.end(), '\n'));
    }

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

    std::string_view whole_;
    std::string_view rest_;
};

/// The words up to what ends a statement. A "{" begins the statement's block, a
/// "}" ends the block around it.
struct Statement {
    std::vector<std::string> words;
    Mark end = Mark::End;
    std::size_t place = 0;  // of its first token

    [[nodiscard]] std::string_view keyword() const {
        return words.empty() ? std::string_view{} : std::string_view{words.front()};
    }
    /// A word behind the keyword; empty when there are fewer.
    [[nodiscard]] std::string_view word(std::size_t position) const {
        return position < words.size() ? std::string_view{words[position]} : std::string_view{};
    }
    [[nodiscard]] bool broken() const { return end == Mark::End || end == Mark::Torn; }
};

/// What a block has said so far.
struct Block {
    explicit Block(std::size_t start) : place(start) {}

    /// The first thing that is wrong with it counts.
    void reject(std::string reason) {
        if (damage.empty()) {
            damage = std::move(reason);
        }
    }
    void addOption(std::optional<std::uint16_t> code) {
        if (code && std::find(options.begin(), options.end(), *code) == options.end()) {
            options.push_back(*code);
        }
    }

    std::size_t place;
    std::optional<InterfaceName> interfaceName;
    std::vector<DhclientAddress> addresses;
    std::optional<IpAddress> server;
    bool bootp = false;
    bool released = false;
    std::vector<std::uint16_t> options;
    std::string clientIdentifier;
    std::optional<std::int64_t> expires;
    std::optional<std::int64_t> renews;
    std::optional<std::int64_t> rebinds;
    std::optional<std::uint32_t> leaseTime;
    std::string damage;
};

class LeaseFile {
  public:
    explicit LeaseFile(std::string_view text) : tokens_(text) {}

    DhclientLeases parse() && {
        while (parseStatement()) {
        }
        return std::move(result_);
    }

  private:
    /// False behind the last one.
    bool parseStatement() {
        const Statement statement = next();
        if (statement.broken()) {
            if (!statement.words.empty() || statement.end == Mark::Torn) {
                cutOff(statement.place, "the file ends within a statement");
            }
            return false;
        }
        if (statement.end == Mark::Close) {
            tell(statement.place, "a \"}\" that ends nothing");
        } else if (statement.end == Mark::Semicolon && statement.keyword() == "default-duid") {
            identifier6_ = identifierText(statement.word(1));
        } else if (statement.end == Mark::Open) {
            return parseBlock(statement);
        }
        return true;
    }

    Statement next() {
        Statement statement;
        statement.place = tokens_.place();
        for (;;) {
            Token token = tokens_.next();
            if (token.mark != Mark::Word) {
                statement.end = token.mark;
                return statement;
            }
            statement.words.push_back(std::move(token.text));
        }
    }

    void tell(std::size_t place, std::string what) {
        constexpr std::size_t most = 10;
        if (result_.damage.size() < most) {
            result_.damage.push_back({.line = tokens_.lineOf(place), .what = std::move(what)});
        }
    }

    void cutOff(std::size_t place, std::string what) {
        tell(place, std::move(what));
        result_.cutOff = true;
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

    /// False when the file ends in it.
    bool parseBlock(const Statement& start) {
        const bool ipv6 = start.keyword() == "lease6";
        const bool isLease = start.words.size() == 1 && (ipv6 || start.keyword() == "lease");
        Block block{start.place};
        const bool whole = !isLease ? skipBlock() : forEachStatement([&](const Statement& each) {
            return ipv6 ? take6(each, block) : take4(each, block);
        });
        if (!whole) {
            cutOff(start.place, "the file ends within this block");
        } else if (isLease) {
            ipv6 ? finish6(std::move(block)) : finish4(std::move(block));
        }
        return whole;
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

    static void takeEither(const Statement& statement, Block& block) {
        const std::string_view keyword = statement.keyword();
        if (keyword == "interface") {
            block.interfaceName = InterfaceName::from(statement.word(1));
        } else if (keyword == "bootp") {
            block.bootp = true;
        } else if (keyword == "released") {
            block.released = true;
        }
    }

    static std::optional<std::int64_t> timeIn(const Statement& statement, Block& block) {
        const auto time = parseTime({statement.words.begin() + 1, statement.words.end()});
        if (!time) {
            block.reject("\"" + std::string{statement.keyword()} + "\" is not followed by a time");
        }
        return time;
    }

    bool take4(const Statement& statement, Block& block) {
        const std::string_view keyword = statement.keyword();
        if (statement.end == Mark::Open) {
            return skipBlock();
        }
        if (keyword == "fixed-address") {
            if (const auto address = IpAddress::fromText(AF_INET, statement.word(1))) {
                block.addresses = {{.address = *address}};
            }
        } else if (keyword == "expire") {
            block.expires = timeIn(statement, block);
        } else if (keyword == "renew") {
            block.renews = timeIn(statement, block);
        } else if (keyword == "rebind") {
            block.rebinds = timeIn(statement, block);
        } else if (keyword == "option") {
            takeOption4(statement.word(1), statement.word(2), block);
        } else {
            takeEither(statement, block);
        }
        return true;
    }

    static void takeOption4(std::string_view name, std::string_view value, Block& block) {
        block.addOption(dhclientOptionCode(name));
        if (name == "dhcp-server-identifier") {
            block.server = IpAddress::fromText(AF_INET, value);
            if (!block.server) {
                block.reject("the lease names a server without an address");
            }
        } else if (name == "dhcp-lease-time") {
            block.leaseTime = parseNumber<std::uint32_t>(value);
        } else if (name == "dhcp-client-identifier") {
            block.clientIdentifier = identifierText(value);
        }
    }

    bool take6(const Statement& statement, Block& block) {
        const std::string_view keyword = statement.keyword();
        if (statement.end == Mark::Open) {
            const bool holdsAddresses = keyword == "ia-na" || keyword == "ia-ta";
            // The option of a server's response that the block stands for.
            block.addOption(dhclientOptionCode6("dhcp6." + std::string{keyword}));
            return holdsAddresses ? parseAssociation(block) : skipBlock();
        }
        if (keyword == "option") {
            block.addOption(dhclientOptionCode6(statement.word(1)));
            if (statement.word(1) == "dhcp6.client-id") {
                block.clientIdentifier = identifierText(statement.word(2));
            }
        } else {
            takeEither(statement, block);
        }
        return true;
    }

    /// The times of an association of addresses.
    struct Association {
        std::optional<std::int64_t> starts;
        std::optional<std::uint32_t> renew;
        std::optional<std::uint32_t> rebind;
    };

    bool parseAssociation(Block& block) {
        Association association;
        return forEachStatement([&](const Statement& statement) {
            if (statement.end == Mark::Open) {
                return statement.keyword() == "iaaddr"
                           ? parseLeasedAddress(statement.word(1), association, block)
                           : skipBlock();
            }
            if (statement.keyword() == "starts") {
                association.starts = parseNumber<std::int64_t>(statement.word(1));
            } else if (statement.keyword() == "renew") {
                association.renew = secondsOrNone(statement.word(1));
            } else if (statement.keyword() == "rebind") {
                association.rebind = secondsOrNone(statement.word(1));
            }
            return true;
        });
    }

    /// With 0 a server leaves the time to the client (RFC 8415, section 21.4).
    static std::optional<std::uint32_t> secondsOrNone(std::string_view text) {
        const auto seconds = parseNumber<std::uint32_t>(text);
        return seconds == 0U ? std::nullopt : seconds;
    }

    bool parseLeasedAddress(std::string_view text, const Association& association, Block& block) {
        std::optional<std::int64_t> starts = association.starts;
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
        const auto address = IpAddress::fromText(AF_INET6, text);
        const auto expires = timeAfter(starts, lifetime);
        if (!address) {
            block.reject("\"iaaddr\" is not followed by an address");
        } else if (!expires) {
            block.reject("an address has no start or no lifetime");
        } else {
            block.addresses.push_back(
                {.address = *address,
                 .expires = *expires,
                 .obtained = starts,
                 .renews = timeAfter(association.starts, association.renew),
                 .rebinds = timeAfter(association.starts, association.rebind)});
        }
        return whole;
    }

    void finish4(Block&& block) {
        // A BOOTP reply has no lease time: the address is for ever (RFC 951).
        if (block.bootp && !block.expires) {
            block.expires = Lease::never;
        }
        if (block.addresses.empty()) {
            block.reject("the lease has no address");
        } else if (!block.expires) {
            block.reject("the lease has no end");
        } else {
            DhclientAddress& address = block.addresses.front();
            address.expires = *block.expires;
            address.renews = block.renews;
            address.rebinds = block.rebinds;
            // A lease that was given back ends with its release, not after its time.
            const bool shortened = block.renews == block.expires;
            if (block.leaseTime && !shortened && *block.expires != Lease::never &&
                *block.expires >= *block.leaseTime) {
                address.obtained = *block.expires - *block.leaseTime;
            }
        }
        finish(false, std::move(block));
    }

    void finish6(Block&& block) {
        if (block.clientIdentifier.empty()) {
            block.clientIdentifier = identifier6_;
        }
        finish(true, std::move(block));
    }

    void finish(bool ipv6, Block&& block) {
        if (!block.interfaceName) {
            block.reject("the lease names no interface");
        }
        if (!block.damage.empty()) {
            tell(block.place, std::move(block.damage));
            // Each address of DHCPv6 is a record of its own.
            if (!ipv6 || block.addresses.empty() || !block.interfaceName) {
                return;
            }
        }
        keep({.ipv6 = ipv6,
              .interfaceName = *block.interfaceName,
              .addresses = std::move(block.addresses),
              .server = block.server,
              .bootp = block.bootp,
              .released = block.released,
              .options = std::move(block.options),
              .clientIdentifier = std::move(block.clientIdentifier)});
    }

    void keep(DhclientLease&& lease) {
        auto& leases = result_.leases;
        const auto older =
            std::find_if(leases.begin(), leases.end(), [&](const DhclientLease& kept) {
                return kept.ipv6 == lease.ipv6 && kept.interfaceName == lease.interfaceName;
            });
        if (older != leases.end()) {
            *older = std::move(lease);
        } else {
            leases.push_back(std::move(lease));
        }
    }

    Tokens tokens_;
    DhclientLeases result_;
    std::string identifier6_;  // the client's own
};

}  // namespace

DhclientLeases parseDhclientLeases(std::string_view text) {
    return LeaseFile{text}.parse();
}

}  // namespace ZR::Live
