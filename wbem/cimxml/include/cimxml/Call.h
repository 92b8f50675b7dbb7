#pragma once

#include <cstddef>
#include <limits>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "cimxml/XmlDocument.h"

namespace cimom::wbem {

/// A parameter of an operation; without a value it is null.
struct Parameter {
    std::string name;
    std::optional<XmlElement> value;

    bool operator==(const Parameter&) const = default;
};

/// The operation that a request message asks for.
struct Call {
    std::string messageId;
    std::string protocolVersion;
    bool intrinsic = true;  ///< else a method of a class, whose target and parameters are not read
    std::string method;
    std::string nameSpace;  ///< of an intrinsic operation, components joined by slashes
    std::vector<Parameter> parameters;

    bool operator==(const Call&) const = default;
};

/// Reads the body of a request: one CIM element with a simple request (DSP0201,
/// 5.6). Throws HttpFailure with the response that DSP0200, 7.3.4 has for
/// anything else, and for elements that would take more than some `maximumMemory` bytes.
[[nodiscard]] Call readCall(std::string_view body, std::size_t maximumDepth,
                            std::size_t maximumMemory = std::numeric_limits<std::size_t>::max());

/// What stands before and behind the result of a successful call.
[[nodiscard]] std::string responseHead(const Call& call);
[[nodiscard]] std::string responseTail(const Call& call);
/// The whole response to a call that ended with a status. An empty description
/// becomes the status' name.
[[nodiscard]] std::string errorResponse(const Call& call, unsigned code,
                                        std::string_view description);

}  // namespace cimom::wbem
