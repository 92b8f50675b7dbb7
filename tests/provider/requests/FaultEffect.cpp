#include "FaultEffect.h"

#include <algorithm>
#include <map>

#include "cimom/Instance.h"
#include "cimom/ObjectPathText.h"
#include "kit/AssociationMachine.h"

namespace test {

namespace {

/// The parts of an object by name, each as a text.
using Parts = std::map<std::string, std::string>;

std::string textOfScalar(const cimom::Scalar& scalar) {
    struct Text {
        std::string operator()(std::monostate) const { return "null"; }
        std::string operator()(bool truth) const { return truth ? "true" : "false"; }
        std::string operator()(std::uint64_t number) const { return std::to_string(number); }
        std::string operator()(std::int64_t number) const { return std::to_string(number); }
        std::string operator()(double number) const { return std::to_string(number); }
        std::string operator()(char16_t number) const { return std::to_string(number); }
        std::string operator()(const std::string& text) const { return '"' + text + '"'; }
        std::string operator()(const std::shared_ptr<const cimom::ObjectPath>& path) const {
            return toText(*path);
        }
        std::string operator()(const std::shared_ptr<const cimom::Instance>& instance) const {
            return toText(instance->path);
        }
    };
    return std::visit(Text{}, scalar);
}

std::string textOfValue(const cimom::Value& value) {
    if (value.isNull()) {
        return "null";
    }
    if (const cimom::Scalar* scalar = value.scalar()) {
        return textOfScalar(*scalar);
    }
    std::string text = "{";
    for (const cimom::Scalar& element : *value.array()) {
        text += textOfScalar(element) + " ";
    }
    return text + "}";
}

void addPath(Parts& parts, const cimom::ObjectPath& path, const std::string& prefix) {
    parts[prefix + "namespace"] = path.nameSpace;
    parts[prefix + "class"] = path.className;
    for (const cimom::NamedValue& key : path.keys) {
        const cimom::Scalar* scalar = key.value.scalar();
        const auto* reference = scalar == nullptr
                                    ? nullptr
                                    : std::get_if<std::shared_ptr<const cimom::ObjectPath>>(scalar);
        if (reference == nullptr) {
            parts[prefix + "key " + key.name] = textOfValue(key.value);
        } else {
            parts[prefix + "key " + key.name] = "reference";
            addPath(parts, **reference, prefix + key.name + "'s ");
        }
    }
}

std::vector<Parts> objectsOf(const Host::Response& response) {
    std::vector<Parts> objects;
    for (const auto& path : response.paths) {
        addPath(objects.emplace_back(), path.value(), "");
    }
    for (const auto& instance : response.instances) {
        Parts& parts = objects.emplace_back();
        addPath(parts, instance.value().path, "");
        for (const cimom::NamedValue& property : instance->properties) {
            parts[property.name] = textOfValue(property.value);
        }
    }
    return objects;
}

std::string join(const std::vector<std::string>& texts, const char* between) {
    std::string joined;
    for (const std::string& text : texts) {
        joined += (joined.empty() ? "" : between) + text;
    }
    return joined;
}

std::string differenceOf(const Parts& without, const Parts& with) {
    std::vector<std::string> lacking;
    std::vector<std::string> others;
    for (const auto& [name, value] : without) {
        const auto found = with.find(name);
        if (found == with.end()) {
            lacking.push_back(name);
        } else if (found->second != value) {
            others.push_back(name + (found->second.empty() ? " is empty" : " is " + found->second));
        }
    }
    for (const auto& [name, value] : with) {
        if (!without.contains(name)) {
            others.push_back("has " + name);
        }
    }
    if (!lacking.empty()) {
        others.insert(others.begin(), "lacks " + join(lacking, ", "));
    }
    return join(others, ", ");
}

/// Which objects are left out, when the others are the same in the same order.
std::optional<std::vector<std::string>> missing(const std::vector<Parts>& without,
                                                const std::vector<Parts>& with) {
    std::vector<std::string> numbers;
    std::size_t next = 0;
    for (std::size_t i = 0; i < without.size(); ++i) {
        if (next < with.size() && with[next] == without[i]) {
            ++next;
        } else {
            numbers.push_back(std::to_string(i + 1));
        }
    }
    return next == with.size() ? std::optional(numbers) : std::nullopt;
}

}  // namespace

std::string effectOf(const Outcome& without, const Outcome& with) {
    std::vector<std::string> effects;
    if (without.response.code != with.response.code) {
        effects.push_back("status " + std::to_string(with.response.code));
    }
    const std::vector<Parts> before = objectsOf(without.response);
    const std::vector<Parts> after = objectsOf(with.response);
    if (before != after) {
        if (const auto numbers = missing(before, after)) {
            effects.push_back("without object " + join(*numbers, ", "));
        } else if (before.size() == after.size()) {
            for (std::size_t i = 0; i < before.size(); ++i) {
                if (before[i] != after[i]) {
                    effects.push_back("object " + std::to_string(i + 1) + ' ' +
                                      differenceOf(before[i], after[i]));
                }
            }
        } else {
            effects.push_back("instead: " + join(briefs(with.response), ", "));
        }
    }
    if (without.response.returnDoneCalls != with.response.returnDoneCalls) {
        effects.push_back(with.response.returnDoneCalls == 0 ? "left open" : "closed");
    }
    if (without.file != with.file) {
        effects.push_back("file " + with.file.substr(0, with.file.find('\n')));
    }
    for (const std::string& failure : with.failures) {
        effects.push_back("\"" + failure + "\"");
    }
    return effects.empty() ? "nothing" : join(effects, "; ");
}

}  // namespace test
