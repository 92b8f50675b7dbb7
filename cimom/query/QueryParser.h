#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "query/QueryCondition.h"
#include "query/QueryLexer.h"

namespace cimom {

struct ParsedQuery {
    std::string className;
    std::optional<std::vector<std::string>> properties;  ///< first parts of names; absent: all
    QueryConditionPointer condition;                     ///< null: none
    /// The properties of the class itself that the query names.
    std::vector<std::string> named;
};

/// Which signs LIKE knows.
enum class LikeForm : std::uint8_t { wql, cql };

/// Reads one query. Throws QueryError.
class QueryParser {
  public:
    /// Borrows the text.
    QueryParser(std::string_view text, LikeForm form);

    [[nodiscard]] ParsedQuery parse();

  private:
    void advance() { token_ = lexer_.next(); }
    bool pass(std::string_view keyword);
    bool passSymbol(std::string_view symbol);
    void require(std::string_view keyword);
    void requireSymbol(std::string_view symbol);
    [[nodiscard]] std::string identifier(const char* what);

    QueryConditionPointer anyOf();
    QueryConditionPointer allOf();
    QueryConditionPointer negation();
    QueryConditionPointer primary();
    QueryConditionPointer predicate();
    /// IS [NOT] TRUE or FALSE behind a condition.
    QueryConditionPointer judged(QueryConditionPointer condition);
    [[nodiscard]] LikePattern pattern();

    QueryTerm term();
    [[nodiscard]] Scalar number() const;
    /// A name as it is written; its class may be known only later.
    QueryName name();
    QueryName::Step step();
    /// Drops the name of the class, or that given behind AS, from before the first dot.
    void resolve(QueryName& name) const;
    QueryName resolved(QueryName name);
    void select(ParsedQuery& query, const std::vector<std::pair<QueryName, bool>>& names);

    /// Counts the nesting of conditions.
    class Nested;

    QueryLexer lexer_;
    LikeForm form_;
    QueryToken token_;
    std::string className_;
    std::string alias_;
    std::vector<std::string> named_;
    std::size_t depth_ = 0;
};

}  // namespace cimom
