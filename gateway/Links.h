#pragma once

#include <cstddef>
#include <vector>

#include "Associations.h"
#include "Providers.h"

/// The associations that there are.
namespace ZR::DHCPClientGateway {

/// An association of two objects.
struct Link {
    const Association* association = nullptr;      ///< never null
    std::array<const CMPIObjectPath*, 2> paths{};  ///< those of its ends
    bool oneOfSeveral = false;                     ///< as OwnProperty::zeroOfSeveral means it
};

/// All objects at one end that are associated with an object at the other. Throws Refusal.
[[nodiscard]] std::vector<Object> linked(const Request& request, const Association& association,
                                         std::size_t far, const Keys& near, Form form);

/// All associations of a class, in the order of the objects of its listed end: what each
/// end has is asked once. Throws Refusal.
[[nodiscard]] std::vector<Link> allLinks(const Request& request, const Association& association);

/// The associations of an object at one end. Throws Refusal.
[[nodiscard]] std::vector<Link> linksOf(const Request& request, const Association& association,
                                        std::size_t near, const Object& object);

/// What a link has as a CIM object. Throws Refusal.
[[nodiscard]] Object objectOf(const Request& request, const Link& link, Form form);

}  // namespace ZR::DHCPClientGateway
