#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "cimom/Query.h"
#include "cimom/Value.h"
#include "query/LikePattern.h"

/// What stands behind WHERE.
namespace cimom {

/// Of a condition about values one of which is null or cannot be compared: unknown.
enum class Truth : std::uint8_t { no, unknown, yes };

/// A name with dots: a property, or one of the instance embedded in it, and so on. Without
/// steps it is the selected instance itself.
struct QueryName {
    struct Step {
        std::string property;
        std::string scope;                 ///< the class that must have it; empty: any
        std::optional<std::size_t> index;  ///< into an array
    };
    std::vector<Step> steps;
};

/// A name, or a literal.
using QueryTerm = std::variant<QueryName, Scalar>;

class QueryCondition {
  public:
    QueryCondition() = default;
    virtual ~QueryCondition() = default;
    QueryCondition(const QueryCondition&) = delete;
    QueryCondition& operator=(const QueryCondition&) = delete;

    [[nodiscard]] virtual Truth holds(const Instance& instance, const Query::IsA& isA) const = 0;
};
using QueryConditionPointer = std::unique_ptr<const QueryCondition>;

enum class Comparator : std::uint8_t { equal, unequal, less, lessOrEqual, greater, greaterOrEqual };

[[nodiscard]] QueryConditionPointer makeComparison(QueryTerm left, Comparator comparator,
                                                   QueryTerm right);
[[nodiscard]] QueryConditionPointer makeLike(QueryTerm term, LikePattern pattern);
[[nodiscard]] QueryConditionPointer makeIsNull(QueryTerm term);
[[nodiscard]] QueryConditionPointer makeIsa(QueryName name, std::string className);
/// Whether another condition is exactly that.
[[nodiscard]] QueryConditionPointer makeIs(QueryConditionPointer condition, Truth truth);
[[nodiscard]] QueryConditionPointer makeNot(QueryConditionPointer condition);
/// All of them hold, or one does.
[[nodiscard]] QueryConditionPointer makeAll(std::vector<QueryConditionPointer> conditions);
[[nodiscard]] QueryConditionPointer makeAny(std::vector<QueryConditionPointer> conditions);

}  // namespace cimom
