#include "query/QueryLexer.h"

#include <algorithm>
#include <array>

#include "cimom/Names.h"
#include "cimom/Query.h"

namespace cimom {

namespace {

constexpr std::string_view queryBlanks = " \t\r\n";

/// Longer ones first, since they begin like others.
constexpr std::array<std::string_view, 15> querySymbols{"<>", "!=", "<=", ">=", "::", "=", "<", ">",
                                                        "(",  ")",  ",",  ".",  "*",  "[", "]"};

}  // namespace

bool QueryToken::is(std::string_view keyword) const noexcept {
    return kind == Kind::name && sameName(text, keyword);
}

bool QueryToken::isSymbol(std::string_view symbol) const noexcept {
    return kind == Kind::symbol && text == symbol;
}

void failQuery(std::size_t position, const std::string& reason) {
    throw QueryError(CMPI_RC_ERR_INVALID_QUERY,
                     "at character " + std::to_string(position + 1) + ": " + reason);
}

char QueryLexer::at(std::size_t offset) const noexcept {
    return position_ + offset < text_.size() ? text_[position_ + offset] : '\0';
}

QueryToken QueryLexer::next() {
    position_ = std::min(text_.find_first_not_of(queryBlanks, position_), text_.size());
    if (position_ == text_.size()) {
        return {QueryToken::Kind::end, "", position_};
    }
    const char first = at(0);
    if (isNameStart(first)) {
        return name();
    }
    if (isDigit(first) || ((first == '-' || first == '+' || first == '.') && isDigit(at(1))) ||
        ((first == '-' || first == '+') && at(1) == '.' && isDigit(at(2)))) {
        return number();
    }
    return first == '\'' || first == '"' ? quoted() : symbol();
}

QueryToken QueryLexer::name() {
    const std::size_t start = position_;
    while (isNamePart(at(0))) {
        ++position_;
    }
    return {QueryToken::Kind::name, std::string(text_.substr(start, position_ - start)), start};
}

void QueryLexer::passDigits() noexcept {
    while (isDigit(at(0))) {
        ++position_;
    }
}

QueryToken QueryLexer::number() {
    const std::size_t start = position_;
    auto kind = QueryToken::Kind::integer;
    if (at(0) == '-' || at(0) == '+') {
        ++position_;
    }
    passDigits();
    if (at(0) == '.' && isDigit(at(1))) {
        kind = QueryToken::Kind::real;
        ++position_;
        passDigits();
    }
    if (lowered(at(0)) == 'e') {
        const std::size_t sign = at(1) == '-' || at(1) == '+' ? 1 : 0;
        if (isDigit(at(1 + sign))) {
            kind = QueryToken::Kind::real;
            position_ += 1 + sign;
            passDigits();
        }
    }
    if (isNamePart(at(0))) {
        failQuery(start, "this is not a number");
    }
    return {kind, std::string(text_.substr(start, position_ - start)), start};
}

QueryToken QueryLexer::quoted() {
    const std::size_t start = position_;
    const char quote = at(0);
    std::string content;
    for (++position_; position_ < text_.size(); ++position_) {
        const char letter = at(0);
        // Two quotes stand for one, as does one behind a backslash. A backslash before
        // anything else stands for itself: patterns of LIKE have escapes of their own.
        const bool pair = letter == quote && at(1) == quote;
        const bool escape = letter == '\\' && (at(1) == '\'' || at(1) == '"' || at(1) == '\\');
        if (pair || escape) {
            ++position_;
        } else if (letter == quote) {
            ++position_;
            return {QueryToken::Kind::text, std::move(content), start};
        }
        content += at(0);
    }
    failQuery(start, "the text has no end");
}

QueryToken QueryLexer::symbol() {
    const std::string_view rest = text_.substr(position_);
    const auto* const found = std::ranges::find_if(
        querySymbols, [rest](std::string_view each) { return rest.starts_with(each); });
    if (found == querySymbols.end()) {
        failQuery(position_, "this is not a part of a query");
    }
    const std::size_t start = position_;
    position_ += found->size();
    return {QueryToken::Kind::symbol, std::string(*found), start};
}

}  // namespace cimom
