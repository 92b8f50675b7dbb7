#pragma once

#include <cstdint>
#include <nlohmann/json.hpp>
#include <string>

namespace ZR::Live {

/// The member of an object; null where it has none, or is not an object.
inline const nlohmann::json& member(const nlohmann::json& object, const char* name) {
    static const nlohmann::json none;
    if (!object.is_object()) {
        return none;
    }
    const auto found = object.find(name);
    return found == object.end() ? none : *found;
}

/// The text that a value is; empty for anything else.
inline std::string textOf(const nlohmann::json& value) {
    return value.is_string() ? value.get<std::string>() : std::string{};
}

/// The number that a value is; 0 for anything else, and for what is negative.
inline std::uint64_t numberOf(const nlohmann::json& value) {
    return value.is_number_unsigned() ? value.get<std::uint64_t>() : 0;
}

}  // namespace ZR::Live
