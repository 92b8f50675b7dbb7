#pragma once

#include <microhttpd.h>

#include <chrono>
#include <optional>
#include <string>

#include "cimxml/Errors.h"
#include "cimxml/HttpStatus.h"
#include "operations/ResponseBody.h"
#include "wbem/Pages.h"

namespace cimom::wbem {

/// What a client gets: the response of an operation, or a failure of HTTP.
struct HttpResponse {
    unsigned status = http::ok;
    std::string cimError;
    std::optional<ResponseBody> body;
    std::string begun;          ///< the part of the body that is already written
    bool authenticate = false;  ///< tell the client that it needs credentials
    /// Nothing more is taken from the connection.
    bool close = false;
    /// In the response to a request for what the server offers: the names of groups of
    /// operations.
    std::string offered;
    std::string contentType;  ///< of a page
    /// The methods that a client may use in place of its own.
    std::string allowed = "POST, M-POST, OPTIONS";

    static HttpResponse failure(unsigned status, std::string cimError = "");
    static HttpResponse failure(const HttpFailure& failure);
    /// Of credentials, or of a request without them.
    static HttpResponse refusal();
    static HttpResponse of(Page page);
    /// What is offered, to a request for it.
    static HttpResponse capabilities(bool readOnly);
    /// Writes the beginning of the body at once.
    static HttpResponse of(ResponseBody body);
};

/// Sends the response to a request, which may go on for long after the call. What the
/// request says about the form of the response is heeded: to one with "TE: chunked" or "TE:
/// trailers" each response is chunked, and a long one is compressed if "Accept-Encoding" has
/// gzip.
/// `manPost`: the request was an M-POST. Gives what libmicrohttpd's callbacks return.
[[nodiscard]] MHD_Result sendResponse(MHD_Connection* connection, HttpResponse response,
                                      bool manPost, std::chrono::microseconds serverTime);

}  // namespace cimom::wbem
