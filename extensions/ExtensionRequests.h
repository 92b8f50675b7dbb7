#pragma once

#include "ExtensionClasses.h"
#include "providerutilities/AssociationFilter.h"

/// The requests. What is found goes to the request's result, which is not told that it is
/// complete. All throw Refusal: with CMPI_RC_ERR_INVALID_CLASS for a class that this
/// provider does not serve, with CMPI_RC_ERR_NOT_FOUND for an object that does not exist,
/// with CMPI_RC_ERR_INVALID_PARAMETER for one that is not named completely.
namespace ZR::DHCPClientExtensions {

/// What a client wants of what is found.
struct Wanted {
    bool names = false;                 ///< paths alone
    const char** properties = nullptr;  ///< the list; null: all
};

void enumerate(const Request& request, const Wanted& wanted);
void get(const Request& request, const Wanted& wanted);

/// The objects at the other ends. An object of a class that is at no end of an association
/// has nothing associated.
void associators(const Request& request, const AssociationFilter& filter, const Wanted& wanted);

/// The associations themselves, of which association and role are filtered.
void references(const Request& request, const AssociationFilter& filter, const Wanted& wanted);

}  // namespace ZR::DHCPClientExtensions
