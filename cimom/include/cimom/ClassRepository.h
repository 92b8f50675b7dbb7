#pragma once

#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "cimom/Cim.h"

namespace cimom {

struct Qualifier {
    std::string name;
    Value value;
    bool overridable = true;  ///< flavor EnableOverride
    bool toSubclass = true;   ///< flavor ToSubclass, else Restricted
    bool translatable = false;

    bool operator==(const Qualifier&) const = default;
};

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

/// A class with everything that it inherits resolved.
struct ClassDeclaration {
    std::string name;
    std::string superclass;  ///< empty for a root
    std::vector<Qualifier> qualifiers;
    std::vector<PropertyDeclaration> properties;  ///< inherited first, root downwards

    [[nodiscard]] const PropertyDeclaration* property(std::string_view propertyName) const noexcept;
    [[nodiscard]] const Qualifier* qualifier(std::string_view qualifierName) const noexcept;
    [[nodiscard]] bool isAssociation() const noexcept;
};

/// A MOF file that cannot be used. what() is "FILE:LINE:COLUMN: REASON"; line
/// and column count from 1, columns in bytes.
class MofError : public std::runtime_error {
  public:
    MofError(std::string file, std::size_t line, std::size_t column, const std::string& reason);

    const std::string file;
    const std::size_t line;
    const std::size_t column;
};

/// The classes that the object manager knows. Filled once, then only read, from
/// any thread.
///
/// Methods are read and their qualifiers checked, and are then left out: nothing
/// here calls a method.
class ClassRepository {
  public:
    ClassRepository();
    ~ClassRepository();
    ClassRepository(ClassRepository&&) noexcept;
    ClassRepository& operator=(ClassRepository&&) noexcept;
    ClassRepository(const ClassRepository&) = delete;
    ClassRepository& operator=(const ClassRepository&) = delete;

    /// Reads MOF files in the order given (qualifier types and parents first).
    /// Throws MofError; the repository then holds what came before the error.
    void load(const std::filesystem::path& file);
    /// Reads every *.mof file of a directory, in the order of their names.
    void loadDirectory(const std::filesystem::path& directory);
    /// Reads MOF text; `file` is the name that errors give, and what
    /// "#pragma include" is relative to.
    void loadText(std::string_view text, const std::string& file);
    /// Checks what only the whole shows: every reference names a known class.
    /// Throws MofError at the first that does not. (A class may be referenced
    /// before it is declared; a reference to a class that is known already is
    /// checked at once.)
    void complete() const;

    /// Null when there is no such class. Names compare without regard to case.
    [[nodiscard]] const ClassDeclaration* find(std::string_view className) const;

    /// True when the class is the ancestor or derives from it. False for unknown classes.
    [[nodiscard]] bool isA(std::string_view className, std::string_view ancestor) const;

    /// The class and all classes below it, parents before children, siblings in
    /// the order of loading. Empty for an unknown class.
    [[nodiscard]] std::vector<const ClassDeclaration*> withSubclasses(
        std::string_view className) const;

    /// All classes in the order of loading.
    [[nodiscard]] std::vector<const ClassDeclaration*> classes() const;

  private:
    class Implementation;
    std::unique_ptr<Implementation> implementation_;
};

}  // namespace cimom
