#include "cimxml/ObjectReader.h"

#include <charconv>
#include <string>
#include <system_error>
#include <utility>

#include "cimom/ClassDeclaration.h"
#include "cimom/Names.h"
#include "cimxml/Errors.h"

namespace cimom::wbem {

namespace {

/// A flavor or another attribute that is "true" or "false" (DSP0203).
bool flag(const XmlElement& element, const char* name, bool standard) {
    const std::string* const value = element.attribute(name);
    return value == nullptr ? standard : sameName(*value, "true");
}

std::string textAttribute(const XmlElement& element, const char* name) {
    const std::string* const value = element.attribute(name);
    return value == nullptr ? std::string() : *value;
}

std::vector<Qualifier> readQualifiers(const XmlElement& element) {
    std::vector<Qualifier> qualifiers;
    for (const XmlElement& child : element.children) {
        if (child.name == "QUALIFIER") {
            qualifiers.push_back({requiredAttribute(child, "NAME"), readQualifierValue(child),
                                  flag(child, "OVERRIDABLE", true), flag(child, "TOSUBCLASS", true),
                                  flag(child, "TRANSLATABLE", false)});
        }
    }
    return qualifiers;
}

PropertyDeclaration readDeclaration(const XmlElement& element) {
    PropertyDeclaration property;
    property.name = requiredAttribute(element, "NAME");
    property.defaultValue = readPropertyValue(element, property.name);
    property.type = property.defaultValue.type;
    property.isArray = property.defaultValue.isArray;
    if (property.type == Type::instance) {
        // A declaration is of type string, and a qualifier says what is in it.
        property.type = Type::string;
        property.defaultValue = Value::null(Type::string, property.isArray);
    }
    if (const std::string* const size = element.attribute("ARRAYSIZE")) {
        std::uint32_t number = 0;
        const char* const end = size->data() + size->size();
        const auto [stop, error] = std::from_chars(size->data(), end, number);
        if (error != std::errc() || stop != end) {
            throw NotValid("ARRAYSIZE \"" + *size + "\" of " + property.name);
        }
        property.arraySize = number;
    }
    property.referenceClass = textAttribute(element, "REFERENCECLASS");
    property.qualifiers = readQualifiers(element);
    property.classOrigin = textAttribute(element, "CLASSORIGIN");
    property.propagated = flag(element, "PROPAGATED", false);
    return property;
}

}  // namespace

ClassDeclaration readClass(const XmlElement& element) {
    expectName(element, "CLASS");
    expectNoText(element);
    // Each name is compared with all others.
    constexpr std::size_t mostElements = 4096;
    if (element.children.size() > mostElements) {
        throw NotValid("more than " + std::to_string(mostElements) + " elements in CLASS");
    }
    ClassDeclaration declaration;
    declaration.name = requiredAttribute(element, "NAME");
    declaration.superclass = textAttribute(element, "SUPERCLASS");
    declaration.qualifiers = readQualifiers(element);
    for (const XmlElement& child : element.children) {
        if (child.name == "QUALIFIER" || child.name == "METHOD") {
            continue;
        }
        if (!isProperty(child)) {
            throw NotValid("element " + child.name + " in CLASS");
        }
        PropertyDeclaration property = readDeclaration(child);
        if (declaration.property(property.name) != nullptr) {
            throw NotValid("property " + property.name + " twice in CLASS");
        }
        declaration.properties.push_back(std::move(property));
    }
    return declaration;
}

}  // namespace cimom::wbem
