#pragma once

#include "Delivery.h"
#include "Providers.h"
#include "providerutilities/AssociationFilter.h"

/// The requests that the gateway carries out. All throw Refusal.
namespace ZR::DHCPClientGateway {

// About instances of a class. What is found goes to the request's result, which is not told
// that it is complete.

void enumerateNames(const Request& request);
void enumerate(const Request& request, const char** properties);
void get(const Request& request, const char** properties);

// About what is associated with an object. What is found goes to the delivery. An object of
// a class that is at no end of an association has nothing associated. An object that does
// not exist is refused with CMPI_RC_ERR_NOT_FOUND, one that is not named completely with
// CMPI_RC_ERR_INVALID_PARAMETER.

/// The objects at the other ends.
void associators(const Request& request, const AssociationFilter& filter, const Delivery& delivery);

/// The associations themselves, of which association and role are filtered.
void references(const Request& request, const AssociationFilter& filter, const Delivery& delivery);

}  // namespace ZR::DHCPClientGateway
