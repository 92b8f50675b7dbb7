#include "query/QueryParser.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <system_error>

#include "cimom/Names.h"

namespace cimom {

namespace {

constexpr std::array<std::string_view, 14> queryKeywords{
    "SELECT", "FROM", "WHERE", "AND",  "OR",    "NOT", "ISA",
    "LIKE",   "IS",   "NULL",  "TRUE", "FALSE", "AS",  "DISTINCT"};

constexpr std::array<std::pair<std::string_view, Comparator>, 7> comparators{
    {{"=", Comparator::equal},
     {"<>", Comparator::unequal},
     {"!=", Comparator::unequal},
     {"<", Comparator::less},
     {"<=", Comparator::lessOrEqual},
     {">", Comparator::greater},
     {">=", Comparator::greaterOrEqual}}};

bool isKeyword(std::string_view name) noexcept {
    return std::ranges::any_of(queryKeywords,
                               [name](std::string_view each) { return sameName(each, name); });
}

template <typename Number>
std::optional<Number> numberOf(std::string_view text) noexcept {
    Number number{};
    const char* const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, number);
    return error == std::errc() && stop == end ? std::optional(number) : std::nullopt;
}

}  // namespace

class QueryParser::Nested {
  public:
    explicit Nested(QueryParser& parser) : parser_(parser) {
        if (parser_.depth_ == Query::deepestNesting) {
            failQuery(parser_.token_.start, "the conditions are nested too deep");
        }
        ++parser_.depth_;
    }
    ~Nested() { --parser_.depth_; }
    Nested(const Nested&) = delete;
    Nested& operator=(const Nested&) = delete;

  private:
    QueryParser& parser_;
};

QueryParser::QueryParser(std::string_view text, LikeForm form) : lexer_(text), form_(form) {
    advance();
}

bool QueryParser::pass(std::string_view keyword) {
    const bool here = token_.is(keyword);
    if (here) {
        advance();
    }
    return here;
}

bool QueryParser::passSymbol(std::string_view symbol) {
    const bool here = token_.isSymbol(symbol);
    if (here) {
        advance();
    }
    return here;
}

void QueryParser::require(std::string_view keyword) {
    if (!pass(keyword)) {
        failQuery(token_.start, "here must be " + std::string(keyword));
    }
}

void QueryParser::requireSymbol(std::string_view symbol) {
    if (!passSymbol(symbol)) {
        failQuery(token_.start, "here must be \"" + std::string(symbol) + '"');
    }
}

std::string QueryParser::identifier(const char* what) {
    if (token_.kind != QueryToken::Kind::name || isKeyword(token_.text)) {
        failQuery(token_.start, std::string("here must be ") + what);
    }
    std::string text = std::move(token_.text);
    advance();
    return text;
}

ParsedQuery QueryParser::parse() {
    ParsedQuery query;
    require("SELECT");
    // A name may begin with that of the class, which comes behind the list. The flag: all
    // that it has, by ".*".
    std::vector<std::pair<QueryName, bool>> selected;
    if (!passSymbol("*")) {
        do {
            QueryName one = name();
            const bool whole = token_.isSymbol("*");
            if (whole) {
                advance();
            }
            selected.emplace_back(std::move(one), whole);
        } while (passSymbol(","));
    }
    require("FROM");
    className_ = identifier("the name of a class");
    if (pass("AS") || (token_.kind == QueryToken::Kind::name && !isKeyword(token_.text))) {
        alias_ = identifier("another name for the class");
    }
    select(query, selected);
    if (pass("WHERE")) {
        query.condition = anyOf();
    }
    if (token_.kind != QueryToken::Kind::end) {
        failQuery(token_.start, "here must be the end, or a part of a condition");
    }
    query.className = className_;
    query.named = std::move(named_);
    return query;
}

void QueryParser::select(ParsedQuery& query, const std::vector<std::pair<QueryName, bool>>& names) {
    if (names.empty()) {
        return;
    }
    query.properties.emplace();
    bool all = false;
    for (const auto& [written, whole] : names) {
        const QueryName one = resolved(written);
        if (one.steps.empty()) {
            if (!whole) {
                failQuery(0, "a class is not a property that could be selected");
            }
            all = true;
        } else {
            query.properties->push_back(one.steps.front().property);
        }
    }
    if (all) {
        query.properties.reset();
    }
}

QueryConditionPointer QueryParser::anyOf() {
    std::vector<QueryConditionPointer> conditions;
    do {
        conditions.push_back(allOf());
    } while (pass("OR"));
    return makeAny(std::move(conditions));
}

QueryConditionPointer QueryParser::allOf() {
    std::vector<QueryConditionPointer> conditions;
    do {
        conditions.push_back(negation());
    } while (pass("AND"));
    return makeAll(std::move(conditions));
}

QueryConditionPointer QueryParser::negation() {
    const Nested nested(*this);
    return pass("NOT") ? makeNot(negation()) : judged(primary());
}

QueryConditionPointer QueryParser::primary() {
    if (passSymbol("(")) {
        QueryConditionPointer inner = anyOf();
        requireSymbol(")");
        return inner;
    }
    return predicate();
}

QueryConditionPointer QueryParser::judged(QueryConditionPointer condition) {
    if (pass("IS")) {
        const bool negated = pass("NOT");
        const bool truth = token_.is("TRUE");
        if (!truth) {
            require("FALSE");
        } else {
            advance();
        }
        condition = makeIs(std::move(condition), truth ? Truth::yes : Truth::no);
        if (negated) {
            condition = makeNot(std::move(condition));
        }
    }
    return condition;
}

QueryConditionPointer QueryParser::predicate() {
    const std::size_t start = token_.start;
    QueryTerm left = term();
    if (pass("ISA")) {
        auto* const object = std::get_if<QueryName>(&left);
        if (object == nullptr) {
            failQuery(start, "ISA is for objects");
        }
        // Some write the name as a text.
        std::string className = token_.kind == QueryToken::Kind::text ? std::move(token_.text) : "";
        if (className.empty()) {
            className = identifier("the name of a class");
        } else {
            advance();
        }
        return makeIsa(std::move(*object), std::move(className));
    }
    const auto* const whole = std::get_if<QueryName>(&left);
    if (whole != nullptr && whole->steps.empty()) {
        failQuery(start, "a class can be compared by ISA alone");
    }
    if (pass("LIKE")) {
        return makeLike(std::move(left), pattern());
    }
    if (pass("NOT")) {
        require("LIKE");
        return makeNot(makeLike(std::move(left), pattern()));
    }
    const auto* const comparator = std::ranges::find_if(
        comparators, [this](const auto& each) { return token_.isSymbol(each.first); });
    if (comparator != comparators.end()) {
        advance();
        const std::size_t rightStart = token_.start;
        QueryTerm right = term();
        const auto* const other = std::get_if<QueryName>(&right);
        if (other != nullptr && other->steps.empty()) {
            failQuery(rightStart, "a class can be compared by ISA alone");
        }
        return makeComparison(std::move(left), comparator->second, std::move(right));
    }
    require("IS");
    const bool negated = pass("NOT");
    QueryConditionPointer condition;
    if (pass("NULL")) {
        condition = makeIsNull(std::move(left));
    } else {
        const bool truth = token_.is("TRUE");
        if (!truth && !token_.is("FALSE")) {
            failQuery(token_.start, "here must be NULL, TRUE or FALSE");
        }
        advance();
        condition = makeIs(makeComparison(std::move(left), Comparator::equal, Scalar(true)),
                           truth ? Truth::yes : Truth::no);
    }
    return negated ? makeNot(std::move(condition)) : std::move(condition);
}

LikePattern QueryParser::pattern() {
    // To match takes the product of the two lengths.
    constexpr std::size_t longestPattern = 1024;
    if (token_.kind != QueryToken::Kind::text) {
        failQuery(token_.start, "here must be a pattern in quotes");
    }
    if (token_.text.size() > longestPattern) {
        failQuery(token_.start, "the pattern is longer than " + std::to_string(longestPattern));
    }
    std::optional<LikePattern> made = form_ == LikeForm::wql
                                          ? std::optional(LikePattern::ofWql(token_.text))
                                          : LikePattern::ofCql(token_.text);
    if (!made) {
        failQuery(token_.start, "the pattern has signs that need a backslash before them");
    }
    advance();
    return *std::move(made);
}

Scalar QueryParser::number() const {
    const std::string_view text = token_.text;
    // from_chars does not know the sign.
    const std::string_view plain = text.starts_with('+') ? text.substr(1) : text;
    if (token_.kind == QueryToken::Kind::integer) {
        if (const auto unsignedNumber = numberOf<std::uint64_t>(plain)) {
            return *unsignedNumber;
        }
        if (const auto signedNumber = numberOf<std::int64_t>(plain)) {
            return *signedNumber;
        }
    } else if (const auto real = numberOf<double>(plain)) {
        return *real;
    }
    failQuery(token_.start, "the number is out of range");
}

QueryTerm QueryParser::term() {
    Scalar literal;
    switch (token_.kind) {
        case QueryToken::Kind::integer:
        case QueryToken::Kind::real:
            literal = number();
            break;
        case QueryToken::Kind::text:
            literal = std::move(token_.text);
            break;
        default:
            if (!token_.is("TRUE") && !token_.is("FALSE")) {
                if (token_.is("NULL")) {
                    failQuery(token_.start, "nothing is equal to NULL; IS NULL tells");
                }
                return resolved(name());
            }
            literal = token_.is("TRUE");
    }
    advance();
    return literal;
}

QueryName::Step QueryParser::step() {
    QueryName::Step made;
    made.property = identifier("a property or a value");
    if (passSymbol("::")) {
        made.scope = std::move(made.property);
        made.property = identifier("a property of the class");
    }
    if (passSymbol("[")) {
        const auto index = token_.kind == QueryToken::Kind::integer
                               ? numberOf<std::uint32_t>(token_.text)
                               : std::nullopt;
        if (!index) {
            failQuery(token_.start, "here must be the index of an element, from 0");
        }
        made.index = *index;
        advance();
        requireSymbol("]");
    }
    return made;
}

/// Stops before "*" behind a dot, which stands in lists alone.
QueryName QueryParser::name() {
    QueryName made;
    do {
        made.steps.push_back(step());
    } while (passSymbol(".") && !token_.isSymbol("*"));
    return made;
}

void QueryParser::resolve(QueryName& name) const {
    const QueryName::Step& first = name.steps.front();
    const bool isClass = (sameName(first.property, className_) ||
                          (!alias_.empty() && sameName(first.property, alias_))) &&
                         first.scope.empty() && !first.index;
    if (isClass) {
        name.steps.erase(name.steps.begin());
    }
}

QueryName QueryParser::resolved(QueryName name) {
    resolve(name);
    // What a subclass has cannot be looked up in the class itself.
    if (!name.steps.empty() &&
        (name.steps.front().scope.empty() || sameName(name.steps.front().scope, className_))) {
        named_.push_back(name.steps.front().property);
    }
    return name;
}

}  // namespace cimom
