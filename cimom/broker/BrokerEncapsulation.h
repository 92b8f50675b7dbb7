#pragma once

#include <cmpift.h>

namespace cimom::broker {

/// Factories and services for CIM objects. Objects live in the memory of the
/// calling thread's request.
extern const CMPIBrokerEncFT encapsulationTable;

}  // namespace cimom::broker
