#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "cimom/Instance.h"
#include "cimxml/Call.h"

/// The messages by which a server hands indications over to a listener (DSP0200, DSP0201).
namespace cimom::wbem {

inline constexpr std::string_view exportMethod = "ExportIndication";

/// Which indication of one destination it is.
struct IndicationSequence {
    std::string context;
    std::int64_t number = 0;

    bool operator==(const IndicationSequence&) const = default;
};

/// INSTANCE of an indication without its sequence, which it gets when it is sent: what it
/// has of SequenceContext and SequenceNumber is left out. `filterName` becomes its
/// IndicationFilterName.
[[nodiscard]] std::string indicationText(const Instance& indication, std::string_view filterName);

/// The message with an indication as indicationText() wrote it.
[[nodiscard]] std::string exportMessage(std::string_view messageId, std::string_view indication,
                                        const IndicationSequence& sequence);

/// What a listener responds: a CIM status, 0 for OK.
struct ExportResponse {
    unsigned code = 0;
    std::string description;

    bool operator==(const ExportResponse&) const = default;
};

/// Reads the response to ExportIndication. Versions and the message's ID may be any. Throws
/// XmlError, and NotValid for anything that is not such a response.
[[nodiscard]] ExportResponse readExportResponse(std::string_view body, std::size_t maximumDepth);

/// What a listener has got.
struct ExportCall {
    std::string messageId;
    std::string method;
    std::vector<Parameter> parameters;

    bool operator==(const ExportCall&) const = default;
};

/// Reads the body of an export request. Throws HttpFailure with the response that DSP0200,
/// 7.3.4 has for anything else.
[[nodiscard]] ExportCall readExportCall(std::string_view body, std::size_t maximumDepth);
/// The indication in it. Throws CimError for another method, or other parameters, than
/// those of ExportIndication.
[[nodiscard]] Instance indicationOf(const ExportCall& call);
/// The message of a listener.
[[nodiscard]] std::string exportResponse(const ExportCall& call, const ExportResponse& response);

}  // namespace cimom::wbem
