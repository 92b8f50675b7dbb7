#include "mof/QualifierTypes.h"

#include <algorithm>
#include <iterator>
#include <utility>

#include "cimom/MofError.h"
#include "mof/MofValue.h"

namespace cimom {

namespace {

std::string_view scopeName(MofScope scope) {
    switch (scope) {
        case MofScope::schema:
            return "schema";
        case MofScope::classes:
            return "class";
        case MofScope::association:
            return "association";
        case MofScope::indication:
            return "indication";
        case MofScope::qualifier:
            return "qualifier";
        case MofScope::property:
            return "property";
        case MofScope::reference:
            return "reference";
        case MofScope::method:
            return "method";
        case MofScope::parameter:
            return "parameter";
        default:
            return "any";
    }
}

std::string_view shown(MofScope scope) {
    switch (scope) {
        case MofScope::classes:
            return "a class";
        case MofScope::association:
            return "an association";
        case MofScope::indication:
            return "an indication";
        case MofScope::property:
            return "a property";
        case MofScope::reference:
            return "a reference";
        case MofScope::method:
            return "a method";
        case MofScope::parameter:
            return "a parameter";
        default:
            return "this element";
    }
}

}  // namespace

void QualifierTypes::add(const MofQualifierType& declaration, const std::string& file) {
    Entry entry;
    entry.prototype.name = declaration.name;
    entry.prototype.value =
        declaration.defaultValue
            ? typedValue(*declaration.defaultValue, declaration.type, declaration.isArray, file)
            : Value::null(declaration.type, declaration.isArray);
    // DSP0004, 5.6.1.2: what is not said is EnableOverride and ToSubclass.
    entry.prototype.overridable = declaration.flavors.overridable.value_or(true);
    entry.prototype.toSubclass = declaration.flavors.toSubclass.value_or(true);
    entry.prototype.translatable = declaration.flavors.translatable.value_or(false);
    entry.scopes = declaration.scopes;
    const auto known = entries_.find(std::string_view(declaration.name));
    if (known == entries_.end()) {
        entries_.emplace(declaration.name, std::move(entry));
    } else if (!known->second.stands && !isSame(known->second, entry)) {
        throw MofError(file, declaration.position,
                       "qualifier " + declaration.name + " is declared twice, in different ways");
    }
}

bool QualifierTypes::isSame(const Entry& a, const Entry& b) {
    Qualifier renamed = b.prototype;
    renamed.name = a.prototype.name;  // in any case of its letters
    return a.prototype == renamed && std::ranges::is_permutation(a.scopes, b.scopes);
}

void QualifierTypes::keepDeclared() noexcept {
    for (auto& [name, entry] : entries_) {
        entry.stands = true;
    }
}

QualifierType QualifierTypes::typeOf(const Entry& entry) {
    QualifierType type{entry.prototype, {}};
    std::ranges::transform(entry.scopes, std::back_inserter(type.scopes), scopeName);
    return type;
}

std::optional<QualifierType> QualifierTypes::find(std::string_view name) const {
    const auto found = entries_.find(name);
    return found == entries_.end() ? std::nullopt : std::optional(typeOf(found->second));
}

std::vector<QualifierType> QualifierTypes::all() const {
    std::vector<QualifierType> types;
    types.reserve(entries_.size());
    for (const auto& [name, entry] : entries_) {
        types.push_back(typeOf(entry));
    }
    std::ranges::sort(types, {}, [](const QualifierType& type) -> const std::string& {
        return type.prototype.name;
    });
    return types;
}

std::vector<Qualifier> QualifierTypes::resolve(const std::vector<MofQualifier>& written,
                                               MofScope scope, const std::string& file) const {
    std::vector<Qualifier> result;
    result.reserve(written.size());
    for (const MofQualifier& qualifier : written) {
        if (findQualifier(result, qualifier.name) != nullptr) {
            throw MofError(file, qualifier.position,
                           "qualifier " + qualifier.name + " is given twice");
        }
        result.push_back(resolveOne(qualifier, scope, file));
    }
    return result;
}

Qualifier QualifierTypes::resolveOne(const MofQualifier& written, MofScope scope,
                                     const std::string& file) const {
    const auto found = entries_.find(std::string_view(written.name));
    if (found == entries_.end()) {
        throw MofError(file, written.position, "qualifier " + written.name + " is not declared");
    }
    const Qualifier& prototype = found->second.prototype;
    const std::vector<MofScope>& scopes = found->second.scopes;
    const bool allowed = std::any_of(scopes.begin(), scopes.end(), [scope](MofScope each) {
        return each == scope || each == MofScope::any;
    });
    if (!allowed) {
        throw MofError(
            file, written.position,
            "qualifier " + written.name + " cannot stand at " + std::string(shown(scope)));
    }
    Qualifier result = prototype;
    const Type type = prototype.value.type;
    const bool isArray = prototype.value.isArray;
    if (written.value) {
        result.value = typedValue(*written.value, type, isArray, file);
    } else {
        // DSP0004, 4.5.4: a name alone means TRUE, and null for other types.
        result.value = type == Type::boolean && !isArray ? Value{Type::boolean, false, Scalar(true)}
                                                         : Value::null(type, isArray);
    }
    if (!prototype.overridable && written.flavors.overridable.value_or(false)) {
        throw MofError(file, written.position,
                       "qualifier " + written.name + " cannot be made overridable");
    }
    result.overridable = written.flavors.overridable.value_or(prototype.overridable);
    result.toSubclass = written.flavors.toSubclass.value_or(prototype.toSubclass);
    result.translatable = written.flavors.translatable.value_or(prototype.translatable);
    return result;
}

std::vector<Qualifier> inheritQualifiers(std::vector<Qualifier> own,
                                         const std::vector<MofQualifier>& written,
                                         const std::vector<Qualifier>& inherited,
                                         const std::string& file) {
    for (const Qualifier& above : inherited) {
        if (!above.toSubclass) {
            continue;
        }
        const auto here = std::find_if(own.begin(), own.end(), [&above](const Qualifier& each) {
            return sameName(each.name, above.name);
        });
        if (here == own.end()) {
            own.push_back(above);
        } else if (!above.overridable) {
            if (here->value != above.value) {
                // Qualifiers appended above never repeat a name, so `here` is a written one.
                const auto index = static_cast<std::size_t>(here - own.begin());
                throw MofError(file, written.at(index).position,
                               "qualifier " + above.name + " cannot be changed in a subclass");
            }
            here->overridable = false;
        }
    }
    return own;
}

}  // namespace cimom
