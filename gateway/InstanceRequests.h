#pragma once

#include "Providers.h"

/// The requests about instances of a class. What is found goes to the request's result,
/// which is not told that it is complete. All throw Refusal.
namespace ZR::DHCPClientGateway {

void enumerateNames(const Request& request);
void enumerate(const Request& request, const char** properties);
void get(const Request& request, const char** properties);

}  // namespace ZR::DHCPClientGateway
