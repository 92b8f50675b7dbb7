#pragma once

#include <cmpift.h>

namespace cimom::broker {

/// Operating-system services for providers, over POSIX threads.
extern const CMPIBrokerExtFT threadTable;

/// Factories and services for CIM objects. Objects live in the memory of the
/// calling thread's request.
extern const CMPIBrokerEncFT encapsulationTable;

}  // namespace cimom::broker
