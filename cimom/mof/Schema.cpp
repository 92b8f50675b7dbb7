#include "mof/Schema.h"

#include <bit>

namespace cimom::broker {

ClassIndex::ClassIndex(const ClassDeclaration& declaration)
    : declaration_(&declaration), slots_(std::bit_ceil(declaration.properties.size() * 2 + 1)) {
    for (const PropertyDeclaration& property : declaration.properties) {
        const std::uint64_t hash = NameKey(property.name).hash();
        std::size_t at = hash;
        while (slots_[at & (slots_.size() - 1)].property != nullptr) {
            ++at;
        }
        slots_[at & (slots_.size() - 1)] = {hash, &property};
        if (property.isKey()) {
            keys_.push_back(&property);
        }
    }
}

Schema::Schema(const ClassRepository& repository) : repository_(&repository) {
    const auto declarations = repository.classes();
    classes_.reserve(declarations.size());
    for (const ClassDeclaration* const declaration : declarations) {
        classes_.emplace(declaration->name, ClassIndex(*declaration));
    }
}

}  // namespace cimom::broker
