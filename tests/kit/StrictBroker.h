#pragma once

#include <cmpift.h>

namespace strict {

class StrictHost;

/// The broker of a strict host: it tells version 0, and slots that are null in some
/// object manager are null in it.
CMPIBroker strictBroker(StrictHost& host);

}  // namespace strict
