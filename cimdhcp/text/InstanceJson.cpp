#include "text/JsonText.h"

#include <cmath>
#include <string>
#include <type_traits>
#include <utility>
#include <variant>

#include "cimom/Instance.h"
#include "cimom/ObjectPathText.h"
#include "zrcommon/Strings.h"

namespace cimdhcp {

namespace {

Json realJson(double number) {
    if (std::isfinite(number)) {
        return number;
    }
    return std::isnan(number) ? "NaN" : number > 0 ? "INF" : "-INF";
}

Json scalarJson(const cimom::Scalar& scalar) {
    return std::visit(
        [](const auto& held) -> Json {
            using Held = std::decay_t<decltype(held)>;
            if constexpr (std::is_same_v<Held, std::monostate>) {
                return nullptr;
            } else if constexpr (std::is_same_v<Held, double>) {
                return realJson(held);
            } else if constexpr (std::is_same_v<Held, char16_t>) {
                const auto unit = static_cast<wchar_t>(held);
                return ZR::make_string({&unit, 1});
            } else if constexpr (std::is_same_v<Held, std::shared_ptr<const cimom::ObjectPath>>) {
                return cimom::toText(*held);
            } else if constexpr (std::is_same_v<Held, std::shared_ptr<const cimom::Instance>>) {
                return instanceJson(*held);
            } else {
                return held;
            }
        },
        scalar);
}

Json valueJson(const cimom::Value& value) {
    if (const cimom::Array* const elements = value.array()) {
        JsonList list;
        for (const cimom::Scalar& element : *elements) {
            list.push_back(scalarJson(element));
        }
        return list;
    }
    const cimom::Scalar* const scalar = value.scalar();
    return scalar == nullptr ? Json(nullptr) : scalarJson(*scalar);
}

}  // namespace

Json instanceJson(const cimom::Instance& instance) {
    JsonMembers properties;
    for (const cimom::NamedValue& property : instance.properties) {
        properties.emplace_back(
            property.name, JsonMembers{{"type", std::string(cimom::typeName(property.value.type))},
                                       {"value", valueJson(property.value)}});
    }
    return JsonMembers{{"path", cimom::toText(instance.path)},
                       {"class", instance.path.className},
                       {"properties", std::move(properties)}};
}

}  // namespace cimdhcp
