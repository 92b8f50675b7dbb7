#include "commands/ResponseText.h"

#include <algorithm>
#include <optional>
#include <utility>

#include "cimom/ObjectPathText.h"
#include "client/Response.h"
#include "text/Columns.h"
#include "text/ValueMeaning.h"

namespace cimdhcp {

namespace {

constexpr const char* pathColumn = "PATH";

/// Sorts by texts, those without one last.
template <typename Object, typename Text>
void sortObjects(std::vector<Object>& objects, const Text& textOf) {
    std::vector<std::pair<std::optional<std::string>, Object>> keyed;
    keyed.reserve(objects.size());
    for (Object& object : objects) {
        auto text = object ? textOf(*object) : std::nullopt;
        keyed.emplace_back(std::move(text), std::move(object));
    }
    std::stable_sort(keyed.begin(), keyed.end(), [](const auto& a, const auto& b) {
        return a.first && b.first ? comesBefore(*a.first, *b.first)
                                  : a.first.has_value() && !b.first;
    });
    std::transform(keyed.begin(), keyed.end(), objects.begin(),
                   [](auto& each) { return std::move(each.second); });
}

std::vector<std::string> columnsOf(const Response& response) {
    std::vector<std::string> columns{pathColumn};
    for (const auto& instance : response.instances) {
        for (const cimom::NamedValue& property :
             instance ? instance->properties : std::vector<cimom::NamedValue>()) {
            if (std::find(columns.begin(), columns.end(), property.name) == columns.end()) {
                columns.push_back(property.name);
            }
        }
    }
    return columns;
}

}  // namespace

void sortResponse(const std::string& wanted, Response& response) {
    if (response.paths.empty() && response.instances.empty()) {
        return;
    }
    const std::vector<std::string> columns = columnsOf(response);
    const std::string& column = columns[columnNamed(wanted, columns)];
    sortObjects(response.paths, [](const cimom::ObjectPath& path) {
        return std::optional<std::string>(cimom::toText(path));
    });
    sortObjects(response.instances, [&column](const cimom::Instance& instance) {
        if (column == pathColumn) {
            return std::optional<std::string>(cimom::toText(instance.path));
        }
        const cimom::Value* const value = instance.property(column);
        return value == nullptr || value->isNull()
                   ? std::nullopt
                   : std::optional<std::string>(valueWithMeaning(nullptr, {column, *value}));
    });
}

}  // namespace cimdhcp
