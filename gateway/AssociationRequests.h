#pragma once

#include "Delivery.h"
#include "Providers.h"
#include "providerutilities/AssociationFilter.h"

/// The requests about what is associated with an object. What is found goes to the
/// delivery. An object of a class that is at no end of an association has nothing
/// associated. All throw Refusal: with CMPI_RC_ERR_NOT_FOUND for an object that does not
/// exist, with CMPI_RC_ERR_INVALID_PARAMETER for one that is not named completely.
namespace ZR::DHCPClientGateway {

/// The objects at the other ends.
void associators(const Request& request, const AssociationFilter& filter, const Delivery& delivery);

/// The associations themselves, of which association and role are filtered.
void references(const Request& request, const AssociationFilter& filter, const Delivery& delivery);

}  // namespace ZR::DHCPClientGateway
