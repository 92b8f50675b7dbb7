#include "cimdhcp/ClassList.h"

#include <nlohmann/json.hpp>

#include "cimdhcp/JsonFormat.h"
#include "cimdhcp/Table.h"

namespace cimdhcp {

namespace {

const char* kind(const ClassEntry& entry) {
    return entry.association ? "association" : "element";
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

std::string classTable(const std::vector<ClassEntry>& classes, std::optional<std::size_t> width) {
    Table table({"CLASS", "SUPERCLASS", "KIND", "PROVIDER"});
    for (const ClassEntry& entry : classes) {
        table.add({entry.name, entry.superclass.empty() ? "-" : entry.superclass, kind(entry),
                   entry.provider});
    }
    return table.text(width);
}

std::string classJson(const std::vector<ClassEntry>& classes) {
    auto list = nlohmann::ordered_json::array();
    for (const ClassEntry& entry : classes) {
        nlohmann::ordered_json superclass;
        if (!entry.superclass.empty()) {
            superclass = entry.superclass;
        }
        list.push_back({{"class", entry.name},
                        {"superclass", std::move(superclass)},
                        {"kind", kind(entry)},
                        {"provider", entry.provider},
                        {"namespaces", entry.nameSpaces}});
    }
    return jsonText({{"classes", std::move(list)}});
}

}  // namespace cimdhcp
