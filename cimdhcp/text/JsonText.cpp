#include "text/JsonText.h"

#include <cmath>
#include <cstdint>
#include <nlohmann/json.hpp>
#include <type_traits>
#include <variant>

#include "cimom/ObjectPathText.h"
#include "client/StatusMessage.h"
#include "zrcommon/Strings.h"

namespace cimdhcp {

namespace {

using Json = nlohmann::ordered_json;

Json instanceJson(const cimom::Instance& instance);

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
        Json list = Json::array();
        for (const cimom::Scalar& element : *elements) {
            list.push_back(scalarJson(element));
        }
        return list;
    }
    const cimom::Scalar* const scalar = value.scalar();
    return scalar == nullptr ? Json(nullptr) : scalarJson(*scalar);
}

Json instanceJson(const cimom::Instance& instance) {
    Json properties = Json::object();
    for (const cimom::NamedValue& property : instance.properties) {
        properties[property.name] = Json{{"type", cimom::typeName(property.value.type)},
                                         {"value", valueJson(property.value)}};
    }
    return Json{{"path", cimom::toText(instance.path)},
                {"class", instance.path.className},
                {"properties", std::move(properties)}};
}

}  // namespace

std::string asJson(const Answer& answer) {
    Json paths = Json::array();
    for (const auto& path : answer.paths) {
        paths.push_back(path ? Json(cimom::toText(*path)) : Json(nullptr));
    }
    Json instances = Json::array();
    for (const auto& instance : answer.instances) {
        instances.push_back(instance ? instanceJson(*instance) : Json(nullptr));
    }
    return jsonText(Json{
        {"operation", answer.operation},
        {"status",
         {{"code", static_cast<int>(answer.status.code)}, {"name", statusNameOf(answer.status)}}},
        {"returnDone", answer.returnDoneCalls ? Json(*answer.returnDoneCalls) : Json(nullptr)},
        {"paths", std::move(paths)},
        {"instances", std::move(instances)}});
}

std::string jsonText(const nlohmann::ordered_json& document) {
    constexpr int indentation = 2;
    return document.dump(indentation, ' ', false, Json::error_handler_t::replace) + '\n';
}

}  // namespace cimdhcp
