#include "text/JsonText.h"

#include <nlohmann/json.hpp>
#include <type_traits>
#include <variant>

namespace cimdhcp {

namespace {

nlohmann::ordered_json writable(const Json& value) {
    return std::visit(
        [](const auto& held) -> nlohmann::ordered_json {
            using Held = std::decay_t<decltype(held)>;
            if constexpr (std::is_same_v<Held, JsonList>) {
                auto list = nlohmann::ordered_json::array();
                for (const Json& element : held) {
                    list.push_back(writable(element));
                }
                return list;
            } else if constexpr (std::is_same_v<Held, JsonMembers>) {
                auto object = nlohmann::ordered_json::object();
                for (const auto& [name, member] : held) {
                    object[name] = writable(member);
                }
                return object;
            } else if constexpr (std::is_same_v<Held, JsonDocument>) {
                return nlohmann::ordered_json::parse(held.text);
            } else {
                return held;
            }
        },
        value);
}

std::string written(const Json& value, int indentation) {
    return writable(value).dump(indentation, ' ', false,
                                nlohmann::ordered_json::error_handler_t::replace) +
           '\n';
}

}  // namespace

Json textOrNull(const std::string& text) {
    return text.empty() ? Json(nullptr) : Json(text);
}

std::string jsonText(const Json& value) {
    constexpr int indentation = 2;
    return written(value, indentation);
}

std::string jsonLine(const Json& value) {
    constexpr int none = -1;
    return written(value, none);
}

}  // namespace cimdhcp
