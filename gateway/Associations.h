#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <span>
#include <string>

#include "Classes.h"
#include "providerutilities/Keys.h"

/// The association classes, as a table of their ends: two objects are associated when what
/// their keys tell of the link is the same.
namespace ZR::DHCPClientGateway {

struct End {
    const char* role;
    /// The classes that can be there, by name.
    std::span<const char* const> classes;
    /// What an object's keys tell of the link.
    std::string (*link)(const Keys& keys);
    /// Keys of the objects here that are linked with an object of the other end: all keys
    /// for a class of another provider. Null: they do not follow from those of the other.
    KeyTexts (*keysBy)(const Keys& other) = nullptr;
};

/// A property of an association beside its references.
struct OwnProperty {
    const char* name = nullptr;  ///< null: there is none
    CMPIType type = CMPI_null;
    std::uint64_t value = 0;
    /// The value is 0 for each of several associations of an object at the other end.
    bool zeroOfSeveral = false;
};

struct Association {
    const char* name;
    std::array<End, 2> ends;  ///< in the order of the schema
    /// The end whose objects give an enumeration its order. It is also that of the
    /// OwnProperty's several associations.
    std::size_t listed;
    OwnProperty own = {};
};

[[nodiscard]] std::span<const Association> allAssociations() noexcept;

/// Null for a class that is no association of the table.
[[nodiscard]] const Association* findAssociation(const ServedClass& served) noexcept;

/// Whether objects of a class can stand at an end.
[[nodiscard]] bool takes(const End& end, const ServedClass& served) noexcept;

}  // namespace ZR::DHCPClientGateway
