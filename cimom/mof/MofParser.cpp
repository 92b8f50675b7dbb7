#include "mof/MofParser.h"

#include <algorithm>
#include <array>
#include <limits>
#include <utility>

#include "cimom/MofError.h"

namespace cimom {

namespace {

struct ScopeName {
    std::string_view name;
    MofScope scope;
};
constexpr std::array<ScopeName, 10> scopeNames{{
    {"schema", MofScope::schema},
    {"class", MofScope::classes},
    {"association", MofScope::association},
    {"indication", MofScope::indication},
    {"qualifier", MofScope::qualifier},
    {"property", MofScope::property},
    {"reference", MofScope::reference},
    {"method", MofScope::method},
    {"parameter", MofScope::parameter},
    {"any", MofScope::any},
}};

std::string shown(const MofToken& token) {
    constexpr std::size_t longest = 40;
    switch (token.kind) {
        case MofTokenKind::end:
            return "the end of the text";
        case MofTokenKind::string:
            return "a string";
        default:
            return '"' + std::string(token.text.substr(0, longest)) + '"';
    }
}

/// The type that MOF gives this name; none for names that only this program uses.
std::optional<Type> mofType(std::string_view name) {
    const auto type = typeFromName(name);
    return type == Type::reference || type == Type::instance ? std::nullopt : type;
}

}  // namespace

MofParser::MofParser(std::string_view text, std::string file) : lexer_(text, std::move(file)) {
    ahead_ = lexer_.next();
}

std::optional<MofDeclaration> MofParser::next() {
    if (ahead_.kind == MofTokenKind::end) {
        return std::nullopt;
    }
    if (ahead_.isSymbol('#')) {
        return pragma();
    }
    if (ahead_.isWord("qualifier")) {
        return qualifierType();
    }
    auto qualifiers = qualifierList();
    if (ahead_.isWord("class")) {
        return classDeclaration(std::move(qualifiers));
    }
    if (ahead_.isWord("instance")) {
        fail(ahead_.position, "instances cannot be declared here, only classes");
    }
    failExpecting("a class, a qualifier type or a pragma");
}

MofToken MofParser::take() {
    return std::exchange(ahead_, lexer_.next());
}

bool MofParser::takeSymbol(char symbol) {
    if (!ahead_.isSymbol(symbol)) {
        return false;
    }
    take();
    return true;
}

void MofParser::expectSymbol(char symbol, std::string_view after) {
    if (!takeSymbol(symbol)) {
        failExpecting(std::string("\"") + symbol + "\" after " + std::string(after));
    }
}

MofToken MofParser::expectName(std::string_view what) {
    if (ahead_.kind != MofTokenKind::identifier) {
        failExpecting(what);
    }
    return take();
}

void MofParser::failExpecting(std::string_view what) const {
    fail(ahead_.position, "expected " + std::string(what) + ", found " + shown(ahead_));
}

void MofParser::fail(MofPosition position, const std::string& reason) const {
    throw MofError(lexer_.file(), position, reason);
}

MofPragma MofParser::pragma() {
    take();
    if (!ahead_.isWord("pragma")) {
        failExpecting(R"("pragma" after "#")");
    }
    take();
    MofPragma result;
    result.name = expectName("the name of a pragma").text;
    expectSymbol('(', "the name of a pragma");
    result.position = ahead_.position;
    if (ahead_.kind != MofTokenKind::string) {
        failExpecting("a string");
    }
    result.value = std::get<std::string>(literal().value);
    expectSymbol(')', "the value of a pragma");
    return result;
}

MofQualifierType MofParser::qualifierType() {
    take();
    MofQualifierType result;
    const MofToken name = expectName("the name of a qualifier");
    result.name = name.text;
    result.position = name.position;
    expectSymbol(':', "the name of a qualifier");
    result.type = dataType("the type of a qualifier");
    MofElement form;
    arrayForm(form);
    result.isArray = form.isArray;
    if (takeSymbol('=')) {
        result.defaultValue = initializer();
    }
    expectSymbol(',', "the value of a qualifier type");
    if (!ahead_.isWord("scope")) {
        failExpecting("\"Scope\"");
    }
    take();
    result.scopes = scopes();
    if (takeSymbol(',')) {
        if (!ahead_.isWord("flavor")) {
            failExpecting("\"Flavor\"");
        }
        take();
        expectSymbol('(', "\"Flavor\"");
        do {
            flavor(result.flavors);
        } while (takeSymbol(','));
        expectSymbol(')', "the flavors");
    }
    expectSymbol(';', "a qualifier type");
    return result;
}

std::vector<MofScope> MofParser::scopes() {
    std::vector<MofScope> result;
    expectSymbol('(', "\"Scope\"");
    do {
        const MofToken word = expectName("a scope");
        const auto* const found =
            std::find_if(scopeNames.begin(), scopeNames.end(),
                         [&word](const ScopeName& each) { return word.isWord(each.name); });
        if (found == scopeNames.end()) {
            fail(word.position, shown(word) + " is not a scope");
        }
        result.push_back(found->scope);
    } while (takeSymbol(','));
    expectSymbol(')', "the scopes");
    return result;
}

MofClass MofParser::classDeclaration(std::vector<MofQualifier> qualifiers) {
    take();
    MofClass result;
    result.qualifiers = std::move(qualifiers);
    const MofToken name = expectName("the name of a class");
    result.name = name.text;
    result.position = name.position;
    if (ahead_.isWord("as")) {
        // An alias names the class for instance declarations, which are not read.
        take();
        expectSymbol('$', "\"as\"");
        expectName("an alias");
    }
    if (takeSymbol(':')) {
        const MofToken superclass = expectName("the name of the superclass");
        result.superclass = superclass.text;
        result.superclassPosition = superclass.position;
    }
    expectSymbol('{', "the head of a class");
    while (!takeSymbol('}')) {
        feature(result);
    }
    expectSymbol(';', "a class");
    return result;
}

void MofParser::feature(MofClass& declaration) {
    auto qualifiers = qualifierList();
    MofType featureType = type();
    const MofToken name = expectName("the name of a property or method");
    if (ahead_.isSymbol('(')) {
        declaration.methods.push_back(method(std::move(qualifiers), std::move(featureType), name));
        return;
    }
    MofElement property = element(std::move(qualifiers), std::move(featureType), name);
    if (takeSymbol('=')) {
        property.defaultValue = initializer();
    }
    expectSymbol(';', "a property");
    declaration.properties.push_back(std::move(property));
}

MofMethod MofParser::method(std::vector<MofQualifier> qualifiers, MofType type,
                            const MofToken& name) {
    MofMethod result{
        std::move(qualifiers), std::move(type), std::string(name.text), name.position, {}};
    expectSymbol('(', "the name of a method");
    while (!ahead_.isSymbol(')')) {
        if (!result.parameters.empty()) {
            expectSymbol(',', "a parameter");
        }
        auto parameterQualifiers = qualifierList();
        MofType parameterType = this->type();
        const MofToken parameterName = expectName("the name of a parameter");
        result.parameters.push_back(
            element(std::move(parameterQualifiers), std::move(parameterType), parameterName));
    }
    take();
    expectSymbol(';', "a method");
    return result;
}

MofElement MofParser::element(std::vector<MofQualifier> qualifiers, MofType type,
                              const MofToken& name) {
    MofElement result;
    result.qualifiers = std::move(qualifiers);
    result.type = std::move(type);
    result.name = name.text;
    result.position = name.position;
    arrayForm(result);
    return result;
}

void MofParser::arrayForm(MofElement& result) {
    if (!takeSymbol('[')) {
        return;
    }
    result.isArray = true;
    if (ahead_.kind == MofTokenKind::integer) {
        const MofToken token = take();
        const auto size = std::get<MofInteger>(token.value);
        if (size.negative || size.magnitude == 0 ||
            size.magnitude > std::numeric_limits<std::uint32_t>::max()) {
            fail(token.position, shown(token) + " is not a size of an array");
        }
        result.arraySize = static_cast<std::uint32_t>(size.magnitude);
    }
    expectSymbol(']', "the size of an array");
}

MofType MofParser::type() {
    const MofToken name = expectName("a type");
    if (const auto known = mofType(name.text)) {
        return {*known, {}, name.position};
    }
    if (!ahead_.isWord("ref")) {
        fail(name.position, shown(name) + " is not a type");
    }
    take();
    return {Type::reference, std::string(name.text), name.position};
}

Type MofParser::dataType(std::string_view what) {
    const MofToken name = expectName(what);
    const auto known = mofType(name.text);
    if (!known) {
        fail(name.position, shown(name) + " is not a type");
    }
    return known.value_or(Type::string);
}

std::vector<MofQualifier> MofParser::qualifierList() {
    std::vector<MofQualifier> result;
    if (!takeSymbol('[')) {
        return result;
    }
    do {
        result.push_back(qualifier());
    } while (takeSymbol(','));
    expectSymbol(']', "the qualifiers");
    return result;
}

MofQualifier MofParser::qualifier() {
    const MofToken name = expectName("the name of a qualifier");
    MofQualifier result{std::string(name.text), {}, {}, name.position};
    if (ahead_.isSymbol('{')) {
        result.value = initializer();
    } else if (ahead_.isSymbol('(')) {
        const MofPosition position = take().position;
        result.value = MofInitializer{false, {literal()}, position};
        expectSymbol(')', "the value of a qualifier");
    }
    if (takeSymbol(':')) {
        do {
            flavor(result.flavors);
        } while (ahead_.kind == MofTokenKind::identifier);
    }
    return result;
}

void MofParser::flavor(MofFlavors& flavors) {
    struct Meaning {
        std::string_view name;
        std::optional<bool> MofFlavors::*member;
        bool value;
    };
    static constexpr std::array<Meaning, 5> meanings{{
        {"EnableOverride", &MofFlavors::overridable, true},
        {"DisableOverride", &MofFlavors::overridable, false},
        {"ToSubclass", &MofFlavors::toSubclass, true},
        {"Restricted", &MofFlavors::toSubclass, false},
        {"Translatable", &MofFlavors::translatable, true},
    }};
    const MofToken word = expectName("a flavor");
    for (const Meaning& meaning : meanings) {
        if (word.isWord(meaning.name)) {
            auto& flavor = flavors.*meaning.member;
            if (flavor.value_or(meaning.value) != meaning.value) {
                fail(word.position, shown(word) + " contradicts another flavor");
            }
            flavor = meaning.value;
            return;
        }
    }
    fail(word.position, shown(word) + " is not a flavor");
}

MofInitializer MofParser::initializer() {
    MofInitializer result;
    result.position = ahead_.position;
    if (!takeSymbol('{')) {
        result.elements.push_back(literal());
        return result;
    }
    result.isArray = true;
    while (!ahead_.isSymbol('}')) {
        if (!result.elements.empty()) {
            expectSymbol(',', "a value");
        }
        result.elements.push_back(literal());
    }
    take();
    return result;
}

MofLiteral MofParser::literal() {
    MofLiteral result;
    result.position = ahead_.position;
    if (ahead_.isWord("null")) {
        take();
    } else if (ahead_.isWord("true") || ahead_.isWord("false")) {
        result.value = take().isWord("true");
    } else if (ahead_.kind == MofTokenKind::string) {
        auto text = std::get<std::string>(take().value);
        // Adjacent literals are one string.
        while (ahead_.kind == MofTokenKind::string) {
            text += std::get<std::string>(take().value);
        }
        result.value = std::move(text);
    } else if (ahead_.kind == MofTokenKind::character || ahead_.kind == MofTokenKind::integer ||
               ahead_.kind == MofTokenKind::real) {
        result.value = take().value;
    } else {
        failExpecting("a value");
    }
    return result;
}

}  // namespace cimom
