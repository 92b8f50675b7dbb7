#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "cimom/Forward.h"
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

/// The name of a status, also of those that only servers give (DSP0200, 5.2.7).
[[nodiscard]] std::string_view statusNameOf(const cimom::Status& status) noexcept;

/// The message for a response that is not OK, on one line: the name of its status, and
/// the words of the provider or object manager or else what the status means for the
/// path of the request.
[[nodiscard]] std::string statusMessage(const Response& response, const cimom::ObjectPath& asked);

}  // namespace cimdhcp
