#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "cimom/ClassDeclaration.h"
#include "cimom/Names.h"
#include "mof/MofSyntax.h"

namespace cimom {

/// The qualifier types declared so far; they say which qualifiers may be written,
/// where, with which values, and whether these pass to subclasses.
class QualifierTypes {
  public:
    /// The same declaration once more changes nothing. Throws MofError for a type that is
    /// declared twice in different ways, or whose default value is not of its type.
    void add(const MofQualifierType& declaration, const std::string& file);

    /// Types that are declared now stand: further declarations of them are passed over.
    void keepDeclared() noexcept;

    /// Absent when none of the name is declared.
    [[nodiscard]] std::optional<QualifierType> find(std::string_view name) const;
    /// In the order of their names.
    [[nodiscard]] std::vector<QualifierType> all() const;

    /// The qualifiers written at an element of this scope, with the flavors that
    /// hold for them. Throws MofError for one that is unknown, stands in the wrong
    /// place or twice, or has a value of another type.
    [[nodiscard]] std::vector<Qualifier> resolve(const std::vector<MofQualifier>& written,
                                                 MofScope scope, const std::string& file) const;

  private:
    struct Entry {
        Qualifier prototype;  ///< its value is the default
        std::vector<MofScope> scopes;
        bool stands = false;
    };

    [[nodiscard]] static QualifierType typeOf(const Entry& entry);
    [[nodiscard]] static bool isSame(const Entry& a, const Entry& b);
    [[nodiscard]] Qualifier resolveOne(const MofQualifier& written, MofScope scope,
                                       const std::string& file) const;

    std::unordered_map<std::string, Entry, NameHash, NameEqual> entries_;
};

/// What an element has when it inherits `inherited`: its own qualifiers, and those
/// of the other that pass to subclasses. `own` are the resolved qualifiers of
/// `written`, in the same order. Throws MofError for a change of a qualifier that
/// cannot be overridden.
[[nodiscard]] std::vector<Qualifier> inheritQualifiers(std::vector<Qualifier> own,
                                                       const std::vector<MofQualifier>& written,
                                                       const std::vector<Qualifier>& inherited,
                                                       const std::string& file);

}  // namespace cimom
