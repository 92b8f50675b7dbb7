#include "manager/RequestPath.h"

#include <algorithm>
#include <memory>

#include "broker/Arena.h"
#include "broker/Conversion.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "cimom/Names.h"
#include "cimom/ObjectPathText.h"

namespace cimom {

namespace {

bool isInteger(Type type) noexcept {
    return type >= Type::uint8 && type <= Type::sint64;
}

/// A text that stands for a reference, in the namespace of the path around it.
bool readReference(Value& value, const std::string& text, const std::string& nameSpace) {
    try {
        ObjectPath reference = parseObjectPath(text);
        if (reference.nameSpace.empty()) {
            reference.nameSpace = nameSpace;
        }
        value = {Type::reference, false,
                 Scalar(std::make_shared<const ObjectPath>(std::move(reference)))};
        return true;
    } catch (const ObjectPathError&) {
        return false;
    }
}

/// Gives the value the declared type; false when it cannot have it.
bool retype(Value& value, Type declared, const std::string& nameSpace) {
    const Scalar* const scalar = value.scalar();
    if (scalar == nullptr || value.isNull()) {
        return true;
    }
    if (declared == Type::reference) {
        if (const auto* const text = std::get_if<std::string>(scalar)) {
            return readReference(value, *text, nameSpace);
        }
    }
    value.type = declared;
    if (declared == Type::char16) {
        const auto* const text = std::get_if<std::string>(scalar);
        if (text != nullptr && text->size() == 1) {
            value.content = Scalar(static_cast<char16_t>(text->front()));
        }
    }
    // Handing it over tries whether the type can hold it.
    broker::Arena scratch;
    try {
        const CMPIData data = broker::toData(scratch, nullptr, value);
        if (isInteger(declared) || declared == Type::real32 || declared == Type::real64) {
            value = broker::toModel(data);
        }
        return true;
    } catch (const broker::ConversionError&) {
        return false;
    }
}

bool hasControlCharacter(const Scalar& scalar) noexcept {
    const auto* const text = std::get_if<std::string>(&scalar);
    return text != nullptr && std::any_of(text->begin(), text->end(), [](char character) {
               const auto code = static_cast<unsigned char>(character);
               return code < 0x20 || code == 0x7f;
           });
}

}  // namespace

std::string plainNameSpace(const std::string& nameSpace) {
    const std::size_t first = nameSpace.find_first_not_of('/');
    if (first == std::string::npos) {
        return {};
    }
    return nameSpace.substr(first, nameSpace.find_last_not_of('/') - first + 1);
}

const std::string* knownNameSpace(const std::string& wanted,
                                  const std::vector<std::string>& nameSpaces) {
    const std::string plain = plainNameSpace(wanted);
    const auto find = [&nameSpaces](std::string_view name) -> const std::string* {
        const auto found = std::ranges::find_if(
            nameSpaces, [name](const std::string& one) { return sameName(one, name); });
        return found == nameSpaces.end() ? nullptr : &*found;
    };
    const std::string* const known = find(plain);
    return known == nullptr && sameName(plain, "interop") ? find("root/interop") : known;
}

void canonicalizeReferences(std::vector<NamedValue>& values,
                            const std::vector<std::string>& nameSpaces) {
    for (NamedValue& named : values) {
        const Scalar* const scalar = named.value.scalar();
        const auto* const reference =
            scalar == nullptr ? nullptr : std::get_if<std::shared_ptr<const ObjectPath>>(scalar);
        const std::string* const known =
            reference == nullptr ? nullptr : knownNameSpace((*reference)->nameSpace, nameSpaces);
        if (known != nullptr && *known != (*reference)->nameSpace) {
            ObjectPath path = **reference;
            path.nameSpace = *known;
            named.value.content = Scalar(std::make_shared<const ObjectPath>(std::move(path)));
        }
    }
}

Status canonicalize(ObjectPath& path, const ClassRepository& repository,
                    const std::vector<std::string>& nameSpaces) {
    const std::string* const known = knownNameSpace(path.nameSpace, nameSpaces);
    if (known == nullptr) {
        const std::string wanted = plainNameSpace(path.nameSpace);
        return {CMPI_RC_ERR_INVALID_NAMESPACE,
                wanted.empty() ? "the path has no namespace" : "no namespace \"" + wanted + "\""};
    }
    path.nameSpace = *known;
    const ClassDeclaration* const declaration = repository.find(path.className);
    if (declaration == nullptr) {
        return {CMPI_RC_ERR_INVALID_CLASS, "no class \"" + path.className + "\""};
    }
    path.className = declaration->name;
    for (NamedValue& key : path.keys) {
        const PropertyDeclaration* const property = declaration->property(key.name);
        if (property != nullptr && !property->isArray &&
            !retype(key.value, property->type, path.nameSpace)) {
            return {CMPI_RC_ERR_INVALID_PARAMETER, "key " + property->name + " is not of type " +
                                                       std::string(typeName(property->type))};
        }
    }
    canonicalizeReferences(path.keys, nameSpaces);
    return {};
}

Status checkTexts(const Instance& instance) {
    for (const NamedValue& property : instance.properties) {
        const Scalar* const scalar = property.value.scalar();
        const Array* const array = property.value.array();
        const bool bad =
            (scalar != nullptr && hasControlCharacter(*scalar)) ||
            (array != nullptr && std::any_of(array->begin(), array->end(), hasControlCharacter));
        if (bad) {
            return {CMPI_RC_ERR_INVALID_PARAMETER,
                    "property " + property.name + " holds a control character"};
        }
    }
    return {};
}

}  // namespace cimom
