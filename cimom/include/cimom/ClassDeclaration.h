#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "cimom/Value.h"

namespace cimom {

class NameKey;

struct Qualifier {
    std::string name;
    Value value;
    bool overridable = true;  ///< flavor EnableOverride
    bool toSubclass = true;   ///< flavor ToSubclass, else Restricted
    bool translatable = false;

    bool operator==(const Qualifier&) const = default;
};

/// What a qualifier of that name means, wherever it stands.
struct QualifierType {
    Qualifier prototype;  ///< its value is the default
    /// Where it may stand, as MOF has it: "class", "association", "indication", "property",
    /// "reference", "method", "parameter", "any" and so on.
    std::vector<std::string_view> scopes;

    [[nodiscard]] bool mayStandAt(std::string_view scope) const noexcept;
};

/// Null when there is none of this name.
[[nodiscard]] const Qualifier* findQualifier(const std::vector<Qualifier>& qualifiers,
                                             std::string_view name) noexcept;
/// False for null, too.
[[nodiscard]] bool isTrue(const Qualifier* qualifier) noexcept;

struct PropertyDeclaration {
    std::string name;
    Type type = Type::string;
    bool isArray = false;
    std::optional<std::uint32_t> arraySize;
    std::string referenceClass;         ///< for references, else empty
    Value defaultValue;                 ///< null when none is declared; passed to overrides
    std::vector<Qualifier> qualifiers;  ///< effective ones: declared and inherited
    std::string classOrigin;            ///< the class that introduced the property
    bool propagated = false;            ///< not declared in this class itself

    [[nodiscard]] const Qualifier* qualifier(std::string_view qualifierName) const noexcept;
    [[nodiscard]] bool isKey() const noexcept;
};

/// Where the properties of a class stand, by name: each property that a provider sets
/// is looked up. Positions, so that a class can be copied with its index. The index of
/// a class that the class repository did not make is empty.
class PropertyIndex {
  public:
    PropertyIndex() = default;
    explicit PropertyIndex(const std::vector<PropertyDeclaration>& properties);

    /// Null when none of the properties, which are those that were indexed, has the name.
    [[nodiscard]] const PropertyDeclaration* find(
        const std::vector<PropertyDeclaration>& properties, const NameKey& name) const noexcept;
    /// The positions of the key properties, in the order of the declaration.
    [[nodiscard]] const std::vector<std::size_t>& keys() const noexcept { return keys_; }

  private:
    struct Slot {
        std::uint64_t hash = 0;
        std::size_t number = 0;  ///< of the property, from 1; 0: the slot is empty
    };

    /// Open addressing; the size is a power of two and leaves slots empty.
    std::vector<Slot> slots_;
    std::vector<std::size_t> keys_;
};

/// A class with everything that it inherits resolved.
struct ClassDeclaration {
    std::string name;
    std::string superclass;  ///< empty for a root
    std::vector<Qualifier> qualifiers;
    std::vector<PropertyDeclaration> properties;  ///< inherited first, root downwards
    PropertyIndex index = {};                     ///< of the properties, or empty

    /// Null when the class has no such property.
    [[nodiscard]] const PropertyDeclaration* property(std::string_view propertyName) const noexcept;
    [[nodiscard]] const PropertyDeclaration* property(const NameKey& propertyName) const noexcept;
    [[nodiscard]] const Qualifier* qualifier(std::string_view qualifierName) const noexcept;
    [[nodiscard]] bool isAssociation() const noexcept;
};

}  // namespace cimom
