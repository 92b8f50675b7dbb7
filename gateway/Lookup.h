#pragma once

#include <optional>

#include "Classes.h"
#include "Links.h"
#include "Providers.h"

/// Objects by what a client names.
namespace ZR::DHCPClientGateway {

/// The class of the request's path. Throws Refusal with CMPI_RC_ERR_INVALID_CLASS for one
/// whose instances this provider does not have.
[[nodiscard]] const ServedClass& servedClassOf(const Request& request);

/// The object that the request's path names, as its provider gives it. Throws Refusal:
/// with CMPI_RC_ERR_INVALID_PARAMETER when keys of the class are missing, of another type,
/// or more than the class has, with CMPI_RC_ERR_NOT_FOUND when there is no such object.
[[nodiscard]] Object find(const Request& request, const ServedClass& served, Form form);

/// The same for an association.
[[nodiscard]] Link findLink(const Request& request, const ServedClass& served);

}  // namespace ZR::DHCPClientGateway
