#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "cimxml/Call.h"
#include "wbem/Limits.h"
#include "wbem/Pages.h"

namespace cimom::wbem {

/// The part of an HTTP request before its body, as it arrived.
struct HttpHead {
    std::string method;
    std::string target;   ///< the path, still with a query if there was one
    std::string version;  ///< "HTTP/1.1"
    std::vector<std::pair<std::string, std::string>> headers;
    /// Its lines do not end, or its values do not stand, as HTTP has it: others could read
    /// another request.
    bool ambiguous = false;

    /// The values of all headers of that name, in their order.
    [[nodiscard]] std::vector<std::string> values(std::string_view name) const;
};

/// What the headers say about the CIM operation (DSP0200, 7.2).
struct CimHeaders {
    bool manPost = false;  ///< by M-POST, which wants another form of response
    std::string method;    ///< decoded
    std::string object;    ///< decoded
    std::optional<std::string> protocolVersion;
    std::optional<std::string> authorization;
    std::optional<std::size_t> contentLength;  ///< none: chunked

    bool operator==(const CimHeaders&) const = default;
};

/// Reads the head of a request. Throws HttpFailure for anything that is not a
/// CIM-XML request to this server, is ambiguous about its length, or is too long.
[[nodiscard]] CimHeaders readHead(const HttpHead& head, const Limits& limits);

/// Whether the request asks what the server offers (DSP0200, 7.5), by OPTIONS for the server
/// or for where it serves. Throws HttpFailure as readHead() does for heads that are ambiguous
/// or too long.
[[nodiscard]] bool asksForCapabilities(const HttpHead& head, const Limits& limits);

/// Reads the head of a request for a page; `arguments` are those of its query. Throws
/// HttpFailure for other methods than GET and HEAD, for a request with a body, for one that is
/// ambiguous, and for one that is too long.
[[nodiscard]] PageRequest readPageHead(const HttpHead& head, PageArguments arguments,
                                       const Limits& limits);

/// Whether lists such as those of the headers TE and Accept-Encoding have a word, with a
/// weight other than 0 (RFC 9110, 12.4.2). A "*" stands for words that the lists lack.
[[nodiscard]] bool accepts(const std::vector<std::string>& lists, std::string_view word);

/// Throws HttpFailure when the headers name another operation or target than the
/// body does (DSP0200, 7.2).
void checkAgreement(const CimHeaders& headers, const Call& call);

}  // namespace cimom::wbem
