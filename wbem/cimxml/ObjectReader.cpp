#include "cimxml/ObjectReader.h"

#include <algorithm>
#include <memory>
#include <optional>
#include <utility>

#include "cimom/Instance.h"
#include "cimxml/Errors.h"
#include "cimxml/XmlText.h"

namespace cimom::wbem {

namespace {

/// How deep instances may be embedded in each other, and elements in an embedded
/// one: each of them is a document of its own.
constexpr unsigned deepestEmbedding = 4;
constexpr std::size_t embeddedDepth = 64;

/// No class has more; each name is compared with all others.
constexpr std::size_t mostNames = 4096;

void refuseTooMany(const XmlElement& element) {
    if (element.children.size() > mostNames) {
        throw NotValid("more than " + std::to_string(mostNames) + " elements in " + element.name);
    }
}

[[noreturn]] void misplaced(const XmlElement& inner, const XmlElement& outer) {
    throw NotValid("element " + inner.name + " in " + outer.name);
}

/// Throws the CIM error for a value that its type does not have.
[[noreturn]] void noValue(const std::string& text, Type type, const std::string& name) {
    constexpr std::size_t shown = 80;
    throw CimError(
        CimStatus::invalidParameter,
        name + ": \"" + text.substr(0, shown) + "\" is not of type " + std::string(typeName(type)));
}

Scalar readScalar(const std::string& text, Type type, const std::string& name) {
    auto scalar = readScalarText(type, text);
    if (!scalar) {
        noValue(text, type, name);
    }
    return *std::move(scalar);
}

Type readType(const XmlElement& element) {
    const std::string& name = requiredAttribute(element, "TYPE");
    const auto type = typeFromName(name);
    if (!type || *type == Type::reference || *type == Type::instance) {
        throw NotValid("TYPE \"" + name + "\" of " + element.name);
    }
    return *type;
}

Value readKeyValue(const XmlElement& element, const std::string& name) {
    if (!element.children.empty()) {
        misplaced(element.children.front(), element);
    }
    if (element.attribute("TYPE") != nullptr) {
        const Type type = readType(element);
        return {type, false, readScalar(element.text, type, name)};
    }
    const std::string* const kind = element.attribute("VALUETYPE");
    if (kind == nullptr || *kind == "string") {
        return Value::ofString(element.text);
    }
    if (*kind == "boolean") {
        return {Type::boolean, false, readScalar(element.text, Type::boolean, name)};
    }
    if (*kind != "numeric") {
        throw NotValid("VALUETYPE \"" + *kind + "\"");
    }
    auto number = readNumberText(element.text);
    if (!number) {
        throw CimError(CimStatus::invalidParameter,
                       name + ": \"" + element.text + "\" is not a number");
    }
    return *std::move(number);
}

Value referenceValue(ObjectPath path) {
    return {Type::reference, false, Scalar(std::make_shared<const ObjectPath>(std::move(path)))};
}

ObjectPath readReference(const XmlElement& element) {
    expectName(element, "VALUE.REFERENCE");
    return readPath(onlyChild(element));
}

Value readKey(const XmlElement& element, const std::string& name) {
    return element.name == "KEYVALUE" ? readKeyValue(element, name)
                                      : referenceValue(readReference(element));
}

ObjectPath readInstanceName(const XmlElement& element) {
    expectNoText(element);
    ObjectPath path;
    path.className = requiredAttribute(element, "CLASSNAME");
    const bool bare = !element.children.empty() && element.children.front().name != "KEYBINDING";
    if (bare) {
        path.keys.push_back({"", readKey(onlyChild(element), "the key")});
        return path;
    }
    refuseTooMany(element);
    for (const XmlElement& binding : element.children) {
        if (binding.name != "KEYBINDING") {
            misplaced(binding, element);
        }
        const std::string& name = requiredAttribute(binding, "NAME");
        if (path.key(name) != nullptr) {
            throw CimError(CimStatus::invalidParameter, "key " + name + " is given twice");
        }
        path.keys.push_back({name, readKey(onlyChild(binding), name)});
    }
    return path;
}

/// The two children of a path: where, and what.
std::pair<const XmlElement*, const XmlElement*> parts(const XmlElement& element) {
    expectNoText(element);
    if (element.children.size() != 2) {
        throw NotValid("the content of " + element.name);
    }
    return {&element.children.front(), &element.children.back()};
}

void readNamespacePath(const XmlElement& element, ObjectPath& path) {
    expectName(element, "NAMESPACEPATH");
    const auto [host, nameSpace] = parts(element);
    expectName(*host, "HOST");
    path.host = host->text;
    path.nameSpace = readLocalNamespacePath(*nameSpace);
}

Instance readInstanceAt(const XmlElement& element, unsigned embedding);

/// An embedded instance: the text of an INSTANCE.
Scalar readEmbedded(const std::string& text, unsigned embedding, const std::string& name) {
    if (embedding >= deepestEmbedding) {
        throw CimError(CimStatus::invalidParameter,
                       name + ": instances are embedded too deep in each other");
    }
    try {
        const XmlElement inner = readXml(text, embeddedDepth, usualMemory(text.size()));
        return std::make_shared<const Instance>(readInstanceAt(inner, embedding + 1));
    } catch (const XmlError& error) {
        throw CimError(CimStatus::invalidParameter, name + ": embedded instance, " + error.what());
    } catch (const NotValid& error) {
        throw CimError(CimStatus::invalidParameter, name + ": embedded instance, " + error.what());
    }
}

/// What all the values of one property have in common.
struct ValueKind {
    Type type;
    unsigned embedding;
    const std::string& name;

    [[nodiscard]] Scalar read(const XmlElement& value) const {
        const std::string& text = readText(value);
        return type == Type::instance ? readEmbedded(text, embedding, name)
                                      : readScalar(text, type, name);
    }
};

/// The type of a property's values, and its VALUE or VALUE.ARRAY when it has one.
std::pair<Type, const XmlElement*> readDeclared(const XmlElement& element) {
    expectNoText(element);
    Type type = readType(element);
    // DSP0201 writes the attribute so; older servers in capitals.
    const std::string* embedded = element.attribute("EmbeddedObject");
    embedded = embedded == nullptr ? element.attribute("EMBEDDEDOBJECT") : embedded;
    if (embedded != nullptr) {
        if (type != Type::string || (*embedded != "instance" && *embedded != "object")) {
            throw NotValid("EmbeddedObject \"" + *embedded + "\" of " + element.name);
        }
        type = Type::instance;
    }
    const XmlElement* value = nullptr;
    for (const XmlElement& child : element.children) {
        if (child.name == "QUALIFIER" && value == nullptr) {
            continue;
        }
        if (value != nullptr || (child.name != "VALUE" && child.name != "VALUE.ARRAY")) {
            misplaced(child, element);
        }
        value = &child;
    }
    return {type, value};
}

Value readProperty(const XmlElement& element, unsigned embedding, const std::string& name) {
    const auto [type, value] = readDeclared(element);
    if (value == nullptr) {
        return Value::null(type, false);
    }
    expectName(*value, "VALUE");
    return {type, false, ValueKind{type, embedding, name}.read(*value)};
}

Value readArrayProperty(const XmlElement& element, unsigned embedding, const std::string& name) {
    const auto [type, value] = readDeclared(element);
    if (value == nullptr) {
        return Value::null(type, true);
    }
    expectName(*value, "VALUE.ARRAY");
    expectNoText(*value);
    const ValueKind kind{type, embedding, name};
    Array elements;
    elements.reserve(value->children.size());
    for (const XmlElement& child : value->children) {
        if (child.name == "VALUE.NULL") {
            elements.emplace_back();
        } else {
            elements.push_back(kind.read(child));
        }
    }
    return {type, true, std::move(elements)};
}

Value readReferenceProperty(const XmlElement& element) {
    expectNoText(element);
    const XmlElement* reference = nullptr;
    for (const XmlElement& child : element.children) {
        if (child.name == "QUALIFIER" && reference == nullptr) {
            continue;
        }
        if (reference != nullptr) {
            misplaced(child, element);
        }
        reference = &child;
    }
    return reference == nullptr ? Value::null(Type::reference, false)
                                : referenceValue(readReference(*reference));
}

Value readAnyProperty(const XmlElement& element, unsigned embedding, const std::string& name) {
    if (element.name == "PROPERTY") {
        return readProperty(element, embedding, name);
    }
    return element.name == "PROPERTY.ARRAY" ? readArrayProperty(element, embedding, name)
                                            : readReferenceProperty(element);
}

Instance readInstanceAt(const XmlElement& element, unsigned embedding) {
    expectName(element, "INSTANCE");
    expectNoText(element);
    refuseTooMany(element);
    Instance instance;
    instance.path.className = requiredAttribute(element, "CLASSNAME");
    for (const XmlElement& child : element.children) {
        if (child.name == "QUALIFIER") {
            continue;
        }
        if (!isProperty(child)) {
            misplaced(child, element);
        }
        const std::string& name = requiredAttribute(child, "NAME");
        if (instance.property(name) != nullptr) {
            throw CimError(CimStatus::invalidParameter, "property " + name + " is given twice");
        }
        instance.properties.push_back({name, readAnyProperty(child, embedding, name)});
    }
    return instance;
}

}  // namespace

const std::string& requiredAttribute(const XmlElement& element, const char* name) {
    const std::string* const value = element.attribute(name);
    if (value == nullptr || value->empty()) {
        throw NotValid(element.name + " without " + name);
    }
    return *value;
}

void expectName(const XmlElement& element, const char* name) {
    if (element.name != name) {
        throw NotValid("element " + element.name + " where " + name + " belongs");
    }
}

void expectNoText(const XmlElement& element) {
    if (element.text.find_first_not_of(" \t\r\n") != std::string::npos) {
        throw NotValid("text in " + element.name);
    }
}

const XmlElement& onlyChild(const XmlElement& element) {
    expectNoText(element);
    if (element.children.size() != 1) {
        throw NotValid("the content of " + element.name);
    }
    return element.children.front();
}

std::string readLocalNamespacePath(const XmlElement& element) {
    expectName(element, "LOCALNAMESPACEPATH");
    expectNoText(element);
    std::string nameSpace;
    for (const XmlElement& part : element.children) {
        expectName(part, "NAMESPACE");
        nameSpace += (nameSpace.empty() ? "" : "/") + requiredAttribute(part, "NAME");
    }
    if (nameSpace.empty()) {
        throw NotValid("LOCALNAMESPACEPATH without NAMESPACE");
    }
    return nameSpace;
}

std::string readClassName(const XmlElement& element) {
    expectName(element, "CLASSNAME");
    return requiredAttribute(element, "NAME");
}

ObjectPath readPath(const XmlElement& element) {
    ObjectPath path;
    if (element.name == "INSTANCENAME") {
        return readInstanceName(element);
    }
    if (element.name == "CLASSNAME") {
        path.className = readClassName(element);
        return path;
    }
    const bool local = element.name == "LOCALINSTANCEPATH" || element.name == "LOCALCLASSPATH";
    const bool instance = element.name == "LOCALINSTANCEPATH" || element.name == "INSTANCEPATH";
    if (!local && !instance && element.name != "CLASSPATH") {
        throw NotValid("element " + element.name + " where a path belongs");
    }
    const auto [where, what] = parts(element);
    expectName(*what, instance ? "INSTANCENAME" : "CLASSNAME");
    path = readPath(*what);
    if (local) {
        path.nameSpace = readLocalNamespacePath(*where);
    } else {
        readNamespacePath(*where, path);
    }
    return path;
}

Instance readInstance(const XmlElement& element) {
    return readInstanceAt(element, 0);
}

bool isProperty(const XmlElement& element) {
    return element.name == "PROPERTY" || element.name == "PROPERTY.ARRAY" ||
           element.name == "PROPERTY.REFERENCE";
}

Value readPropertyValue(const XmlElement& element, const std::string& name) {
    if (!isProperty(element)) {
        throw NotValid("element " + element.name + " where a property belongs");
    }
    return readAnyProperty(element, 0, name);
}

Value readQualifierValue(const XmlElement& element) {
    expectName(element, "QUALIFIER");
    const std::string& name = requiredAttribute(element, "NAME");
    const bool array = !element.children.empty() && element.children.front().name == "VALUE.ARRAY";
    return array ? readArrayProperty(element, 0, name) : readProperty(element, 0, name);
}

const std::string& readText(const XmlElement& element) {
    expectName(element, "VALUE");
    if (!element.children.empty()) {
        misplaced(element.children.front(), element);
    }
    return element.text;
}

std::vector<std::string> readTexts(const XmlElement& element) {
    expectName(element, "VALUE.ARRAY");
    expectNoText(element);
    std::vector<std::string> texts;
    texts.reserve(element.children.size());
    for (const XmlElement& child : element.children) {
        texts.push_back(readText(child));
    }
    return texts;
}

}  // namespace cimom::wbem
