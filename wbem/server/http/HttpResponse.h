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
    std::string begun;                     ///< the part of the body that is already written
    bool authenticate = false;             ///< tell the client that it needs credentials
    std::string contentType;               ///< of a page
    std::string allowed = "POST, M-POST";  ///< the methods that a client may use instead

    static HttpResponse failure(unsigned status, std::string cimError = "");
    static HttpResponse failure(const HttpFailure& failure);
    /// Of credentials, or of a request without them.
    static HttpResponse refusal();
    static HttpResponse of(Page page);
    /// Writes the beginning of the body at once.
    static HttpResponse of(ResponseBody body);
};

/// Sends the response to a request, which may go on for long after the call.
/// `manPost`: the request was an M-POST. Gives what libmicrohttpd's callbacks return.
[[nodiscard]] MHD_Result sendResponse(MHD_Connection* connection, HttpResponse response,
                                      bool manPost, std::chrono::microseconds serverTime);

}  // namespace cimom::wbem
