#include "commands/classes/ResponseText.h"

#include <algorithm>
#include <cstdint>
#include <optional>
#include <utility>
#include <variant>

#include "cimom/ClassDeclaration.h"
#include "cimom/ObjectPathText.h"
#include "client/Response.h"
#include "text/Columns.h"
#include "text/DisplayText.h"
#include "text/JsonText.h"
#include "text/MofText.h"
#include "text/ValueMeaning.h"

namespace cimdhcp {

namespace {

/// Narrower than this, broken values read worse than ones that the terminal breaks.
constexpr std::size_t narrowestValue = 20;

std::string declaration(const std::string& className, const std::vector<cimom::NamedValue>& values,
                        const cimom::ClassDeclaration* known) {
    std::size_t longest = 0;
    for (const cimom::NamedValue& value : values) {
        longest = std::max(longest, value.name.size());
    }
    std::string text = "instance of " + className + " {\n";
    for (const cimom::NamedValue& value : values) {
        text += "    " + value.name + std::string(longest - value.name.size(), ' ') + " = " +
                mofInitializer(value.value) + ';';
        const std::string meaning = meaningOf(known, value);
        // A line feed would end the comment.
        text += meaning.empty() ? "\n" : "  // " + printable(meaning) + '\n';
    }
    return text + "};\n";
}

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

std::string valueForPeople(const ClassLookup& classes, const cimom::Instance& instance,
                           const std::string& property) {
    const cimom::Value* const value = instance.property(property);
    if (value == nullptr || value->isNull()) {
        return "-";
    }
    // Between columns, a text needs no quotation marks.
    const std::string text = value->isArray ? std::string() : heldText(value);
    return text.empty()
               ? valueWithMeaning(classes.find(instance.path.className), {property, *value})
               : text;
}

std::string valueForPrograms(const cimom::Instance& instance, const std::string& property) {
    const cimom::Value* const value = instance.property(property);
    if (value == nullptr || value->isNull()) {
        return {};
    }
    const cimom::Scalar* const scalar = value->scalar();
    if (scalar != nullptr && std::holds_alternative<std::string>(*scalar)) {
        return std::get<std::string>(*scalar);
    }
    return value->isArray ? mofInitializer(*value) : valueWithMeaning(nullptr, {property, *value});
}

/// A path without properties, or an instance.
using ResponseRow = cimom::Instance;

/// The columns that there can be: the same for any values.
std::vector<std::string> possibleColumns(const Response& response, const ClassLookup& classes) {
    std::vector<std::string> declared{pathColumn};
    const auto add = [&declared](const std::string& name) {
        if (std::find(declared.begin(), declared.end(), name) == declared.end()) {
            declared.push_back(name);
        }
    };
    std::vector<std::string> seen;
    for (const auto& instance : response.instances) {
        const std::string className = instance ? instance->path.className : std::string();
        if (std::find(seen.begin(), seen.end(), className) != seen.end()) {
            continue;
        }
        seen.push_back(className);
        const cimom::ClassDeclaration* const known = classes.find(className);
        if (known == nullptr) {
            continue;
        }
        for (const cimom::PropertyDeclaration& property : known->properties) {
            add(property.name);
        }
    }
    for (const std::string& name : columnsOf(response)) {
        add(name);  // what a class does not declare all the same
    }
    return declared;
}

template <typename ValueText>
std::vector<Column<ResponseRow>> responseColumns(const Response& response,
                                                 const ClassLookup& classes,
                                                 const std::vector<std::string>& wanted,
                                                 const ValueText& valueText) {
    std::vector<Column<ResponseRow>> columns;
    for (const std::string& name : possibleColumns(response, classes)) {
        Column<ResponseRow> column{name, nullptr};
        if (name == pathColumn) {
            column.cell = [](const ResponseRow& row) { return cimom::toText(row.path); };
            column.room.whole = true;
        } else {
            column.cell = [name, &valueText](const ResponseRow& row) {
                return valueText(row, name);
            };
        }
        columns.push_back(std::move(column));
    }
    // Nothing has no properties, so that any name is as good as another.
    const bool nothing = response.paths.empty() && response.instances.empty();
    return wanted.empty() || nothing ? columns : chosenOf(columns, wanted);
}

std::vector<ResponseRow> rowsOf(const Response& response) {
    std::vector<ResponseRow> rows;
    for (const auto& path : response.paths) {
        rows.push_back({path.value_or(cimom::ObjectPath()), {}});
    }
    for (const auto& instance : response.instances) {
        rows.push_back(instance.value_or(cimom::Instance()));
    }
    return rows;
}

}  // namespace

std::string asColumns(const Response& response, const ClassLookup& classes,
                      const std::vector<std::string>& columns, std::optional<std::size_t> width,
                      const Style& style) {
    const auto text = [&classes](const ResponseRow& row, const std::string& property) {
        return valueForPeople(classes, row, property);
    };
    return tableOf(responseColumns(response, classes, columns, text), rowsOf(response))
        .text(width, style);
}

std::string asTsv(const Response& response, const ClassLookup& classes,
                  const std::vector<std::string>& columns, bool header) {
    auto shown = responseColumns(response, classes, columns, valueForPrograms);
    for (auto& column : shown) {
        column.value = column.cell;
    }
    return tsvOf(shown, rowsOf(response), header);
}

std::string instanceText(const cimom::Instance& instance,
                         const cimom::ClassDeclaration* declaration,
                         std::optional<std::size_t> width, const Style& style,
                         std::size_t indentation) {
    std::size_t longest = 0;
    for (const cimom::NamedValue& property : instance.properties) {
        if (!property.value.isNull()) {
            longest = std::max(longest, property.name.size());
        }
    }
    const std::string before(indentation, ' ');
    const std::size_t valueAt = indentation + 2 + longest + 3;
    std::string text = before + style.strong(printable(cimom::toText(instance.path))) + '\n';
    for (const cimom::NamedValue& property : instance.properties) {
        if (property.value.isNull()) {
            continue;
        }
        const std::string value = printable(valueWithMeaning(declaration, property));
        const bool wrap = width && *width >= valueAt + narrowestValue;
        text += before + "  " + property.name + std::string(longest - property.name.size(), ' ') +
                " = ";
        const std::vector<std::string> lines =
            wrap ? wrapToWidth(value, *width - valueAt) : std::vector{value};
        for (std::size_t line = 0; line < lines.size(); ++line) {
            text += (line == 0 ? std::string() : std::string(valueAt, ' ')) + lines[line] + '\n';
        }
    }
    return text;
}

std::string asTable(const Response& response, const ClassLookup& classes,
                    std::optional<std::size_t> width, const Style& style) {
    std::string text;
    for (const auto& path : response.paths) {
        text += path ? printable(cimom::toText(*path)) : "(null)";
        text += '\n';
    }
    for (const auto& instance : response.instances) {
        text += text.empty() ? "" : "\n";
        text += instance
                    ? instanceText(*instance, classes.find(instance->path.className), width, style)
                    : "(null)\n";
    }
    return text;
}

std::string asMof(const Response& response, const ClassLookup& classes) {
    std::string text;
    const auto add = [&](const std::string& part) { text += (text.empty() ? "" : "\n") + part; };
    for (const auto& path : response.paths) {
        add(path ? declaration(path->className, path->keys, nullptr)
                 : "// The provider delivered a null path.\n");
    }
    for (const auto& instance : response.instances) {
        if (!instance) {
            add("// The provider delivered a null instance.\n");
            continue;
        }
        const std::string& className = instance->path.className;
        add(declaration(className, instance->properties, classes.find(className)));
    }
    return text;
}

std::string asJson(const Response& response, bool internals) {
    JsonList paths;
    for (const auto& path : response.paths) {
        paths.push_back(path ? Json(cimom::toText(*path)) : Json(nullptr));
    }
    JsonList instances;
    for (const auto& instance : response.instances) {
        instances.push_back(instance ? instanceJson(*instance) : Json(nullptr));
    }
    const std::optional<unsigned>& returnDone = response.returnDoneCalls;
    JsonMembers members{
        {"operation", response.operation},
        {"status", JsonMembers{{"code", std::int64_t{response.status.code}},
                               {"name", std::string(statusNameOf(response.status))}}}};
    if (internals) {
        members.emplace_back("returnDone",
                             returnDone ? Json(std::uint64_t{*returnDone}) : Json(nullptr));
    }
    members.emplace_back("paths", std::move(paths));
    members.emplace_back("instances", std::move(instances));
    return jsonText(members);
}

void sortResponse(const std::string& wanted, Response& response) {
    if (response.paths.empty() && response.instances.empty()) {
        return;
    }
    const std::vector<std::string> columns = columnsOf(response);
    const std::string& column = columns[columnNamed("--sort", wanted, columns)];
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
