#pragma once

#include <string_view>

#include "clients/BusRequest.h"
#include "facts/ClientFacts.h"

namespace ZR::Live {

/// Asks the connman of this machine for its services: an array of [path, properties].
[[nodiscard]] BusResponse askConnman(BusRequests::Deadline deadline);

/// Adds the links on which connman asks for addresses or has them, and those that it got. It
/// names no servers and no times. Returns why the text cannot be used, empty when it can.
[[nodiscard]] std::string_view addConnmanServices(std::string_view json, ClientFacts& facts);

}  // namespace ZR::Live
