#pragma once

#include <algorithm>
#include <filesystem>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"

/// The schema that is shipped, read as the object manager reads it.
namespace cimom::shipped {

inline const std::filesystem::path& schemaDirectory() {
    static const auto directory = std::filesystem::path(ZR_SOURCE_DIR) / "schema";
    return directory;
}

inline const ClassRepository& repository() {
    static const ClassRepository loaded = [] {
        ClassRepository result;
        result.loadDirectory(schemaDirectory());
        result.complete();
        return result;
    }();
    return loaded;
}

inline const ClassDeclaration& classOf(std::string_view name) {
    const ClassDeclaration* const found = repository().find(name);
    if (found == nullptr) {
        throw std::runtime_error("no class " + std::string(name));
    }
    return *found;
}

inline const PropertyDeclaration& propertyOf(std::string_view className, std::string_view name) {
    const PropertyDeclaration* const found = classOf(className).property(name);
    if (found == nullptr) {
        throw std::runtime_error("no property " + std::string(name));
    }
    return *found;
}

inline std::vector<std::string> texts(const Qualifier* qualifier) {
    std::vector<std::string> result;
    if (qualifier != nullptr && qualifier->value.array() != nullptr) {
        for (const Scalar& element : *qualifier->value.array()) {
            result.push_back(std::get<std::string>(element));
        }
    }
    return result;
}

inline bool says(const Qualifier* qualifier, const Scalar& expected) {
    return qualifier != nullptr && qualifier->value.scalar() != nullptr &&
           *qualifier->value.scalar() == expected;
}

}  // namespace cimom::shipped
