#pragma once

#include <optional>
#include <string>
#include <vector>

#include "cimom/Instance.h"
#include "cimom/Status.h"

namespace cimdhcp {

/// What the object manager answered to one request: paths or instances, depending
/// on the operation. Absent entries were delivered as null by the provider.
struct Answer {
    std::string operation;  ///< as DSP0200 names it, e.g. "EnumerateInstances"
    cimom::Status status;
    std::optional<unsigned> returnDoneCalls = 0;  ///< none: a server does not tell
    std::vector<std::optional<cimom::ObjectPath>> paths;
    std::vector<std::optional<cimom::Instance>> instances;

    bool operator==(const Answer&) const = default;
};

}  // namespace cimdhcp
