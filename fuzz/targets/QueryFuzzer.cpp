// Queries, which come with requests and stay in the filters of subscriptions: the language is
// the first line.
#include "cimom/Query.h"

#include <memory>
#include <string>

#include "Input.h"
#include "cimom/Instance.h"
#include "cimom/Names.h"

namespace {

cimom::Value numberOf(std::uint64_t number) {
    return {cimom::Type::uint16, false, cimom::Scalar(number)};
}

cimom::Instance lease(std::uint64_t state) {
    cimom::Instance made;
    made.path.className = "Lease";
    made.path.keys = {{"Name", cimom::Value::ofString("eth0")}};
    made.properties = {
        {"State", numberOf(state)},
        {"Address", cimom::Value::ofString("192.0.2.17")},
        {"Up", {cimom::Type::boolean, false, cimom::Scalar(true)}},
        {"Load", {cimom::Type::real64, false, cimom::Scalar(1.5)}},
        {"Expires",
         {cimom::Type::datetime, false, cimom::Scalar(std::string("20260101120000.000000+000"))}},
        {"Options", {cimom::Type::uint16, true, cimom::Array{std::uint64_t{1}, std::uint64_t{3}}}},
        {"Missing", cimom::Value::null(cimom::Type::string, false)}};
    return made;
}

cimom::Value embedded(const cimom::Instance& instance) {
    return {cimom::Type::instance, false,
            cimom::Scalar(std::make_shared<const cimom::Instance>(instance))};
}

/// A class is itself alone: every instance is of the class that it names.
bool isA(std::string_view className, std::string_view ancestor) {
    return cimom::sameName(className, ancestor);
}

/// Whether the condition holds for an instance of the query's own class.
bool selects(const cimom::Query& query, cimom::Instance instance) {
    instance.path.className = query.className();
    return query.matches(instance, isA);
}

/// Whether the query with NOT before its condition selects the instance; false for one
/// without a condition, and for one that becomes too long or too deep.
bool contrarySelects(const std::string& language, const std::string& text,
                     const cimom::Instance& instance) {
    constexpr std::string_view where = " WHERE ";
    for (std::size_t i = 0; i + where.size() <= text.size(); ++i) {
        if (!cimom::sameName(std::string_view(text).substr(i, where.size()), where)) {
            continue;
        }
        const std::size_t condition = i + where.size();
        try {
            return selects(cimom::Query::parse(language, text.substr(0, condition) + "NOT (" +
                                                             text.substr(condition) + ")"),
                           instance);
        } catch (const cimom::QueryError&) {
            return false;
        }
    }
    return false;
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string whole(fuzz::text(data, size));
    const std::size_t line = whole.find('\n');
    if (line == std::string::npos) {
        return 0;
    }
    const std::string language = whole.substr(0, line);
    const std::string text = whole.substr(line + 1);
    try {
        const cimom::Query query = cimom::Query::parse(language, text);
        fuzz::require(text.size() <= cimom::Query::longestText, "a query has a limit");
        fuzz::require(!query.className().empty(), "a query has a class");
        cimom::Instance event = lease(2);
        event.properties.push_back({"SourceInstance", embedded(lease(3))});
        event.properties.push_back({"PreviousInstance", embedded(lease(2))});
        const bool selected = selects(query, event);
        fuzz::require(selects(query, event) == selected, "a query selects the same each time");

        cimom::Instance projected = event;
        query.project(projected);
        fuzz::require(projected.path == event.path, "projection leaves the path alone");
        for (const cimom::NamedValue& property : projected.properties) {
            fuzz::require(*event.property(property.name) == property.value,
                          "projection changes no value");
        }
        fuzz::require(!(selected && contrarySelects(language, text, event)),
                      "a condition and its contrary do not both hold");
    } catch (const cimom::QueryError& error) {
        fuzz::require(error.code == CMPI_RC_ERR_INVALID_QUERY ||
                          error.code == CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED,
                      "a refusal has one of two statuses");
        fuzz::require(*error.what() != '\0', "a refusal has a reason");
    }
    return 0;
}
