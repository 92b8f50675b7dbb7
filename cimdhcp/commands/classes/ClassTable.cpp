#include "commands/classes/ClassTable.h"

#include <utility>
#include <variant>

#include "commands/classes/CimOperations.h"
#include "text/DisplayText.h"
#include "text/JsonText.h"
#include "text/ValueMeaning.h"

namespace cimdhcp {

namespace {

const char* kind(const ClassEntry& entry) {
    return entry.association ? "association" : "element";
}

/// A value that has a name, as the schema tells both.
struct NamedMeaning {
    std::string value;
    std::string meaning;
};

std::string textAt(const cimom::Array* texts, std::size_t index) {
    const auto* const text = texts == nullptr || index >= texts->size()
                                 ? nullptr
                                 : std::get_if<std::string>(&(*texts)[index]);
    return text == nullptr ? std::string() : *text;
}

/// Without a ValueMap, the entries of Values stand for 0, 1, 2...
std::vector<NamedMeaning> namedValues(const cimom::PropertyDeclaration& property) {
    const auto arrayOf = [&property](const char* name) -> const cimom::Array* {
        const cimom::Qualifier* const qualifier = property.qualifier(name);
        return qualifier == nullptr ? nullptr : qualifier->value.array();
    };
    const cimom::Array* const map = arrayOf("ValueMap");
    const cimom::Array* const meanings = arrayOf("Values");
    std::vector<NamedMeaning> named;
    const std::size_t count = map != nullptr        ? map->size()
                              : meanings != nullptr ? meanings->size()
                                                    : 0;
    for (std::size_t index = 0; index < count; ++index) {
        named.push_back(
            {map == nullptr ? std::to_string(index) : textAt(map, index), textAt(meanings, index)});
    }
    return named;
}

std::string descriptionIn(const cimom::Qualifier* qualifier) {
    return qualifier == nullptr ? std::string() : heldText(&qualifier->value);
}

std::string typeText(const cimom::PropertyDeclaration& property) {
    const std::string type = property.type == cimom::Type::reference
                                 ? property.referenceClass + " REF"
                                 : std::string(cimom::typeName(property.type));
    return type + (property.isArray ? "[]" : "");
}

/// "2 (Enabled), 3 (Disabled)"
std::string valuesText(const cimom::PropertyDeclaration& property) {
    std::string text;
    for (const NamedMeaning& each : namedValues(property)) {
        text += (text.empty() ? "" : ", ") + each.value +
                (each.meaning.empty() ? "" : " (" + each.meaning + ')');
    }
    return text;
}

/// The text, indented, with a width in several lines.
std::string indented(const std::string& text, std::size_t indentation,
                     std::optional<std::size_t> width) {
    constexpr std::size_t narrowest = 20;
    if (text.empty()) {
        return {};
    }
    const bool wrap = width && *width >= indentation + narrowest;
    std::string result;
    for (const std::string& line :
         wrap ? wrapToWidth(printable(text), *width - indentation) : std::vector{printable(text)}) {
        result += std::string(indentation, ' ') + line + '\n';
    }
    return result;
}

}  // namespace

std::vector<Column<cimom::PropertyDeclaration>> propertyColumns(
    const cimom::ClassDeclaration& declaration) {
    using Property = cimom::PropertyDeclaration;
    const auto yes = [](bool value) { return std::string(value ? "yes" : "-"); };
    return {
        {"PROPERTY", [](const Property& each) { return each.name; }, {}, {true, 0}},
        {"TYPE", typeText, {}, {true, 1}},
        {"KEY", [yes](const Property& each) { return yes(each.isKey()); }, {}, {true, 1}},
        {"WRITABLE",
         [yes, &declaration](const Property& each) { return yes(mayBeWritten(declaration, each)); },
         {},
         {true, 1}},
        {"MEANING",
         [](const Property& each) { return cellOf(descriptionIn(each.qualifier("Description"))); }},
        {"VALUES", [](const Property& each) { return cellOf(valuesText(each)); }, {}, {false, 2}}};
}

std::string describeText(const cimom::ClassDeclaration& declaration,
                         std::optional<std::size_t> width, const Style& style) {
    constexpr std::size_t propertyIndentation = 4;
    constexpr std::size_t textIndentation = 8;
    std::string text =
        style.strong((declaration.isAssociation() ? "association " : "class ") + declaration.name) +
        (declaration.superclass.empty() ? "" : " : " + declaration.superclass) + '\n' +
        indented(descriptionIn(declaration.qualifier("Description")), propertyIndentation, width);
    for (const cimom::PropertyDeclaration& each : declaration.properties) {
        text += '\n' + std::string(propertyIndentation, ' ') + style.strong(each.name) + "  " +
                typeText(each) + (each.isKey() ? ", key" : "") +
                (mayBeWritten(declaration, each) ? ", writable" : "") + '\n' +
                indented(descriptionIn(each.qualifier("Description")), textIndentation, width) +
                indented(valuesText(each), textIndentation, width);
    }
    return text;
}

std::string describeJson(const cimom::ClassDeclaration& declaration,
                         const std::vector<cimom::PropertyDeclaration>& properties) {
    JsonList list;
    for (const cimom::PropertyDeclaration& each : properties) {
        JsonList values;
        for (const NamedMeaning& value : namedValues(each)) {
            values.push_back(
                JsonMembers{{"value", value.value}, {"meaning", textOrNull(value.meaning)}});
        }
        list.push_back(JsonMembers{
            {"name", each.name},
            {"type", each.type == cimom::Type::reference ? each.referenceClass + " REF"
                                                         : std::string(cimom::typeName(each.type))},
            {"array", each.isArray},
            {"key", each.isKey()},
            {"writable", mayBeWritten(declaration, each)},
            {"description", textOrNull(descriptionIn(each.qualifier("Description")))},
            {"values", std::move(values)}});
    }
    return jsonText(JsonMembers{
        {"class", declaration.name},
        {"superclass", textOrNull(declaration.superclass)},
        {"association", declaration.isAssociation()},
        {"description", textOrNull(descriptionIn(declaration.qualifier("Description")))},
        {"properties", std::move(list)}});
}

const std::vector<Column<ClassEntry>>& classColumns() {
    static const std::vector<Column<ClassEntry>> columns{
        {"CLASS", [](const ClassEntry& entry) { return entry.name; }, {}, {true, 0}},
        {"SUPERCLASS",
         [](const ClassEntry& entry) { return cellOf(entry.superclass); },
         {},
         {true, 1}},
        {"KIND", [](const ClassEntry& entry) { return std::string(kind(entry)); }, {}, {true, 2}},
        {"PROVIDER",
         [](const ClassEntry& entry) { return cellOf(entry.provider); },
         {},
         {true, 3}}};
    return columns;
}

std::string classTable(const std::vector<ClassEntry>& classes, std::optional<std::size_t> width,
                       const Style& style) {
    return tableOf(classColumns(), classes).text(width, style);
}

std::string classJson(const std::vector<ClassEntry>& classes) {
    JsonList list;
    for (const ClassEntry& entry : classes) {
        list.push_back(JsonMembers{
            {"class", entry.name},
            {"superclass", textOrNull(entry.superclass)},
            {"kind", kind(entry)},
            {"provider", textOrNull(entry.provider)},
            {"namespaces", JsonList(entry.nameSpaces.begin(), entry.nameSpaces.end())}});
    }
    return jsonText(JsonMembers{{"classes", std::move(list)}});
}

}  // namespace cimdhcp
