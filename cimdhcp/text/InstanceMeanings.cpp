#include "text/InstanceMeanings.h"

#include <memory>
#include <optional>
#include <variant>

#include "cimom/ObjectPathText.h"
#include "text/MofText.h"
#include "text/ValueMeaning.h"

namespace cimdhcp {

namespace {

const cimom::PropertyDeclaration* declarationOf(const cimom::ClassDeclaration* declaration,
                                                const std::string& name) {
    return declaration == nullptr ? nullptr : declaration->property(name);
}

std::string shown(const cimom::PropertyDeclaration* property, const cimom::Scalar& value) {
    if (const auto* path = std::get_if<std::shared_ptr<const cimom::ObjectPath>>(&value)) {
        return cimom::toText(**path);
    }
    std::string text = mofLiteral(value);
    if (property != nullptr) {
        if (const auto words = meaning(*property, value)) {
            text += " (" + *words + ')';
        }
    }
    return text;
}

}  // namespace

std::string meaningOf(const cimom::ClassDeclaration* declaration,
                      const cimom::NamedValue& property) {
    const cimom::PropertyDeclaration* const known = declarationOf(declaration, property.name);
    if (known == nullptr) {
        return {};
    }
    if (const cimom::Scalar* const scalar = property.value.scalar()) {
        return meaning(*known, *scalar).value_or("");
    }
    std::string text;
    bool found = false;
    if (const cimom::Array* const elements = property.value.array()) {
        for (const cimom::Scalar& element : *elements) {
            const auto words = meaning(*known, element);
            found = found || words;
            text += (text.empty() ? "" : ", ") + words.value_or(mofLiteral(element));
        }
    }
    return found ? text : std::string();
}

std::string valueWithMeaning(const cimom::ClassDeclaration* declaration,
                             const cimom::NamedValue& property) {
    const cimom::PropertyDeclaration* const known = declarationOf(declaration, property.name);
    if (const cimom::Array* const elements = property.value.array()) {
        std::string text = "{";
        for (const cimom::Scalar& element : *elements) {
            text += (text.size() > 1 ? ", " : "") + shown(known, element);
        }
        return text + '}';
    }
    const cimom::Scalar* const scalar = property.value.scalar();
    return scalar == nullptr ? "NULL" : shown(known, *scalar);
}

}  // namespace cimdhcp
