#pragma once

#include "Delivery.h"
#include "Providers.h"

/// The requests about what is associated with an object. What is found goes to the
/// delivery. An object of a class that is at no end of an association has nothing
/// associated. All throw Refusal: with CMPI_RC_ERR_NOT_FOUND for an object that does not
/// exist, with CMPI_RC_ERR_INVALID_PARAMETER for one that is not named completely.
namespace ZR::DHCPClientGateway {

/// What clients want to see; null or empty: anything. Classes may be those from which the
/// wanted ones derive; names compare without regard to case.
struct AssociationFilter {
    const char* association = nullptr;
    const char* resultClass = nullptr;
    const char* role = nullptr;
    const char* resultRole = nullptr;
};

/// The objects at the other ends.
void associators(const Request& request, const AssociationFilter& filter, const Delivery& delivery);

/// The associations themselves, of which association and role are filtered.
void references(const Request& request, const AssociationFilter& filter, const Delivery& delivery);

}  // namespace ZR::DHCPClientGateway
