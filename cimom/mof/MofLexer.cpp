#include "mof/MofLexer.h"

#include <algorithm>
#include <charconv>
#include <optional>
#include <system_error>
#include <utility>
#include <variant>

#include "cimom/MofError.h"
#include "cimom/Names.h"
#include "cimom/Utf8.h"

namespace cimom {

namespace {

constexpr std::string_view symbols = "#(){}[];:,=$";
constexpr std::string_view byteOrderMark = "\xEF\xBB\xBF";

std::string shown(char letter) {
    if (letter > ' ' && letter < '\x7F') {
        return std::string("\"") + letter + '"';
    }
    constexpr std::string_view digits = "0123456789ABCDEF";
    const auto byte = static_cast<unsigned char>(letter);
    return std::string("byte 0x") + digits[byte >> 4U] + digits[byte & 0x0FU];
}

int hexadecimalDigit(char letter) {
    const char lower = lowered(letter);
    if (isDigit(lower)) {
        return lower - '0';
    }
    return lower >= 'a' && lower <= 'f' ? lower - 'a' + 10 : -1;
}

bool isBinary(std::string_view word) {
    return word.size() > 1 && lowered(word.back()) == 'b' &&
           word.find_first_not_of("01") == word.size() - 1;
}

enum class IntegerFault : std::uint8_t { malformed, tooLarge };

/// The digits of an integer, without its sign: 0x1F, 101b, 017 or 19.
std::variant<std::uint64_t, IntegerFault> parseMagnitude(std::string_view word) {
    int base = 10;
    if (word.size() > 1 && word[0] == '0' && lowered(word[1]) == 'x') {
        word.remove_prefix(2);
        base = 16;
    } else if (isBinary(word)) {
        word.remove_suffix(1);
        base = 2;
    } else if (word.size() > 1 && word[0] == '0') {
        word.remove_prefix(1);
        base = 8;
    }
    std::uint64_t magnitude = 0;
    const char* const end = word.data() + word.size();
    const auto [stop, error] = std::from_chars(word.data(), end, magnitude, base);
    if (error == std::errc::result_out_of_range && stop == end) {
        return IntegerFault::tooLarge;
    }
    if (error != std::errc() || stop != end) {
        return IntegerFault::malformed;
    }
    return magnitude;
}

/// Digits with a point between or before them, perhaps an exponent; no sign.
std::optional<double> parseReal(std::string_view word) {
    const auto point = word.find('.');
    if (point == std::string_view::npos || point + 1 == word.size() || !isDigit(word[point + 1])) {
        return std::nullopt;
    }
    double number = 0;
    const char* const end = word.data() + word.size();
    const auto [stop, error] = std::from_chars(word.data(), end, number);
    return error == std::errc() && stop == end ? std::optional(number) : std::nullopt;
}

}  // namespace

MofLexer::MofLexer(std::string_view text, std::string file) : text_(text), file_(std::move(file)) {
    if (text_.starts_with(byteOrderMark)) {
        offset_ = byteOrderMark.size();
        lineStart_ = offset_;
    }
}

char MofLexer::peek(std::size_t ahead) const noexcept {
    return offset_ + ahead < text_.size() ? text_[offset_ + ahead] : '\0';
}

MofPosition MofLexer::here() const noexcept {
    return {line_, offset_ - lineStart_ + 1};
}

void MofLexer::fail(MofPosition position, const std::string& reason) const {
    throw MofError(file_, position, reason);
}

MofToken MofLexer::next() {
    skipBlanks();
    if (offset_ >= text_.size()) {
        return {MofTokenKind::end, {}, {}, here()};
    }
    const char first = peek();
    if (isNameStart(first)) {
        return identifier();
    }
    if (isDigit(first) || first == '+' || first == '-' || first == '.') {
        return number();
    }
    if (first == '"') {
        return string();
    }
    if (first == '\'') {
        return character();
    }
    if (symbols.find(first) == std::string_view::npos) {
        fail(here(), "unexpected character " + shown(first));
    }
    MofToken token{MofTokenKind::symbol, text_.substr(offset_, 1), {}, here()};
    ++offset_;
    return token;
}

void MofLexer::skipBlanks() {
    while (offset_ < text_.size()) {
        const char letter = peek();
        if (letter == '\n') {
            ++line_;
            lineStart_ = ++offset_;
        } else if (letter == ' ' || letter == '\t' || letter == '\r' || letter == '\f' ||
                   letter == '\v') {
            ++offset_;
        } else if (letter == '/' && peek(1) == '/') {
            offset_ = std::min(text_.find('\n', offset_), text_.size());
        } else if (letter == '/' && peek(1) == '*') {
            skipBlockComment();
        } else {
            return;
        }
    }
}

void MofLexer::skipBlockComment() {
    const MofPosition start = here();
    const auto end = text_.find("*/", offset_ + 2);
    if (end == std::string_view::npos) {
        fail(start, "this comment does not end");
    }
    for (; offset_ < end; ++offset_) {
        if (peek() == '\n') {
            ++line_;
            lineStart_ = offset_ + 1;
        }
    }
    offset_ = end + 2;
}

MofToken MofLexer::identifier() {
    const MofPosition start = here();
    const auto begin = offset_;
    while (isNamePart(peek())) {
        ++offset_;
    }
    return {MofTokenKind::identifier, text_.substr(begin, offset_ - begin), {}, start};
}

MofToken MofLexer::number() {
    const MofPosition start = here();
    const auto begin = offset_;
    const bool isSigned = peek() == '+' || peek() == '-';
    offset_ += isSigned ? 1 : 0;
    const bool isHexadecimal = peek() == '0' && lowered(peek(1)) == 'x';
    for (;; ++offset_) {
        const bool exponentSign = (peek() == '+' || peek() == '-') && !isHexadecimal &&
                                  lowered(text_[offset_ - 1]) == 'e';
        if (!isNamePart(peek()) && peek() != '.' && !exponentSign) {
            break;
        }
    }
    const auto text = text_.substr(begin, offset_ - begin);
    const auto word = text.substr(isSigned ? 1 : 0);
    const bool negative = text.front() == '-';
    const auto malformed = [&] { fail(start, '"' + std::string(text) + "\" is not a number"); };

    if (word.find('.') != std::string_view::npos) {
        const auto real = parseReal(word);
        if (!real) {
            malformed();
        }
        const double magnitude = real.value_or(0);
        return {MofTokenKind::real, text, negative ? -magnitude : magnitude, start};
    }
    const auto magnitude = parseMagnitude(word);
    if (const auto* fault = std::get_if<IntegerFault>(&magnitude)) {
        if (*fault == IntegerFault::tooLarge) {
            fail(start, '"' + std::string(text) + "\" does not fit 64 bits");
        }
        malformed();
    }
    return {MofTokenKind::integer, text, MofInteger{negative, std::get<std::uint64_t>(magnitude)},
            start};
}

MofToken MofLexer::string() {
    const MofPosition start = here();
    const auto begin = offset_++;
    std::string content;
    while (peek() != '"') {
        appendLiteralCharacter(content, "string", start);
    }
    ++offset_;
    return {MofTokenKind::string, text_.substr(begin, offset_ - begin), std::move(content), start};
}

MofToken MofLexer::character() {
    const MofPosition start = here();
    const auto begin = offset_++;
    std::string content;
    while (peek() != '\'') {
        appendLiteralCharacter(content, "character", start);
    }
    ++offset_;
    const auto decoded = content.empty() ? Utf8Character() : readUtf8(content, 0);
    if (decoded.length == 0 || decoded.length != content.size()) {
        fail(start, "a character literal holds exactly one character");
    }
    if (decoded.value > 0xFFFF) {
        fail(start, "a character literal holds 16 bits");
    }
    return {MofTokenKind::character, text_.substr(begin, offset_ - begin),
            static_cast<char16_t>(decoded.value), start};
}

void MofLexer::appendLiteralCharacter(std::string& content, std::string_view literal,
                                      MofPosition start) {
    if (offset_ >= text_.size() || peek() == '\n' || peek() == '\r') {
        fail(start, "this " + std::string(literal) + " does not end on its line");
    }
    if (peek() == '\\') {
        appendEscape(content);
        return;
    }
    const auto length = readUtf8(text_, offset_).length;
    if (length == 0) {
        fail(here(), shown(peek()) + " is not UTF-8");
    }
    if (peek() == '\0') {
        fail(here(), "a text cannot hold " + shown(peek()));
    }
    content += text_.substr(offset_, length);
    offset_ += length;
}

void MofLexer::appendEscape(std::string& content) {
    static constexpr std::string_view letters = "btnfr\"'\\";
    static constexpr std::string_view meanings = "\b\t\n\f\r\"'\\";
    const MofPosition start = here();
    const char letter = peek(1);
    offset_ += 2;
    if (lowered(letter) == 'x') {
        appendUtf8(content, hexadecimalEscape(start));
        return;
    }
    const auto index = letters.find(letter);
    if (index == std::string_view::npos) {
        fail(start, "unknown escape sequence");
    }
    content += meanings[index];
}

/// The one to four digits after \x, which are a UTF-16 code unit.
char32_t MofLexer::hexadecimalEscape(MofPosition start) {
    char32_t unit = 0;
    std::size_t digits = 0;
    for (; digits < 4 && hexadecimalDigit(peek()) >= 0; ++digits, ++offset_) {
        unit = unit * 16 + static_cast<char32_t>(hexadecimalDigit(peek()));
    }
    if (digits == 0 || unit == 0 || isSurrogate(unit)) {
        fail(start, "\\x needs the number of a character");
    }
    return unit;
}

}  // namespace cimom
