#include "mof/ClassResolver.h"

#include <algorithm>
#include <string_view>
#include <unordered_set>
#include <utility>

#include "cimom/Names.h"
#include "mof/MofValue.h"

namespace cimom {

namespace {

class Resolver {
  public:
    Resolver(const MofClass& written, const ClassDeclaration* superclass,
             const QualifierTypes& types, const std::string& file)
        : written_(written), superclass_(superclass), types_(types), file_(file) {}

    ResolvedClass resolve() {
        ClassDeclaration& declaration = result_.declaration;
        declaration.name = written_.name;
        if (superclass_ != nullptr) {
            declaration.superclass = superclass_->name;
            inheritProperties();
        }
        declaration.qualifiers =
            qualifiersOf(written_.qualifiers, classScope(),
                         superclass_ == nullptr ? nullptr : &superclass_->qualifiers);
        for (const MofElement& property : written_.properties) {
            addProperty(property);
        }
        checkMethods();
        checkReferences();
        return std::move(result_);
    }

  private:
    [[noreturn]] void fail(MofPosition position, const std::string& reason) const {
        throw MofError(file_, position, reason);
    }

    [[nodiscard]] std::vector<Qualifier> qualifiersOf(const std::vector<MofQualifier>& written,
                                                      MofScope scope,
                                                      const std::vector<Qualifier>* inherited) {
        auto own = types_.resolve(written, scope, file_);
        return inherited == nullptr ? own
                                    : inheritQualifiers(std::move(own), written, *inherited, file_);
    }

    /// The kind of a class decides which qualifiers it may have, so it is read from
    /// what is written, before the qualifiers are resolved.
    [[nodiscard]] MofScope classScope() const {
        const auto has = [this](std::string_view name) {
            const bool here = std::any_of(written_.qualifiers.begin(), written_.qualifiers.end(),
                                          [name](const MofQualifier& each) {
                                              return sameName(each.name, name) && saysTrue(each);
                                          });
            return here || (superclass_ != nullptr && isTrue(superclass_->qualifier(name)));
        };
        return has("Association")  ? MofScope::association
               : has("Indication") ? MofScope::indication
                                   : MofScope::classes;
    }

    static bool saysTrue(const MofQualifier& qualifier) {
        return !qualifier.value || (!qualifier.value->isArray &&
                                    qualifier.value->elements.front().value == MofConstant(true));
    }

    void inheritProperties() {
        result_.declaration.properties = superclass_->properties;
        for (PropertyDeclaration& property : result_.declaration.properties) {
            property.propagated = true;
            std::erase_if(property.qualifiers,
                          [](const Qualifier& each) { return !each.toSubclass; });
        }
    }

    void addProperty(const MofElement& written) {
        if (!names_.emplace(written.name).second) {
            fail(written.position, "property " + written.name + " is declared twice");
        }
        const bool isReference = written.type.type == Type::reference;
        if (isReference && written.isArray) {
            fail(written.position, "reference " + written.name + " cannot be an array");
        }
        const auto scope = isReference ? MofScope::reference : MofScope::property;
        const PropertyDeclaration* const above =
            superclass_ == nullptr ? nullptr : superclass_->property(written.name);

        PropertyDeclaration property;
        property.name = written.name;
        property.type = written.type.type;
        property.isArray = written.isArray;
        property.arraySize = written.arraySize;
        property.referenceClass = written.type.referenceClass;
        property.classOrigin = above == nullptr ? written_.name : above->classOrigin;
        property.qualifiers = qualifiersOf(written.qualifiers, scope,
                                           above == nullptr ? nullptr : &above->qualifiers);
        property.defaultValue = Value::null(property.type, property.isArray);
        checkOverride(written, property, above);
        if (written.defaultValue) {
            property.defaultValue =
                typedValue(*written.defaultValue, property.type, property.isArray, file_);
        } else if (above != nullptr) {
            property.defaultValue = above->defaultValue;
        }
        checkKey(written, property, above);
        if (isReference) {
            result_.references.push_back({file_, written.type.position, property.referenceClass,
                                          above == nullptr ? "" : above->referenceClass});
        }
        place(std::move(property));
    }

    void checkOverride(const MofElement& written, const PropertyDeclaration& property,
                       const PropertyDeclaration* above) const {
        const auto override =
            std::find_if(written.qualifiers.begin(), written.qualifiers.end(),
                         [](const MofQualifier& each) { return sameName(each.name, "Override"); });
        if (override == written.qualifiers.end()) {
            if (above != nullptr) {
                fail(written.position, "property " + written.name + " hides that of " +
                                           above->classOrigin + ": Override is missing");
            }
            return;
        }
        const Scalar* const named = property.qualifier("Override")->value.scalar();
        const auto* const name = named == nullptr ? nullptr : std::get_if<std::string>(named);
        if (name == nullptr || !sameName(*name, written.name)) {
            fail(override->position, "Override must name the property " + written.name);
        }
        if (above == nullptr) {
            fail(override->position, "Override names " + *name + ", which no superclass declares");
        }
        if (above->type != property.type || above->isArray != property.isArray) {
            fail(written.type.position, "property " + written.name + " is " + shownType(property) +
                                            " here, but " + shownType(*above) + " in " +
                                            above->classOrigin);
        }
    }

    static std::string shownType(const PropertyDeclaration& property) {
        return std::string(typeName(property.type)) + (property.isArray ? "[]" : "");
    }

    void checkKey(const MofElement& written, const PropertyDeclaration& property,
                  const PropertyDeclaration* above) const {
        if (!property.isKey() || (above != nullptr && above->isKey()) || superclass_ == nullptr) {
            return;
        }
        const auto& inherited = superclass_->properties;
        if (std::any_of(inherited.begin(), inherited.end(),
                        [](const PropertyDeclaration& each) { return each.isKey(); })) {
            fail(written.position,
                 "key " + written.name + " cannot be added to the keys of " + superclass_->name);
        }
    }

    /// An override takes the place of what it overrides.
    void place(PropertyDeclaration property) {
        auto& properties = result_.declaration.properties;
        const auto there = std::find_if(
            properties.begin(), properties.end(),
            [&](const PropertyDeclaration& each) { return sameName(each.name, property.name); });
        if (there == properties.end()) {
            properties.push_back(std::move(property));
        } else {
            *there = std::move(property);
        }
    }

    void checkMethods() {
        std::unordered_set<std::string_view, NameHash, NameEqual> methods;
        for (const MofMethod& method : written_.methods) {
            if (!methods.insert(method.name).second) {
                fail(method.position, "method " + method.name + " is declared twice");
            }
            static_cast<void>(types_.resolve(method.qualifiers, MofScope::method, file_));
            for (const MofElement& parameter : method.parameters) {
                static_cast<void>(types_.resolve(parameter.qualifiers, MofScope::parameter, file_));
            }
        }
    }

    void checkReferences() const {
        const ClassDeclaration& declaration = result_.declaration;
        const auto count =
            std::count_if(declaration.properties.begin(), declaration.properties.end(),
                          [](const auto& each) { return each.type == Type::reference; });
        if (!declaration.isAssociation()) {
            if (!result_.references.empty()) {
                fail(result_.references.front().position,
                     "a reference can stand in an association only");
            }
        } else if (count < 2) {
            fail(written_.position, "association " + written_.name +
                                        " needs two references at least, and has " +
                                        std::to_string(count));
        }
    }

    const MofClass& written_;
    const ClassDeclaration* superclass_;
    const QualifierTypes& types_;
    const std::string& file_;
    ResolvedClass result_;
    std::unordered_set<std::string_view, NameHash, NameEqual> names_;
};

}  // namespace

ResolvedClass resolveClass(const MofClass& written, const ClassDeclaration* superclass,
                           const QualifierTypes& types, const std::string& file) {
    return Resolver(written, superclass, types, file).resolve();
}

}  // namespace cimom
