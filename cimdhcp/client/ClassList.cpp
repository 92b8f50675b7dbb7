#include "client/ClassList.h"

#include <nlohmann/json.hpp>

#include "text/JsonText.h"

namespace cimdhcp {

namespace {

const char* kind(const ClassEntry& entry) {
    return entry.association ? "association" : "element";
}

std::string cell(const std::string& text) {
    return text.empty() ? "-" : text;
}

nlohmann::ordered_json json(const std::string& text) {
    return text.empty() ? nlohmann::ordered_json(nullptr) : nlohmann::ordered_json(text);
}

}  // namespace

std::vector<ClassEntry> servedClasses(const std::vector<cimom::Registration>& registrations,
                                      const cimom::ClassRepository& repository) {
    std::vector<ClassEntry> classes;
    for (const cimom::Registration& registration : registrations) {
        const cimom::ClassDeclaration* const declaration = repository.find(registration.className);
        if (declaration == nullptr) {
            continue;  // the object manager has refused such a registration before
        }
        classes.push_back({declaration->name, declaration->superclass, declaration->isAssociation(),
                           registration.provider, registration.nameSpaces});
    }
    return classes;
}

const std::vector<Column<ClassEntry>>& classColumns() {
    static const std::vector<Column<ClassEntry>> columns{
        {"CLASS", [](const ClassEntry& entry) { return entry.name; }},
        {"SUPERCLASS", [](const ClassEntry& entry) { return cell(entry.superclass); }},
        {"KIND", [](const ClassEntry& entry) { return std::string(kind(entry)); }},
        {"PROVIDER", [](const ClassEntry& entry) { return cell(entry.provider); }}};
    return columns;
}

std::string classTable(const std::vector<ClassEntry>& classes, std::optional<std::size_t> width,
                       const Style& style) {
    return tableOf(classColumns(), classes).text(width, style);
}

std::string classJson(const std::vector<ClassEntry>& classes) {
    auto list = nlohmann::ordered_json::array();
    for (const ClassEntry& entry : classes) {
        list.push_back({{"class", entry.name},
                        {"superclass", json(entry.superclass)},
                        {"kind", kind(entry)},
                        {"provider", json(entry.provider)},
                        {"namespaces", entry.nameSpaces}});
    }
    return jsonText({{"classes", std::move(list)}});
}

}  // namespace cimdhcp
