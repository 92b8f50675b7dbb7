#include "cimom/ObjectPathText.h"

#include <array>
#include <charconv>
#include <cmath>
#include <optional>
#include <system_error>
#include <type_traits>
#include <utility>

#include "cimom/Instance.h"
#include "cimom/Names.h"
#include "cimom/Utf8.h"

namespace cimom {

namespace {

class PathReader {
  public:
    explicit PathReader(std::string_view text) : text_(text) {}

    ObjectPath read() {
        ObjectPath path;
        readHost(path);
        readNamespaceAndClass(path);
        if (atEnd()) {
            return path;
        }
        expect('.', "a full stop before the keys");
        do {
            path.keys.push_back(readKey(path));
        } while (take(','));
        if (!atEnd()) {
            fail("a comma or the end was expected");
        }
        return path;
    }

  private:
    [[nodiscard]] bool atEnd() const { return position_ == text_.size(); }
    [[nodiscard]] char peek() const { return atEnd() ? '\0' : text_[position_]; }

    bool take(char wanted) {
        const bool there = !atEnd() && text_[position_] == wanted;
        position_ += there ? 1 : 0;
        return there;
    }

    void expect(char wanted, const char* what) {
        if (!take(wanted)) {
            fail(std::string(what) + " was expected");
        }
    }

    [[noreturn]] void fail(const std::string& reason) const { fail(reason, position_); }
    [[noreturn]] static void fail(const std::string& reason, std::size_t position) {
        throw ObjectPathError("object path, column " + std::to_string(position + 1) + ": " +
                              reason);
    }

    /// "//host/", with a scheme such as "https:" before it, or the single slash
    /// of the local form.
    void readHost(ObjectPath& path) {
        const auto schemeEnd = text_.find("://");
        if (schemeEnd != std::string_view::npos &&
            text_.substr(0, schemeEnd).find_first_of("/.=\"") == std::string_view::npos) {
            position_ = schemeEnd + 1;
        }
        if (text_.substr(position_).starts_with("//")) {
            position_ += 2;
            const auto end = text_.find('/', position_);
            if (end == std::string_view::npos) {
                fail("a slash is missing after the host", text_.size());
            }
            if (end == position_) {
                fail("the host is empty");
            }
            path.host = text_.substr(position_, end - position_);
            position_ = end + 1;
        } else {
            take('/');
        }
    }

    void readNamespaceAndClass(ObjectPath& path) {
        const auto start = position_;
        auto end = start;
        while (end < text_.size() &&
               (isNamePart(text_[end]) || text_[end] == '/' || text_[end] == '-')) {
            ++end;
        }
        if (end < text_.size() && text_[end] == ':') {
            path.nameSpace = text_.substr(start, end - start);
            checkNamespace(path.nameSpace, start);
            position_ = end + 1;
        }
        path.className = readName("a class name");
    }

    static void checkNamespace(std::string_view nameSpace, std::size_t start) {
        const auto doubled = nameSpace.find("//");
        if (nameSpace.empty() || nameSpace.front() == '/') {
            fail("a namespace was expected", start);
        }
        if (doubled != std::string_view::npos || nameSpace.back() == '/') {
            fail("a part of the namespace is empty",
                 start + (doubled == std::string_view::npos ? nameSpace.size() : doubled + 1));
        }
    }

    std::string readName(const char* what) {
        if (!isNameStart(peek())) {
            fail(std::string(what) + " was expected");
        }
        const auto start = position_;
        while (isNamePart(peek())) {
            ++position_;
        }
        return std::string(text_.substr(start, position_ - start));
    }

    NamedValue readKey(const ObjectPath& path) {
        const auto start = position_;
        std::string name = readName("the name of a key");
        if (path.key(name) != nullptr) {
            fail("key " + name + " is given twice", start);
        }
        expect('=', "an equals sign after the key's name");
        return {std::move(name), readValue()};
    }

    Value readValue() { return peek() == '"' ? readString() : readBare(); }

    Value readString() {
        const auto start = position_++;
        std::string content;
        while (!take('"')) {
            if (atEnd()) {
                fail("the string has no closing quotation mark", start);
            }
            if (peek() == '\\') {
                const auto escape = position_++;
                if (peek() != '\\' && peek() != '"') {
                    fail(R"(only \\ and \" can stand after a backslash)", escape);
                }
            }
            content += text_[position_++];
        }
        return Value::ofString(std::move(content));
    }

    Value readBare() {
        const auto start = position_;
        const auto word = text_.substr(start, text_.find(',', start) - start);
        position_ += word.size();
        if (sameName(word, "TRUE") || sameName(word, "FALSE")) {
            return Value{Type::boolean, false, Scalar(sameName(word, "TRUE"))};
        }
        if (auto number = readNumber(word)) {
            return *std::move(number);
        }
        fail(word.empty() ? "a value was expected"
                          : "this value is neither a quoted string nor a number, TRUE or FALSE "
                            "in range",
             start);
    }

    static std::optional<Value> readNumber(std::string_view word) {
        const bool signedWord = !word.empty() && (word.front() == '-' || word.front() == '+');
        const auto digits = word.substr(signedWord ? 1 : 0);
        if (digits.empty() || (!isDigit(digits.front()) && digits.front() != '.')) {
            return std::nullopt;
        }
        if (digits.find_first_not_of("0123456789") != std::string_view::npos) {
            // from_chars knows no plus sign.
            return readWhole<double>(word.front() == '+' ? digits : word, Type::real64);
        }
        // Only what is below zero needs a sign: -0 is written as 0, and reads as that.
        const bool below =
            word.front() == '-' && digits.find_first_not_of('0') != std::string::npos;
        return below ? readWhole<std::int64_t>(word, Type::sint64)
                     : readWhole<std::uint64_t>(digits, Type::uint64);
    }

    template <typename Number>
    static std::optional<Value> readWhole(std::string_view word, Type type) {
        Number number{};
        const char* const end = word.data() + word.size();
        const auto [stop, error] = std::from_chars(word.data(), end, number);
        if (error != std::errc() || stop != end) {
            return std::nullopt;
        }
        return Value{type, false, Scalar(number)};
    }

    std::string_view text_;
    std::size_t position_ = 0;
};

std::string inQuotes(std::string_view content) {
    std::string text = "\"";
    for (const char letter : content) {
        if (letter == '"' || letter == '\\') {
            text += '\\';
        }
        text += letter;
    }
    return text + '"';
}

std::string realText(double number) {
    if (!std::isfinite(number)) {
        // The spelling of DSP0201 for values that have no digits.
        return std::isnan(number) ? "NaN" : number > 0 ? "INF" : "-INF";
    }
    // 24 characters hold the shortest text of any double.
    std::array<char, 32> buffer{};
    auto* const end = std::to_chars(buffer.data(), buffer.data() + buffer.size(), number).ptr;
    std::string text(buffer.data(), end);
    // A bare "2" would be read again as an integer.
    return text.find_first_of(".e") == std::string::npos ? text + ".0" : text;
}

}  // namespace

ObjectPath parseObjectPath(std::string_view text) {
    return PathReader(text).read();
}

std::string toText(const ObjectPath& path) {
    std::string text = path.nameSpace.empty() ? std::string() : path.nameSpace + ':';
    text += path.className;
    char separator = '.';
    for (const NamedValue& key : path.keys) {
        const Scalar* const scalar = key.value.scalar();
        if (const auto value = scalar == nullptr ? std::nullopt : scalarText(*scalar)) {
            text += separator;
            text += key.name;
            text += '=';
            text += *value;
            separator = ',';
        }
    }
    return text;
}

std::optional<std::string> scalarText(const Scalar& scalar) {
    return std::visit(
        [](const auto& held) -> std::optional<std::string> {
            using Held = std::decay_t<decltype(held)>;
            if constexpr (std::is_same_v<Held, bool>) {
                return held ? "TRUE" : "FALSE";
            } else if constexpr (std::is_same_v<Held, std::string>) {
                return inQuotes(held);
            } else if constexpr (std::is_same_v<Held, char16_t>) {
                std::string character;
                appendUtf8(character, held);
                return inQuotes(character);
            } else if constexpr (std::is_same_v<Held, double>) {
                return realText(held);
            } else if constexpr (std::is_integral_v<Held>) {
                return std::to_string(held);
            } else if constexpr (std::is_same_v<Held, std::shared_ptr<const ObjectPath>>) {
                return held == nullptr ? std::nullopt : std::optional(inQuotes(toText(*held)));
            } else {
                return std::nullopt;
            }
        },
        scalar);
}

}  // namespace cimom
