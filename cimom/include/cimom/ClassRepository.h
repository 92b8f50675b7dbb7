#pragma once

#include <filesystem>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "cimom/Forward.h"

namespace cimom {

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
    /// From here on, a declaration of a class or a qualifier that is known now is passed over:
    /// the one that was read stands, for instance that of a full schema beside which a reduced
    /// one is read.
    void keepDeclared() noexcept;
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

    /// Absent when there is no such type.
    [[nodiscard]] std::optional<QualifierType> findQualifierType(std::string_view name) const;
    /// All types in the order of their names.
    [[nodiscard]] std::vector<QualifierType> qualifierTypes() const;

    /// All classes in the order of loading.
    [[nodiscard]] std::vector<const ClassDeclaration*> classes() const;

  private:
    class Implementation;
    std::unique_ptr<Implementation> implementation_;
};

}  // namespace cimom
