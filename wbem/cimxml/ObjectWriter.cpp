#include "cimxml/ObjectWriter.h"

#include <algorithm>
#include <array>
#include <memory>

#include "cimom/ClassDeclaration.h"
#include "cimom/Instance.h"
#include "cimom/Names.h"
#include "cimom/ObjectPathText.h"
#include "cimxml/XmlText.h"

namespace cimom::wbem {

namespace {

using Reference = std::shared_ptr<const ObjectPath>;
using Embedded = std::shared_ptr<const Instance>;

bool isNumeric(Type type) noexcept {
    return type >= Type::uint8 && type <= Type::real64;
}

bool isNull(const Scalar& scalar) noexcept {
    return std::holds_alternative<std::monostate>(scalar);
}

/// VALUE of one element, which is not null.
void writeScalar(std::string& out, Type type, const Scalar& scalar) {
    out += "<VALUE>";
    if (const auto* const embedded = std::get_if<Embedded>(&scalar)) {
        // An embedded instance is text to the elements around it (DSP0201, 5.2.5).
        std::string inner;
        writeInstance(inner, **embedded, nullptr);
        appendText(out, inner);
    } else if (const auto* const reference = std::get_if<Reference>(&scalar)) {
        appendText(out, toText(**reference));
    } else {
        appendScalarText(out, type, scalar);
    }
    out += "</VALUE>";
}

/// VALUE, VALUE.ARRAY, or nothing for null.
void writeValue(std::string& out, const Value& value) {
    if (value.isNull()) {
        return;
    }
    if (const Array* const elements = value.array()) {
        out += "<VALUE.ARRAY>";
        for (const Scalar& element : *elements) {
            if (isNull(element)) {
                out += "<VALUE.NULL/>";
            } else {
                writeScalar(out, value.type, element);
            }
        }
        out += "</VALUE.ARRAY>";
    } else {
        writeScalar(out, value.type, *value.scalar());
    }
}

/// Whether the value is, or holds, an embedded instance; it may stand in a
/// property of type string, too.
bool isEmbedded(const Value& value) noexcept {
    const auto holds = [](const Scalar& scalar) {
        return std::holds_alternative<Embedded>(scalar);
    };
    const Scalar* const scalar = value.scalar();
    const Array* const array = value.array();
    return value.type == Type::instance || (scalar != nullptr && holds(*scalar)) ||
           (array != nullptr && std::any_of(array->begin(), array->end(), holds));
}

/// How a type that has no TYPE attribute of its own is declared.
std::string_view declaredType(Type type) noexcept {
    return type == Type::instance || type == Type::reference ? "string" : typeName(type);
}

void writeKeyBinding(std::string& out, const NamedValue& key) {
    const Scalar* const scalar = key.value.scalar();
    if (scalar == nullptr || isNull(*scalar) || std::holds_alternative<Embedded>(*scalar)) {
        return;
    }
    out += "<KEYBINDING";
    appendAttribute(out, "NAME", key.name);
    out += '>';
    if (const auto* const reference = std::get_if<Reference>(scalar)) {
        writeReference(out, **reference);
    } else {
        out += "<KEYVALUE VALUETYPE=\"";
        out += isNumeric(key.value.type)         ? "numeric"
               : key.value.type == Type::boolean ? "boolean"
                                                 : "string";
        out += "\">";
        appendScalarText(out, key.value.type, *scalar);
        out += "</KEYVALUE>";
    }
    out += "</KEYBINDING>";
}

void writeNamespacePath(std::string& out, std::string_view host, std::string_view nameSpace) {
    out += "<NAMESPACEPATH><HOST>";
    appendText(out, host);
    out += "</HOST>";
    writeLocalNamespacePath(out, nameSpace);
    out += "</NAMESPACEPATH>";
}

void writeReferenceProperty(std::string& out, const NamedValue& property,
                            const std::string& attributes) {
    const Scalar* const scalar = property.value.scalar();
    const auto* const reference = scalar == nullptr ? nullptr : std::get_if<Reference>(scalar);
    out += "<PROPERTY.REFERENCE";
    appendAttribute(out, "NAME", property.name);
    if (reference != nullptr) {
        appendAttribute(out, "REFERENCECLASS", (*reference)->className);
    }
    out += attributes;
    out += '>';
    if (reference != nullptr) {
        writeReference(out, **reference);
    }
    out += "</PROPERTY.REFERENCE>";
}

/// One property of an instance; `attributes` are further ones, ready to append.
void writeProperty(std::string& out, const NamedValue& property, const std::string& attributes) {
    const Value& value = property.value;
    if (value.type == Type::reference && !value.isArray) {
        writeReferenceProperty(out, property, attributes);
        return;
    }
    const bool embedded = isEmbedded(value);
    // Most of a response is made here: few long pieces take less time than many short ones.
    out += value.isArray ? std::string_view("<PROPERTY.ARRAY NAME=\"")
                         : std::string_view("<PROPERTY NAME=\"");
    appendAttributeText(out, property.name);
    out += std::string_view("\" TYPE=\"");
    out += embedded ? "string" : declaredType(value.type);
    out += '"';
    out += attributes;
    out += embedded ? std::string_view(" EmbeddedObject=\"instance\">") : std::string_view(">");
    writeValue(out, value);
    out += value.isArray ? std::string_view("</PROPERTY.ARRAY>") : std::string_view("</PROPERTY>");
}

void writeFlag(std::string& out, const char* name, bool value, bool standard) {
    if (value != standard) {
        appendAttribute(out, name, value ? "true" : "false");
    }
}

/// The attributes that a qualifier has wherever it stands.
void writeFlavors(std::string& out, const Qualifier& qualifier) {
    writeFlag(out, "OVERRIDABLE", qualifier.overridable, true);
    writeFlag(out, "TOSUBCLASS", qualifier.toSubclass, true);
    writeFlag(out, "TRANSLATABLE", qualifier.translatable, false);
}

void writeQualifiers(std::string& out, const std::vector<Qualifier>& qualifiers) {
    for (const Qualifier& qualifier : qualifiers) {
        out += "<QUALIFIER";
        appendAttribute(out, "NAME", qualifier.name);
        appendAttribute(out, "TYPE", declaredType(qualifier.value.type));
        writeFlavors(out, qualifier);
        out += '>';
        writeValue(out, qualifier.value);
        out += "</QUALIFIER>";
    }
}

void writeDeclaration(std::string& out, const PropertyDeclaration& property,
                      const ClassForm& form) {
    const bool reference = property.type == Type::reference && !property.isArray;
    const std::string_view element = reference          ? "PROPERTY.REFERENCE"
                                     : property.isArray ? "PROPERTY.ARRAY"
                                                        : "PROPERTY";
    out.append("<").append(element);
    appendAttribute(out, "NAME", property.name);
    if (reference) {
        appendAttribute(out, "REFERENCECLASS", property.referenceClass);
    } else {
        appendAttribute(out, "TYPE", declaredType(property.type));
    }
    if (property.isArray && property.arraySize) {
        appendAttribute(out, "ARRAYSIZE", std::to_string(*property.arraySize));
    }
    if (form.classOrigin) {
        appendAttribute(out, "CLASSORIGIN", property.classOrigin);
    }
    appendAttribute(out, "PROPAGATED", property.propagated ? "true" : "false");
    if (!reference && property.qualifier("EmbeddedInstance") != nullptr) {
        out += " EmbeddedObject=\"instance\"";
    } else if (!reference && property.qualifier("EmbeddedObject") != nullptr) {
        out += " EmbeddedObject=\"object\"";
    }
    out += '>';
    if (form.qualifiers) {
        writeQualifiers(out, property.qualifiers);
    }
    if (!reference) {
        writeValue(out, property.defaultValue);
    }
    out.append("</").append(element).append(">");
}

}  // namespace

void writeLocalNamespacePath(std::string& out, std::string_view nameSpace) {
    out += "<LOCALNAMESPACEPATH>";
    while (true) {
        const std::size_t slash = nameSpace.find('/');
        out += "<NAMESPACE";
        appendAttribute(out, "NAME", nameSpace.substr(0, slash));
        out += "/>";
        if (slash == std::string_view::npos) {
            break;
        }
        nameSpace.remove_prefix(slash + 1);
    }
    out += "</LOCALNAMESPACEPATH>";
}

void writeInstanceName(std::string& out, const ObjectPath& path) {
    out += "<INSTANCENAME";
    appendAttribute(out, "CLASSNAME", path.className);
    out += '>';
    for (const NamedValue& key : path.keys) {
        writeKeyBinding(out, key);
    }
    out += "</INSTANCENAME>";
}

void writeInstancePath(std::string& out, const ObjectPath& path, std::string_view host) {
    out += "<INSTANCEPATH>";
    writeNamespacePath(out, path.host.empty() ? host : std::string_view(path.host), path.nameSpace);
    writeInstanceName(out, path);
    out += "</INSTANCEPATH>";
}

void writeClassName(std::string& out, std::string_view className) {
    out += "<CLASSNAME";
    appendAttribute(out, "NAME", className);
    out += "/>";
}

void writeClassPath(std::string& out, std::string_view host, std::string_view nameSpace,
                    std::string_view className) {
    out += "<CLASSPATH>";
    writeNamespacePath(out, host, nameSpace);
    writeClassName(out, className);
    out += "</CLASSPATH>";
}

void writeReference(std::string& out, const ObjectPath& path) {
    const auto writeName = [&] {
        if (path.keys.empty()) {
            writeClassName(out, path.className);
        } else {
            writeInstanceName(out, path);
        }
    };
    out += "<VALUE.REFERENCE>";
    if (path.nameSpace.empty()) {
        writeName();
    } else if (path.host.empty()) {
        const std::string_view element = path.keys.empty() ? "LOCALCLASSPATH" : "LOCALINSTANCEPATH";
        out.append("<").append(element).append(">");
        writeLocalNamespacePath(out, path.nameSpace);
        writeName();
        out.append("</").append(element).append(">");
    } else if (path.keys.empty()) {
        writeClassPath(out, path.host, path.nameSpace, path.className);
    } else {
        writeInstancePath(out, path, path.host);
    }
    out += "</VALUE.REFERENCE>";
}

void writeInstance(std::string& out, const Instance& instance, const ClassDeclaration* origins) {
    out += "<INSTANCE";
    appendAttribute(out, "CLASSNAME", instance.path.className);
    out += '>';
    std::string attributes;
    for (const NamedValue& property : instance.properties) {
        attributes.clear();
        const PropertyDeclaration* const declaration =
            origins == nullptr ? nullptr : origins->property(property.name);
        if (declaration != nullptr) {
            appendAttribute(attributes, "CLASSORIGIN", declaration->classOrigin);
        }
        writeProperty(out, property, attributes);
    }
    out += "</INSTANCE>";
}

void writeQualifierType(std::string& out, const QualifierType& type) {
    static constexpr std::array<std::string_view, 7> scopes{
        "CLASS", "ASSOCIATION", "REFERENCE", "PROPERTY", "METHOD", "PARAMETER", "INDICATION"};
    const Qualifier& prototype = type.prototype;
    out += "<QUALIFIER.DECLARATION";
    appendAttribute(out, "NAME", prototype.name);
    appendAttribute(out, "TYPE", declaredType(prototype.value.type));
    appendAttribute(out, "ISARRAY", prototype.value.isArray ? "true" : "false");
    writeFlavors(out, prototype);
    out += "><SCOPE";
    for (const std::string_view scope : scopes) {
        if (type.mayStandAt(scope)) {
            appendAttribute(out, scope, "true");
        }
    }
    out += "/>";
    writeValue(out, prototype.value);
    out += "</QUALIFIER.DECLARATION>";
}

void writeClass(std::string& out, const ClassDeclaration& declaration, const ClassForm& form) {
    out += "<CLASS";
    appendAttribute(out, "NAME", declaration.name);
    if (!declaration.superclass.empty()) {
        appendAttribute(out, "SUPERCLASS", declaration.superclass);
    }
    out += '>';
    if (form.qualifiers) {
        writeQualifiers(out, declaration.qualifiers);
    }
    for (const PropertyDeclaration& property : declaration.properties) {
        const auto listed = [&property](const std::string& name) {
            return sameName(name, property.name);
        };
        const bool wanted = !form.propertyList || std::any_of(form.propertyList->begin(),
                                                              form.propertyList->end(), listed);
        if (wanted && !(form.localOnly && property.propagated)) {
            writeDeclaration(out, property, form);
        }
    }
    out += "</CLASS>";
}

}  // namespace cimom::wbem
