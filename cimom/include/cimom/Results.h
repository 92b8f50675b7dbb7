#pragma once

#include <optional>
#include <vector>

#include "cimom/Instance.h"
#include "cimom/ObjectPath.h"
#include "cimom/Status.h"

namespace cimom {

/// The whole result of a request. Entries that the provider handed over as null are
/// absent; they are kept so that a command line can show them.
struct PathsResult {
    Status status;
    std::vector<std::optional<ObjectPath>> paths;
    unsigned returnDoneCalls = 0;
};
struct InstancesResult {
    Status status;
    std::vector<std::optional<Instance>> instances;
    unsigned returnDoneCalls = 0;
};

}  // namespace cimom
