#pragma once

#include <string>
#include <string_view>

#include "cimxml/XmlDocument.h"

namespace cimom::wbem {

/// How every message begins, up to the attributes of MESSAGE.
inline constexpr std::string_view messageHead =
    R"(<?xml version="1.0" encoding="utf-8"?><CIM CIMVERSION="2.0" DTDVERSION="2.0"><MESSAGE)";

/// A message that has been read, and what of it says what it is about.
struct ReadMessage {
    std::string id;
    std::string protocolVersion;
    XmlElement content;  ///< SIMPLEREQ, SIMPLEEXPREQ or another one
};

/// Takes a message out of its CIM element. Throws NotValid, and HttpFailure for a version
/// that is not spoken, and for several requests in one message.
[[nodiscard]] ReadMessage readMessage(XmlElement cim);

}  // namespace cimom::wbem
