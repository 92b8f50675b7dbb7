#pragma once

#include <optional>
#include <string>
#include <vector>

#include "cimom/Instance.h"
#include "cimom/Status.h"

namespace cimdhcp {

/// What an object manager gave back to one request: paths or instances, depending on
/// the operation. An entry without a value was delivered as null by the provider.
struct Response {
    std::string operation;  ///< as DSP0200 names it, e.g. "EnumerateInstances"
    cimom::Status status;
    std::optional<unsigned> returnDoneCalls = 0;  ///< none: servers do not tell
    std::vector<std::optional<cimom::ObjectPath>> paths;
    std::vector<std::optional<cimom::Instance>> instances;

    bool operator==(const Response&) const = default;
};

/// Takes away the properties without a value. Providers and servers may add what the class
/// has and they do not know as null, which means the same as leaving it out (DSP0201,
/// 5.2.5).
void leaveOutNulls(cimom::Instance& instance);

}  // namespace cimdhcp
