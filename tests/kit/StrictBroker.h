#pragma once

#include <cmpift.h>

namespace strict {

class StrictHost;
struct Traits;

/// The broker of a strict host: slots that are null in some object manager are null in it.
CMPIBroker strictBroker(StrictHost& host, const Traits& traits);

}  // namespace strict
