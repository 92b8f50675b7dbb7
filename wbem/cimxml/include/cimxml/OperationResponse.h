#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "cimom/Forward.h"
#include "cimxml/XmlDocument.h"

namespace cimom::wbem {

/// The response of a server to an intrinsic operation.
struct OperationResponse {
    unsigned code = 0;                 ///< the CIM status; 0: OK
    std::string description;           ///< of a status that is not OK
    std::vector<XmlElement> returned;  ///< the elements in IRETURNVALUE

    bool operator==(const OperationResponse&) const = default;
};

/// Reads the response to an operation of that name (DSP0201, 5.6). Versions and the
/// message's ID may be any, since servers disagree about them. Throws XmlError, also for one that
/// takes more than usualMemory(), and NotValid for anything that is not such a response.
[[nodiscard]] OperationResponse readResponse(std::string_view body, std::string_view method,
                                             std::size_t maximumDepth);

// What operations return. The namespace stands in for one that is not written. All
// throw NotValid for another element, and CimError for a value that is none of its type.

/// INSTANCENAME, or OBJECTPATH around a path.
[[nodiscard]] ObjectPath readReturnedPath(const XmlElement& element, const std::string& nameSpace);
/// VALUE.NAMEDINSTANCE, VALUE.OBJECTWITHPATH, or INSTANCE, whose path holds the class
/// alone.
[[nodiscard]] Instance readReturnedInstance(const XmlElement& element,
                                            const std::string& nameSpace);

}  // namespace cimom::wbem
