#include "Request.h"

#include <algorithm>
#include <memory>

#include "cimom/Names.h"
#include "cimom/ObjectPathText.h"
#include "cimom/Type.h"

namespace conformance {

namespace {

std::string lowered(std::string text) {
    std::transform(text.begin(), text.end(), text.begin(), cimom::lowered);
    return text;
}

cimom::Scalar canonical(const cimom::Scalar& scalar);

cimom::ObjectPath canonical(cimom::ObjectPath path) {
    path.host.clear();
    for (cimom::NamedValue& key : path.keys) {
        if (const cimom::Scalar* scalar = key.value.scalar()) {
            key.value.content = canonical(*scalar);
        }
    }
    std::sort(path.keys.begin(), path.keys.end(), [](const auto& one, const auto& other) {
        return lowered(one.name) < lowered(other.name);
    });
    return path;
}

cimom::Scalar canonical(const cimom::Scalar& scalar) {
    const auto* reference = std::get_if<std::shared_ptr<const cimom::ObjectPath>>(&scalar);
    return reference == nullptr ? scalar
                                : std::make_shared<const cimom::ObjectPath>(canonical(**reference));
}

std::string textOf(const cimom::Value& value) {
    const auto scalarText = [](const cimom::Scalar& scalar) {
        return cimom::scalarText(canonical(scalar)).value_or("null");
    };
    std::string text(cimom::typeName(value.type));
    if (const cimom::Array* elements = value.array()) {
        text += "[] ";
        for (const cimom::Scalar& element : *elements) {
            text += scalarText(element) + ' ';
        }
    } else if (const cimom::Scalar* scalar = value.scalar()) {
        text += ' ' + scalarText(*scalar);
    }
    return text;
}

std::string filterText(const char* what, const Name& name) {
    return name ? std::string(", ") + what + ' ' + *name : "";
}

}  // namespace

std::string Request::text() const {
    std::string text = nameOf(operation) + cimom::toText(path) +
                       filterText("association", association) +
                       filterText("result class", resultClass) + filterText("role", role) +
                       filterText("result role", resultRole);
    if (properties) {
        text += ", properties";
        for (const std::string& property : *properties) {
            text += ' ' + property;
        }
    }
    return text;
}

bool asksForNames(Operation operation) noexcept {
    return operation == Operation::enumerateNames || operation == Operation::associatorNames ||
           operation == Operation::referenceNames;
}

std::string textOf(const cimom::ObjectPath& path) {
    return cimom::toText(canonical(path));
}

std::string textOf(const cimom::Instance& instance) {
    Texts properties;
    for (const cimom::NamedValue& property : instance.properties) {
        if (!property.value.isNull()) {
            properties.push_back("\n  " + property.name + ": " + textOf(property.value));
        }
    }
    std::sort(properties.begin(), properties.end());
    std::string text = textOf(instance.path);
    for (const std::string& property : properties) {
        text += property;
    }
    return text;
}

Texts textsOf(const Response& response) {
    Texts texts;
    for (const cimom::ObjectPath& path : response.paths) {
        texts.push_back(textOf(path));
    }
    for (const cimom::Instance& instance : response.instances) {
        texts.push_back(textOf(instance));
    }
    std::sort(texts.begin(), texts.end());
    return texts;
}

}  // namespace conformance
