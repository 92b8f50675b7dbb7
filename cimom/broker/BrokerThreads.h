#pragma once

#include <cmpift.h>

namespace cimom::broker {

/// Operating-system services for providers, over POSIX threads.
extern const CMPIBrokerExtFT threadTable;

}  // namespace cimom::broker
