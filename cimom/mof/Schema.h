#pragma once

#include <string_view>
#include <unordered_map>
#include <vector>

#include "cimom/ClassRepository.h"
#include "cimom/Names.h"
#include "model/NameKey.h"

namespace cimom::broker {

template <typename T>
using NameMap = std::unordered_map<std::string_view, T, NameHash, NameEqual>;

/// A class with its properties by name.
class ClassIndex {
  public:
    explicit ClassIndex(const ClassDeclaration& declaration);

    [[nodiscard]] const ClassDeclaration& declaration() const noexcept { return *declaration_; }
    /// Null when the class has no such property.
    [[nodiscard]] const PropertyDeclaration* property(const NameKey& name) const noexcept {
        for (std::size_t at = name.hash();; ++at) {
            const Slot& slot = slots_[at & (slots_.size() - 1)];
            if (slot.property == nullptr || name.is(slot.property->name, slot.hash)) {
                return slot.property;
            }
        }
    }
    [[nodiscard]] const PropertyDeclaration* property(std::string_view name) const noexcept {
        return property(NameKey(name));
    }
    /// The key properties, in the order of the declaration.
    [[nodiscard]] const std::vector<const PropertyDeclaration*>& keys() const noexcept {
        return keys_;
    }

  private:
    struct Slot {
        std::uint64_t hash = 0;
        const PropertyDeclaration* property = nullptr;
    };

    const ClassDeclaration* declaration_;
    /// Open addressing; the size is a power of two and leaves slots empty.
    std::vector<Slot> slots_;
    std::vector<const PropertyDeclaration*> keys_;
};

/// A class repository with quick look-up, for the checks that each property
/// set by a provider needs. Only read after construction, from any thread.
class Schema {
  public:
    /// The repository must stay, unchanged, as long as the schema.
    explicit Schema(const ClassRepository& repository);

    [[nodiscard]] const ClassRepository& repository() const noexcept { return *repository_; }
    /// Null when there is no such class.
    [[nodiscard]] const ClassIndex* find(std::string_view className) const {
        const auto found = classes_.find(className);
        return found == classes_.end() ? nullptr : &found->second;
    }

  private:
    const ClassRepository* repository_;
    NameMap<ClassIndex> classes_;
};

}  // namespace cimom::broker
