#pragma once

#include <cmpidt.h>

#include <functional>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "cimom/Forward.h"

namespace cimom {

/// A query that cannot be had; what() tells why and where.
class QueryError : public std::runtime_error {
  public:
    QueryError(CMPIrc statusCode, const std::string& reason)
        : std::runtime_error(reason), code(statusCode) {}

    /// CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED or CMPI_RC_ERR_INVALID_QUERY.
    const CMPIrc code;
};

/// A query of one class: SELECT list FROM class [WHERE condition]. It selects instances, those
/// of indications among them, whose embedded instances are asked by dotted names. Immutable;
/// copies share what was read. Safe for concurrent use.
class Query {
  public:
    /// Whether the class is the ancestor or derives from it, as ClassRepository::isA.
    using IsA = std::function<bool(std::string_view className, std::string_view ancestor)>;

    /// The longest text, in bytes, and the deepest nesting of its conditions.
    static constexpr std::size_t longestText = 16384;
    static constexpr std::size_t deepestNesting = 64;

    /// Reads a query. The language is "WQL", "CQL", "DMTF:CQL" or "CIM:CQL" in any case; they
    /// differ in LIKE alone: "%" and "_" in WQL, "." "*" and "|" in CQL. Throws QueryError.
    [[nodiscard]] static Query parse(std::string_view language, std::string_view text);

    /// The class behind FROM, as it is written there.
    [[nodiscard]] const std::string& className() const noexcept;
    /// The properties that are selected, as a property list has them; absent: all. Of a dotted
    /// name this is the first part: embedded instances are selected as a whole.
    [[nodiscard]] const std::optional<std::vector<std::string>>& properties() const noexcept;

    /// The first of its names that the class, which is that behind FROM, has no property for.
    /// What embedded instances have is not known and not looked at.
    [[nodiscard]] std::optional<std::string> unknownProperty(
        const ClassDeclaration& declaration) const;

    /// Whether the instance is of the class or a subclass, and the condition holds for it.
    ///
    /// A comparison with null, or of values that cannot be compared, is neither true nor
    /// false, and so is what NOT, AND and OR make of it unless the other side decides; an
    /// instance is selected by what is true.
    [[nodiscard]] bool matches(const Instance& instance, const IsA& isA) const;
    /// Leaves the selected properties alone.
    void project(Instance& instance) const;

  private:
    class Implementation;
    explicit Query(std::shared_ptr<const Implementation> implementation) noexcept;

    std::shared_ptr<const Implementation> implementation_;
};

}  // namespace cimom
