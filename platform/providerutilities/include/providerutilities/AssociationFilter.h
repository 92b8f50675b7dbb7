#pragma once

#include <cmpift.h>

#include <span>
#include <string>

namespace ZR {

/// What clients want to see of what is associated with an object; null or empty: anything.
/// Classes may be those from which the wanted ones derive; names compare without regard to
/// case.
struct AssociationFilter {
    const char* association = nullptr;
    const char* resultClass = nullptr;
    const char* role = nullptr;
    const char* resultRole = nullptr;
};

/// Whether a role is wanted.
[[nodiscard]] bool acceptsRole(const char* wanted, const char* role) noexcept;

/// Whether a class is wanted. The provider's tables know its superclasses, so that a host
/// need not be sure of them; a host may know of more, where its schema is larger, and is then
/// asked.
[[nodiscard]] bool acceptsClass(const CMPIBroker* broker, const std::string& nameSpace,
                                const char* wanted, const char* className,
                                std::span<const char* const> ancestors);

}  // namespace ZR
