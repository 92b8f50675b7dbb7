#pragma once

#include <functional>
#include <string_view>
#include <utility>

#include "cimom/ClassRepository.h"

namespace cimdhcp {

/// Finds the declaration of a class, wherever classes come from: a repository in this
/// process, or a server that is asked when a class is first needed. Borrows them.
class ClassLookup {
  public:
    using Find = std::function<const cimom::ClassDeclaration*(std::string_view)>;

    explicit ClassLookup(Find find) : find_(std::move(find)) {}
    // A repository is the plainest lookup there is.
    // NOLINTNEXTLINE(google-explicit-constructor,hicpp-explicit-conversions)
    ClassLookup(const cimom::ClassRepository& repository)
        : find_([&repository](std::string_view name) { return repository.find(name); }) {}

    /// Null when the class is not known. The declaration lives as long as what the
    /// lookup borrows. Throws Failure when a server cannot be asked.
    [[nodiscard]] const cimom::ClassDeclaration* find(std::string_view className) const {
        return find_(className);
    }

  private:
    Find find_;
};

}  // namespace cimdhcp
