#include "cimom/Query.h"

#include <algorithm>
#include <array>
#include <utility>

#include "cimom/ClassDeclaration.h"
#include "cimom/Instance.h"
#include "cimom/Names.h"
#include "query/QueryParser.h"

namespace cimom {

namespace {

constexpr std::array<std::pair<std::string_view, LikeForm>, 4> languages{{
    {"WQL", LikeForm::wql},
    {"CQL", LikeForm::cql},
    {"DMTF:CQL", LikeForm::cql},
    {"CIM:CQL", LikeForm::cql},
}};

}  // namespace

class Query::Implementation {
  public:
    explicit Implementation(ParsedQuery query) : query_(std::move(query)) {}
    [[nodiscard]] const ParsedQuery& query() const noexcept { return query_; }

  private:
    ParsedQuery query_;
};

Query::Query(std::shared_ptr<const Implementation> implementation) noexcept
    : implementation_(std::move(implementation)) {}

Query Query::parse(std::string_view language, std::string_view text) {
    const auto* const known = std::ranges::find_if(
        languages, [language](const auto& each) { return sameName(each.first, language); });
    if (known == languages.end()) {
        // The name is a client's, and may be of any length.
        constexpr std::size_t shown = 40;
        throw QueryError(CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED,
                         "the query language \"" + std::string(language.substr(0, shown)) +
                             "\" is not known; WQL and DMTF:CQL are");
    }
    if (text.size() > longestText) {
        throw QueryError(CMPI_RC_ERR_INVALID_QUERY,
                         "the query is longer than " + std::to_string(longestText) + " bytes");
    }
    return Query(std::make_shared<const Implementation>(QueryParser(text, known->second).parse()));
}

const std::string& Query::className() const noexcept {
    return implementation_->query().className;
}

const std::optional<std::vector<std::string>>& Query::properties() const noexcept {
    return implementation_->query().properties;
}

std::optional<std::string> Query::unknownProperty(const ClassDeclaration& declaration) const {
    const auto& named = implementation_->query().named;
    const auto unknown = std::ranges::find_if(named, [&declaration](const std::string& name) {
        return declaration.property(name) == nullptr;
    });
    return unknown == named.end() ? std::nullopt : std::optional(*unknown);
}

bool Query::matches(const Instance& instance, const IsA& isA) const {
    const ParsedQuery& query = implementation_->query();
    const std::string& actual = instance.path.className;
    return (sameName(actual, query.className) || isA(actual, query.className)) &&
           (query.condition == nullptr || query.condition->holds(instance, isA) == Truth::yes);
}

void Query::project(Instance& instance) const {
    const auto& selected = properties();
    if (selected) {
        std::erase_if(instance.properties, [&selected](const NamedValue& property) {
            return std::ranges::none_of(*selected, [&property](const std::string& name) {
                return sameName(name, property.name);
            });
        });
    }
}

}  // namespace cimom
