#include "kit/ElementTable.h"

#include <algorithm>
#include <functional>
#include <map>
#include <sstream>
#include <string_view>
#include <utility>

namespace cimom::test {

namespace {

struct Rule {
    /// Words: a name, with "!" when it is required; "=a/b" are the values it may have.
    const char* attributes;
    /// "text", or alternatives between " | ": children in their order, each a name or
    /// (A/B), with "?", "*" or "+" behind it.
    const char* content;
};

constexpr const char* properties = "(PROPERTY/PROPERTY.ARRAY/PROPERTY.REFERENCE)*";
constexpr const char* types =
    "boolean/string/char16/uint8/sint8/uint16/sint16/uint32/sint32/uint64/sint64/datetime/"
    "real32/real64";

/// The table as it is written down.
const std::map<std::string, Rule>& table() {
    static const std::string ofProperties = std::string("QUALIFIER* ") + properties;
    static const std::string typed = std::string("NAME! TYPE!=") + types +
                                     " CLASSORIGIN PROPAGATED=true/false "
                                     "EmbeddedObject=instance/object ";
    static const std::string typedArray = typed + "ARRAYSIZE ";
    static const std::string qualifier = std::string("NAME! TYPE!=") + types +
                                         " PROPAGATED=true/false OVERRIDABLE=true/false "
                                         "TOSUBCLASS=true/false TOINSTANCE=true/false "
                                         "TRANSLATABLE=true/false";
    static const std::string declaration = qualifier + " ISARRAY=true/false ARRAYSIZE";
    static const std::map<std::string, Rule> all{
        {"CIM", {"CIMVERSION! DTDVERSION!", "MESSAGE"}},
        {"MESSAGE", {"ID! PROTOCOLVERSION!", "(SIMPLEREQ/SIMPLERSP)"}},
        {"SIMPLEREQ", {"", "(IMETHODCALL/METHODCALL)"}},
        {"SIMPLERSP", {"", "(IMETHODRESPONSE/METHODRESPONSE)"}},
        {"IMETHODCALL", {"NAME!", "LOCALNAMESPACEPATH IPARAMVALUE*"}},
        {"IMETHODRESPONSE", {"NAME!", "ERROR | IRETURNVALUE? PARAMVALUE*"}},
        {"METHODRESPONSE", {"NAME!", "ERROR | RETURNVALUE? PARAMVALUE*"}},
        {"IPARAMVALUE",
         {"NAME!",
          "(VALUE/VALUE.ARRAY/VALUE.REFERENCE/INSTANCENAME/CLASSNAME/QUALIFIER.DECLARATION/CLASS/"
          "INSTANCE/VALUE.NAMEDINSTANCE)?"}},
        {"PARAMVALUE",
         {"NAME! PARAMTYPE EmbeddedObject=instance/object",
          "(VALUE/VALUE.REFERENCE/VALUE.ARRAY/VALUE.REFARRAY/CLASS)?"}},
        {"IRETURNVALUE",
         {"",
          "CLASSNAME* | INSTANCENAME* | VALUE* | VALUE.OBJECTWITHPATH* | "
          "VALUE.OBJECTWITHLOCALPATH* | VALUE.OBJECT* | OBJECTPATH* | QUALIFIER.DECLARATION* | "
          "VALUE.ARRAY? | VALUE.REFERENCE? | CLASS* | INSTANCE* | INSTANCEPATH* | "
          "VALUE.NAMEDINSTANCE* | VALUE.INSTANCEWITHPATH*"}},
        {"ERROR", {"CODE! DESCRIPTION", "INSTANCE*"}},
        {"VALUE", {"", "text"}},
        {"VALUE.NULL", {"", ""}},
        {"VALUE.ARRAY", {"", "(VALUE/VALUE.NULL)*"}},
        {"VALUE.REFERENCE",
         {"", "(CLASSPATH/LOCALCLASSPATH/CLASSNAME/INSTANCEPATH/LOCALINSTANCEPATH/INSTANCENAME)"}},
        {"VALUE.NAMEDINSTANCE", {"", "INSTANCENAME INSTANCE"}},
        {"VALUE.INSTANCEWITHPATH", {"", "INSTANCEPATH INSTANCE"}},
        {"VALUE.OBJECTWITHPATH", {"", "CLASSPATH CLASS | INSTANCEPATH INSTANCE"}},
        {"NAMESPACEPATH", {"", "HOST LOCALNAMESPACEPATH"}},
        {"LOCALNAMESPACEPATH", {"", "NAMESPACE+"}},
        {"HOST", {"", "text"}},
        {"NAMESPACE", {"NAME!", ""}},
        {"CLASSPATH", {"", "NAMESPACEPATH CLASSNAME"}},
        {"LOCALCLASSPATH", {"", "LOCALNAMESPACEPATH CLASSNAME"}},
        {"CLASSNAME", {"NAME!", ""}},
        {"INSTANCEPATH", {"", "NAMESPACEPATH INSTANCENAME"}},
        {"LOCALINSTANCEPATH", {"", "LOCALNAMESPACEPATH INSTANCENAME"}},
        {"INSTANCENAME", {"CLASSNAME!", "KEYBINDING* | KEYVALUE? | VALUE.REFERENCE?"}},
        {"OBJECTPATH", {"", "(INSTANCEPATH/CLASSPATH)"}},
        {"KEYBINDING", {"NAME!", "(KEYVALUE/VALUE.REFERENCE)"}},
        {"KEYVALUE", {"VALUETYPE=string/boolean/numeric", "text"}},
        {"CLASS", {"NAME! SUPERCLASS", ofProperties.c_str()}},
        {"INSTANCE", {"CLASSNAME!", ofProperties.c_str()}},
        {"QUALIFIER", {qualifier.c_str(), "(VALUE/VALUE.ARRAY)?"}},
        {"QUALIFIER.DECLARATION",
         {declaration.c_str(), "SCOPE VALUE? | SCOPE VALUE.ARRAY | VALUE? | VALUE.ARRAY"}},
        {"SCOPE",
         {"CLASS=true/false ASSOCIATION=true/false REFERENCE=true/false PROPERTY=true/false "
          "METHOD=true/false PARAMETER=true/false INDICATION=true/false",
          ""}},
        {"PROPERTY", {typed.c_str(), "QUALIFIER* VALUE?"}},
        {"PROPERTY.ARRAY", {typedArray.c_str(), "QUALIFIER* VALUE.ARRAY?"}},
        {"PROPERTY.REFERENCE",
         {"NAME! REFERENCECLASS CLASSORIGIN PROPAGATED=true/false", "QUALIFIER* VALUE.REFERENCE?"}},
    };
    return all;
}

std::vector<std::string> split(const std::string& text, const std::string& separator) {
    std::vector<std::string> parts;
    std::size_t start = 0;
    while (start <= text.size()) {
        const std::size_t end = std::min(text.find(separator, start), text.size());
        if (end > start) {
            parts.push_back(text.substr(start, end - start));
        }
        start = end + separator.size();
    }
    return parts;
}

/// A place in a content model: one of the names, so often.
struct Particle {
    std::vector<std::string> names;
    bool optional = false;
    bool several = false;
};

struct Attribute {
    bool required = false;
    std::vector<std::string> values;  ///< empty: any
};

/// A rule, read once for the very many elements that it is held against.
struct ReadRule {
    std::map<std::string, Attribute, std::less<>> attributes;
    std::vector<std::vector<Particle>> alternatives;
    std::string content;
};

Particle readParticle(std::string text) {
    Particle particle;
    const char last = text.back();
    particle.optional = last == '?' || last == '*';
    particle.several = last == '*' || last == '+';
    std::erase_if(text, [](char letter) {
        return std::string_view("()?*+").find(letter) != std::string_view::npos;
    });
    particle.names = split(text, "/");
    return particle;
}

ReadRule readRule(const Rule& rule) {
    ReadRule made;
    made.content = rule.content;
    std::istringstream words(rule.attributes);
    for (std::string word; words >> word;) {
        const std::size_t equals = word.find('=');
        Attribute attribute;
        attribute.values = split(equals == std::string::npos ? "" : word.substr(equals + 1), "/");
        std::string name = word.substr(0, equals);
        attribute.required = name.back() == '!';
        if (attribute.required) {
            name.pop_back();
        }
        made.attributes.emplace(std::move(name), std::move(attribute));
    }
    const bool none = made.content == "text" || made.content.empty();
    for (const std::string& alternative :
         none ? std::vector<std::string>{""} : split(made.content, " | ")) {
        std::vector<Particle>& particles = made.alternatives.emplace_back();
        for (std::string& particle : split(alternative, " ")) {
            particles.push_back(readParticle(std::move(particle)));
        }
    }
    return made;
}

const std::map<std::string, ReadRule>& rules() {
    static const std::map<std::string, ReadRule> all = [] {
        std::map<std::string, ReadRule> made;
        for (const auto& [name, rule] : table()) {
            made.emplace(name, readRule(rule));
        }
        return made;
    }();
    return all;
}

/// Whether the children are those of one alternative. Greedy, which suffices: the
/// models of the table are deterministic, as those of a DTD must be.
bool matches(const std::vector<wbem::XmlElement>& children,
             const std::vector<Particle>& alternative) {
    std::size_t at = 0;
    for (const Particle& particle : alternative) {
        std::size_t count = 0;
        while (at < children.size() && (particle.several || count == 0) &&
               std::find(particle.names.begin(), particle.names.end(), children[at].name) !=
                   particle.names.end()) {
            ++at;
            ++count;
        }
        if (count == 0 && !particle.optional) {
            return false;
        }
    }
    return at == children.size();
}

void checkAttributes(const wbem::XmlElement& element, const ReadRule& rule,
                     std::vector<std::string>& found) {
    for (const auto& [name, attribute] : rule.attributes) {
        if (attribute.required && element.attribute(name) == nullptr) {
            found.push_back(element.name + " has no " + name);
        }
    }
    for (const auto& [name, value] : element.attributes) {
        const auto known = rule.attributes.find(name);
        if (known == rule.attributes.end()) {
            found.push_back(element.name + " has an attribute " + name);
            continue;
        }
        const std::vector<std::string>& values = known->second.values;
        if (!values.empty() && std::find(values.begin(), values.end(), value) == values.end()) {
            found.push_back(element.name + " has " + name + "=\"" + value + "\"");
        }
    }
}

void check(const wbem::XmlElement& element, std::vector<std::string>& found) {
    const auto rule = rules().find(element.name);
    if (rule == rules().end()) {
        found.push_back("element " + element.name + " is unknown");
        return;
    }
    checkAttributes(element, rule->second, found);
    const std::string& content = rule->second.content;
    if (content != "text" && element.text.find_first_not_of(" \t\r\n") != std::string::npos) {
        found.push_back(element.name + " holds text");
    }
    const auto& alternatives = rule->second.alternatives;
    if (std::none_of(alternatives.begin(), alternatives.end(),
                     [&](const auto& one) { return matches(element.children, one); })) {
        found.push_back(element.name + " does not hold " + content);
    }
    for (const wbem::XmlElement& child : element.children) {
        check(child, found);
    }
}

}  // namespace

std::vector<std::string> violations(const wbem::XmlElement& element) {
    std::vector<std::string> found;
    check(element, found);
    return found;
}

}  // namespace cimom::test
