#include "query/QueryCondition.h"

#include <algorithm>
#include <compare>
#include <utility>

#include "cimom/DateTimeText.h"
#include "cimom/Instance.h"
#include "cimom/Names.h"

namespace cimom {

namespace {

using EmbeddedInstance = std::shared_ptr<const Instance>;
using ReferencedPath = std::shared_ptr<const ObjectPath>;

Truth truthOf(bool holds) noexcept {
    return holds ? Truth::yes : Truth::no;
}

bool isOf(const Instance& instance, const std::string& className, const Query::IsA& isA) {
    return sameName(instance.path.className, className) || isA(instance.path.className, className);
}

/// What a term stands for; null when there is nothing.
struct Operand {
    const Scalar* scalar = nullptr;
    /// A property with an array, of which nothing but whether it is null can be told.
    bool isArray = false;
    bool isDateTime = false;
};

const Value* propertyOf(const Instance& instance, const std::string& name) noexcept {
    const Value* const property = instance.property(name);
    return property != nullptr ? property : instance.path.key(name);
}

Operand operandOf(const Value& value, const std::optional<std::size_t>& index) noexcept {
    if (value.isNull()) {
        return {};
    }
    const bool isDateTime = value.type == Type::datetime;
    const Array* const elements = value.array();
    if (!index) {
        return {value.scalar(), elements != nullptr, isDateTime};
    }
    if (elements == nullptr || *index >= elements->size() ||
        std::holds_alternative<std::monostate>((*elements)[*index])) {
        return {};
    }
    return {&(*elements)[*index], false, isDateTime};
}

/// The instance that the steps up to the last lead to; null when one leads nowhere.
const Instance* ownerOf(const QueryName& name, const Instance& instance, const Query::IsA& isA);

Operand operandOf(const QueryName& name, const Instance& instance, const Query::IsA& isA) {
    const Instance* const owner = ownerOf(name, instance, isA);
    if (owner == nullptr || name.steps.empty()) {
        return {};
    }
    const QueryName::Step& last = name.steps.back();
    const Value* const value = propertyOf(*owner, last.property);
    return value == nullptr ? Operand{} : operandOf(*value, last.index);
}

const Instance* ownerOf(const QueryName& name, const Instance& instance, const Query::IsA& isA) {
    const Instance* owner = &instance;
    for (std::size_t i = 0; i < name.steps.size(); ++i) {
        const QueryName::Step& step = name.steps[i];
        if (!step.scope.empty() && !isOf(*owner, step.scope, isA)) {
            return nullptr;
        }
        if (i + 1 == name.steps.size()) {
            break;
        }
        const Value* const value = propertyOf(*owner, step.property);
        const Scalar* const scalar =
            value == nullptr ? nullptr : operandOf(*value, step.index).scalar;
        const auto* const embedded =
            scalar == nullptr ? nullptr : std::get_if<EmbeddedInstance>(scalar);
        if (embedded == nullptr || *embedded == nullptr) {
            return nullptr;
        }
        owner = embedded->get();
    }
    return owner;
}

Operand operandOf(const QueryTerm& term, const Instance& instance, const Query::IsA& isA) {
    if (const auto* const literal = std::get_if<Scalar>(&term)) {
        return {literal};
    }
    return operandOf(std::get<QueryName>(term), instance, isA);
}

std::partial_ordering orderOf(std::strong_ordering ordering) noexcept {
    return ordering;
}

std::partial_ordering orderOfIntegers(auto a, auto b) noexcept {
    if (std::cmp_less(a, b)) {
        return std::partial_ordering::less;
    }
    return std::cmp_equal(a, b) ? std::partial_ordering::equivalent
                                : std::partial_ordering::greater;
}

/// Unordered for all that cannot be compared.
std::partial_ordering orderOf(const Scalar& a, const Scalar& b) {
    return std::visit(
        []<typename X, typename Y>(const X& x, const Y& y) -> std::partial_ordering {
            constexpr auto isInteger = []<typename T>(std::type_identity<T>) {
                return std::is_same_v<T, std::uint64_t> || std::is_same_v<T, std::int64_t>;
            };
            constexpr bool xInteger = isInteger(std::type_identity<X>());
            constexpr bool yInteger = isInteger(std::type_identity<Y>());
            if constexpr (xInteger && yInteger) {
                return orderOfIntegers(x, y);
            } else if constexpr ((xInteger || std::is_same_v<X, double>)&&(
                                     yInteger || std::is_same_v<Y, double>)) {
                return static_cast<double>(x) <=> static_cast<double>(y);
            } else if constexpr (std::is_same_v<X, Y> &&
                                 (std::is_same_v<X, std::string> || std::is_same_v<X, char16_t>)) {
                return orderOf(x <=> y);
            } else {
                return std::partial_ordering::unordered;
            }
        },
        a, b);
}

/// Points in time are compared with each other, and intervals are.
std::partial_ordering orderOfDateTimes(const Scalar& a, const Scalar& b) {
    const auto* const x = std::get_if<std::string>(&a);
    const auto* const y = std::get_if<std::string>(&b);
    const auto left = x == nullptr ? std::nullopt : parseDateTime(*x);
    const auto right = y == nullptr ? std::nullopt : parseDateTime(*y);
    if (!left || !right || left->interval != right->interval) {
        return std::partial_ordering::unordered;
    }
    return orderOf(left->microseconds <=> right->microseconds);
}

/// A character is compared with a text of one as such.
Scalar asText(const Scalar& scalar) {
    const auto* const character = std::get_if<char16_t>(&scalar);
    std::string text;
    if (character != nullptr && *character < 0x80) {
        text += static_cast<char>(*character);
        return text;
    }
    return scalar;
}

/// Whether two values that have no order are the same; unknown when they cannot be compared.
Truth sameUnordered(const Scalar& a, const Scalar& b) {
    if (const auto* const x = std::get_if<bool>(&a)) {
        const auto* const y = std::get_if<bool>(&b);
        return y == nullptr ? Truth::unknown : truthOf(*x == *y);
    }
    const auto* const x = std::get_if<ReferencedPath>(&a);
    const auto* const y = std::get_if<ReferencedPath>(&b);
    if (x != nullptr && y != nullptr && *x != nullptr && *y != nullptr) {
        return truthOf(**x == **y);
    }
    return Truth::unknown;
}

Truth negated(Truth truth) noexcept {
    switch (truth) {
        case Truth::no:
            return Truth::yes;
        case Truth::yes:
            return Truth::no;
        default:
            return Truth::unknown;
    }
}

Truth compared(const Operand& left, Comparator comparator, const Operand& right) {
    if (left.scalar == nullptr || right.scalar == nullptr) {
        return Truth::unknown;
    }
    const auto ordering = left.isDateTime || right.isDateTime
                              ? orderOfDateTimes(*left.scalar, *right.scalar)
                              : orderOf(asText(*left.scalar), asText(*right.scalar));
    if (ordering == std::partial_ordering::unordered) {
        const Truth same = left.isDateTime || right.isDateTime
                               ? Truth::unknown
                               : sameUnordered(*left.scalar, *right.scalar);
        switch (comparator) {
            case Comparator::equal:
                return same;
            case Comparator::unequal:
                return negated(same);
            default:
                return Truth::unknown;
        }
    }
    switch (comparator) {
        case Comparator::equal:
            return truthOf(std::is_eq(ordering));
        case Comparator::unequal:
            return truthOf(std::is_neq(ordering));
        case Comparator::less:
            return truthOf(std::is_lt(ordering));
        case Comparator::lessOrEqual:
            return truthOf(std::is_lteq(ordering));
        case Comparator::greater:
            return truthOf(std::is_gt(ordering));
        default:
            return truthOf(std::is_gteq(ordering));
    }
}

class Comparison final : public QueryCondition {
  public:
    Comparison(QueryTerm left, Comparator comparator, QueryTerm right)
        : left_(std::move(left)), comparator_(comparator), right_(std::move(right)) {}

    [[nodiscard]] Truth holds(const Instance& instance, const Query::IsA& isA) const override {
        return compared(operandOf(left_, instance, isA), comparator_,
                        operandOf(right_, instance, isA));
    }

  private:
    QueryTerm left_;
    Comparator comparator_;
    QueryTerm right_;
};

class Like final : public QueryCondition {
  public:
    Like(QueryTerm term, LikePattern pattern)
        : term_(std::move(term)), pattern_(std::move(pattern)) {}

    [[nodiscard]] Truth holds(const Instance& instance, const Query::IsA& isA) const override {
        const Operand operand = operandOf(term_, instance, isA);
        if (operand.scalar == nullptr) {
            return Truth::unknown;
        }
        const Scalar value = asText(*operand.scalar);
        const auto* const text = std::get_if<std::string>(&value);
        return text == nullptr ? Truth::unknown : truthOf(pattern_.matches(*text));
    }

  private:
    QueryTerm term_;
    LikePattern pattern_;
};

class IsNull final : public QueryCondition {
  public:
    explicit IsNull(QueryTerm term) : term_(std::move(term)) {}

    [[nodiscard]] Truth holds(const Instance& instance, const Query::IsA& isA) const override {
        const Operand operand = operandOf(term_, instance, isA);
        return truthOf(operand.scalar == nullptr && !operand.isArray);
    }

  private:
    QueryTerm term_;
};

class Isa final : public QueryCondition {
  public:
    Isa(QueryName name, std::string className)
        : name_(std::move(name)), className_(std::move(className)) {}

    [[nodiscard]] Truth holds(const Instance& instance, const Query::IsA& isA) const override {
        if (name_.steps.empty()) {
            return truthOf(isOf(instance, className_, isA));
        }
        const Operand operand = operandOf(name_, instance, isA);
        if (operand.scalar == nullptr) {
            return Truth::unknown;
        }
        if (const auto* const embedded = std::get_if<EmbeddedInstance>(operand.scalar)) {
            return *embedded == nullptr ? Truth::unknown
                                        : truthOf(isOf(**embedded, className_, isA));
        }
        return Truth::unknown;
    }

  private:
    QueryName name_;
    std::string className_;
};

class Is final : public QueryCondition {
  public:
    Is(QueryConditionPointer condition, Truth truth)
        : condition_(std::move(condition)), truth_(truth) {}

    [[nodiscard]] Truth holds(const Instance& instance, const Query::IsA& isA) const override {
        return truthOf(condition_->holds(instance, isA) == truth_);
    }

  private:
    QueryConditionPointer condition_;
    Truth truth_;
};

class Not final : public QueryCondition {
  public:
    explicit Not(QueryConditionPointer condition) : condition_(std::move(condition)) {}

    [[nodiscard]] Truth holds(const Instance& instance, const Query::IsA& isA) const override {
        return negated(condition_->holds(instance, isA));
    }

  private:
    QueryConditionPointer condition_;
};

/// AND and OR: one condition that holds as `decisive` says decides.
class Junction final : public QueryCondition {
  public:
    Junction(std::vector<QueryConditionPointer> conditions, Truth decisive)
        : conditions_(std::move(conditions)), decisive_(decisive) {}

    [[nodiscard]] Truth holds(const Instance& instance, const Query::IsA& isA) const override {
        Truth whole = negated(decisive_);
        for (const QueryConditionPointer& condition : conditions_) {
            const Truth truth = condition->holds(instance, isA);
            if (truth == decisive_) {
                return truth;
            }
            whole = truth == Truth::unknown ? truth : whole;
        }
        return whole;
    }

  private:
    std::vector<QueryConditionPointer> conditions_;
    Truth decisive_;
};

/// One condition alone needs no other around it.
QueryConditionPointer joined(std::vector<QueryConditionPointer> conditions, Truth decisive) {
    return conditions.size() == 1 ? std::move(conditions.front())
                                  : std::make_unique<Junction>(std::move(conditions), decisive);
}

}  // namespace

QueryConditionPointer makeComparison(QueryTerm left, Comparator comparator, QueryTerm right) {
    return std::make_unique<Comparison>(std::move(left), comparator, std::move(right));
}

QueryConditionPointer makeLike(QueryTerm term, LikePattern pattern) {
    return std::make_unique<Like>(std::move(term), std::move(pattern));
}

QueryConditionPointer makeIsNull(QueryTerm term) {
    return std::make_unique<IsNull>(std::move(term));
}

QueryConditionPointer makeIsa(QueryName name, std::string className) {
    return std::make_unique<Isa>(std::move(name), std::move(className));
}

QueryConditionPointer makeIs(QueryConditionPointer condition, Truth truth) {
    return std::make_unique<Is>(std::move(condition), truth);
}

QueryConditionPointer makeNot(QueryConditionPointer condition) {
    return std::make_unique<Not>(std::move(condition));
}

QueryConditionPointer makeAll(std::vector<QueryConditionPointer> conditions) {
    return joined(std::move(conditions), Truth::no);
}

QueryConditionPointer makeAny(std::vector<QueryConditionPointer> conditions) {
    return joined(std::move(conditions), Truth::yes);
}

}  // namespace cimom
