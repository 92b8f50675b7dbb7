#include "commands/ClassTable.h"

#include <utility>

#include "text/JsonText.h"

namespace cimdhcp {

namespace {

const char* kind(const ClassEntry& entry) {
    return entry.association ? "association" : "element";
}

}  // namespace

const std::vector<Column<ClassEntry>>& classColumns() {
    static const std::vector<Column<ClassEntry>> columns{
        {"CLASS", [](const ClassEntry& entry) { return entry.name; }},
        {"SUPERCLASS", [](const ClassEntry& entry) { return cellOf(entry.superclass); }},
        {"KIND", [](const ClassEntry& entry) { return std::string(kind(entry)); }},
        {"PROVIDER", [](const ClassEntry& entry) { return cellOf(entry.provider); }}};
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
