#include "cimom/ClassDeclaration.h"

#include <algorithm>
#include <bit>

#include "cimom/Names.h"
#include "model/NameKey.h"

namespace cimom {

bool QualifierType::mayStandAt(std::string_view scope) const noexcept {
    return std::ranges::any_of(scopes, [scope](std::string_view each) {
        return sameName(each, scope) || sameName(each, "any");
    });
}

const Qualifier* findQualifier(const std::vector<Qualifier>& qualifiers,
                               std::string_view name) noexcept {
    const auto found =
        std::find_if(qualifiers.begin(), qualifiers.end(),
                     [name](const Qualifier& each) { return sameName(each.name, name); });
    return found == qualifiers.end() ? nullptr : &*found;
}

bool isTrue(const Qualifier* qualifier) noexcept {
    if (qualifier == nullptr || qualifier->value.scalar() == nullptr) {
        return false;
    }
    const bool* const truth = std::get_if<bool>(qualifier->value.scalar());
    return truth != nullptr && *truth;
}

const Qualifier* PropertyDeclaration::qualifier(std::string_view qualifierName) const noexcept {
    return findQualifier(qualifiers, qualifierName);
}

bool PropertyDeclaration::isKey() const noexcept {
    return isTrue(qualifier("Key"));
}

PropertyIndex::PropertyIndex(const std::vector<PropertyDeclaration>& properties)
    : slots_(std::bit_ceil(properties.size() * 2 + 1)) {
    for (std::size_t position = 0; position < properties.size(); ++position) {
        const PropertyDeclaration& property = properties[position];
        const std::uint64_t hash = NameKey(property.name).hash();
        auto at = static_cast<std::size_t>(hash);
        while (slots_[at & (slots_.size() - 1)].number != 0) {
            ++at;
        }
        slots_[at & (slots_.size() - 1)] = {hash, position + 1};
        if (property.isKey()) {
            keys_.push_back(position);
        }
    }
}

const PropertyDeclaration* PropertyIndex::find(const std::vector<PropertyDeclaration>& properties,
                                               const NameKey& name) const noexcept {
    if (slots_.empty()) {
        const auto found =
            std::find_if(properties.begin(), properties.end(),
                         [&name](const auto& each) { return sameName(each.name, name.text()); });
        return found == properties.end() ? nullptr : &*found;
    }
    for (auto at = static_cast<std::size_t>(name.hash());; ++at) {
        const Slot& slot = slots_[at & (slots_.size() - 1)];
        if (slot.number == 0) {
            return nullptr;
        }
        const PropertyDeclaration& property = properties[slot.number - 1];
        if (name.is(property.name, slot.hash)) {
            return &property;
        }
    }
}

const PropertyDeclaration* ClassDeclaration::property(
    std::string_view propertyName) const noexcept {
    return property(NameKey(propertyName));
}

const PropertyDeclaration* ClassDeclaration::property(const NameKey& propertyName) const noexcept {
    return index.find(properties, propertyName);
}

const Qualifier* ClassDeclaration::qualifier(std::string_view qualifierName) const noexcept {
    return findQualifier(qualifiers, qualifierName);
}

bool ClassDeclaration::isAssociation() const noexcept {
    return isTrue(qualifier("Association"));
}

}  // namespace cimom
